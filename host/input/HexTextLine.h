// One line of hex text: what it is, and the fields that stand in it.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace vesk::host {

/// Whether hex digits begin with the byte of a report ID that is known.
bool beginsReport(std::string_view digits);

class HexTextLine {
 public:
  enum class Kind {
    kBlank,
    kComment,  // nothing else on the line
    kLabel,    // words, which are no data
    kRepeat,   // "*": the line before comes again up to the next offset
    kData,
    kBad,  // neither words nor data
  };

  /// A number as it stands there, without 0x.
  struct Field {
    std::string_view digits;
    std::size_t column;  // from 1
    bool prefixed;       // 0x stood before it
  };

  /// Takes the line apart; all views point into it. To be called line by line, for a comment may last over several.
  void parse(std::string_view line);

  Kind kind() const { return kind_; }
  const std::vector<Field> &fields() const { return fields_; }
  /// Words stood before the data, as in "Report: e0 0d" or "uint8_t r[] = {0xe0,".
  bool hasLabel() const { return hasLabel_; }
  /// An array begins with the line's first field.
  bool opensArray() const { return opensArray_; }
  /// The first field is followed by a colon and a blank, which makes it an offset.
  bool hasColonOffset() const { return colonOffset_; }
  /// All fields hang together, as in "e00d05" and "e0:0d:05".
  bool isRun() const { return isRun_; }
  /// The first field could be an offset: at least four digits, alone or with bytes of two digits behind it.
  bool mayHaveOffset() const;
  /// A first field that could be an offset, and is zero.
  bool mayStartAtZero() const;
  /// The digits that all fields from `first` on have; 0 where they differ.
  std::size_t digitsFrom(std::size_t first) const;
  /// What stands behind the hex field, where something was cut off there.
  std::string_view textColumn() const { return text_; }
  std::size_t textColumnAt() const { return textAt_; }
  /// A comment has begun and goes on in the next line.
  bool isInComment() const { return inComment_; }
  /// Of a label: what stands behind its colon and could be a report; empty where there is no such thing.
  std::string_view likeReport() const { return likeReport_; }
  /// The bytes that the fields stand for, as far as they are such.
  std::string bytes() const;
  /// Of a bad line: what is wrong, with its column.
  const std::string &problem() const { return problem_; }

 private:
  void reset();
  void scan(std::string_view line, std::size_t from);
  bool endsField(std::string_view line, std::size_t from, std::size_t to) const;
  void takeField(std::string_view line, std::size_t begin, std::size_t end);
  bool takeDashed(std::string_view line, std::size_t begin, std::size_t end);
  void judgeWords(std::string_view line);
  bool dataBehindLabel(std::string_view line);
  void fail(std::string problem);

  Kind kind_ = Kind::kBlank;
  std::vector<Field> fields_;
  bool hasLabel_ = false, opensArray_ = false, colonOffset_ = false, isRun_ = false, parted_ = false;
  bool python_ = false;  // Python's b'\x..', where most bytes may be no digits
  bool inComment_ = false, sawComment_ = false;
  std::size_t words_ = 0, likeHex_ = 0;
  std::string_view firstWord_;
  std::size_t firstWordAt_ = 0;
  std::string_view text_;
  std::size_t textAt_ = 0;
  std::string_view likeReport_;
  std::string problem_;
};

}  // namespace vesk::host
