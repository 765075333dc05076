// The lines of one report in hex text, and the report that they make.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "host/diagnostics/Message.h"
#include "host/input/HexTextLine.h"

namespace vesk::host {

/// A line in the middle that could as well begin a report of its own.
inline constexpr MessageKind kReportBorder{"report-border", Severity::kWarning, kExitOk};
/// A dump whose first line is not at offset 0.
inline constexpr MessageKind kDumpBegin{"dump-begin", Severity::kWarning, kExitOk};

class HexTextReport {
 public:
  struct Problem {
    const MessageKind *kind;
    std::uint64_t line;
    std::string text;
  };

  void clear();
  /// How many bytes the report has that is about to be added, where something says it; 0 where nothing does.
  void expect(std::uint64_t bytes) { expected_ = bytes; }
  /// No line was added since clear().
  bool isEmpty() const { return rows_.empty() && !problem_; }
  std::uint64_t firstLine() const { return firstLine_; }
  std::uint64_t lastLine() const { return lastLine_; }

  /// Whether nothing is missing: it is as long as was expected, else as its ID says, or a dump that ended with its last
  /// offset.
  bool isWhole() const;

  /// Whether a data line begins another report than the one that is being gathered.
  bool endsBefore(const HexTextLine &line) const;
  void add(const HexTextLine &line, std::uint64_t number);
  void addRepeat(std::uint64_t number);
  /// Gives the report up; the first problem stays.
  void fail(const MessageKind &kind, std::uint64_t number, std::string text);

  /// Puts the report together into bytes(), or leaves a problem. REQUIRES: !isEmpty().
  void finish();
  const std::string &bytes() const { return bytes_; }
  const std::optional<Problem> &problem() const { return problem_; }
  /// Whether its length is the one that was expected.
  bool isAsExpected() const { return expected_ != 0 && bytes_.size() == expected_; }
  /// A line that begins with a report ID, in a report that is not as long as its layout; 0 for none.
  std::uint64_t suspectLine() const { return suspectLine_; }
  /// The offset of the first line where it is not 0.
  std::optional<std::uint64_t> beginsAt() const { return beginsAt_; }

 private:
  struct Row {
    std::uint64_t line;
    std::string offset;         // the first field's digits, where it may be an offset
    std::size_t begin, middle;  // in data_: the first field's bytes, and those of the others
    bool firstIsBytes;          // the first field has an even number of digits, or is a single one
    bool colon;
    bool repeatBefore;
    std::size_t cutAt;  // the column behind which a text column was cut off; 0 for none
  };

  void addBytes(const HexTextLine &line, std::uint64_t number, Row &row);
  bool continuesRun(const HexTextLine &line) const;
  bool mayGoOn() const;
  bool hasOffsets() const;
  std::vector<int> bases() const;
  void joinByOffsets();
  bool joinByOffsets(int base, bool report);
  void joinAsData();
  std::size_t rowEnd(std::size_t row) const;

  std::vector<Row> rows_;
  std::string data_;  // all fields' bytes
  std::string bytes_;
  std::uint64_t firstLine_ = 0, lastLine_ = 0, suspectLine_ = 0;
  std::uint64_t expected_ = 0;
  std::optional<std::uint64_t> repeatAt_;  // the line of a "*" that no row has followed
  std::optional<Problem> problem_;
  std::optional<std::uint64_t> beginsAt_;
  bool allRuns_ = true, equalRuns_ = true;
  std::size_t runBytes_ = 0;  // of the first line of runs
};

}  // namespace vesk::host
