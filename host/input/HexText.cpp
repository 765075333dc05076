// Reading of hex text: one report after the other, each as soon as the next line is no more of it.
#include "host/input/HexText.h"

#include "host/input/FoundReports.h"
#include "host/input/HexTextReport.h"
#include "host/input/PlainText.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

using Kind = HexTextLine::Kind;

class HexTextReader {
 public:
  HexTextReader(ByteSource &source, const ReadOptions &options, ReadSink &sink)
      : source_(source), found_(source, options, sink) {}

  void read() {
    std::string_view text;
    while (source_.nextLine(text)) {
      if (++number_ == 1) text = withoutMark(text);
      takeLine(text);
    }
    finishReport();
    if (commentAt_ != 0) found_.say(kBadInput, Place::line(commentAt_), "the comment that begins here does not end");
    found_.finish("bytes as hexadecimal digits");
  }

 private:
  void takeLine(std::string_view text) {
    line_.parse(text);
    if (!line_.isInComment())
      commentAt_ = 0;
    else if (commentAt_ == 0)
      commentAt_ = number_;
    switch (line_.kind()) {
      case Kind::kComment:
        return;
      case Kind::kBlank:
        return finishReport();
      case Kind::kLabel:
        finishReport();
        if (text.find_first_not_of(" \t{}[]();,") != std::string_view::npos)
          found_.say(kTextSkipped, Place::line(number_), "words, taken as a label");
        return;
      case Kind::kRepeat:
        return report_.addRepeat(number_);
      case Kind::kBad:
        return report_.fail(kBadInput, number_, line_.problem());
      case Kind::kData:
        if (report_.endsBefore(line_)) finishReport();
        return report_.add(line_, number_);
    }
  }

  void finishReport() {
    if (report_.isEmpty()) return;
    report_.finish();
    if (const auto &problem = report_.problem()) {
      found_.say(*problem->kind, Place::line(problem->line), problem->text);
    } else {
      const Place place = Place::line(report_.firstLine());
      if (const auto offset = report_.beginsAt())
        found_.say(kDumpBegin, place,
                   "the dump begins at offset " + formatted<"0x%llX">(static_cast<unsigned long long>(*offset)) +
                       ", not at 0; its first byte is taken for the report ID");
      found_.addUntyped(report_.bytes(), place);
    }
    report_.clear();
  }

  ByteSource &source_;
  FoundReports found_;
  HexTextLine line_;
  HexTextReport report_;
  std::uint64_t number_ = 0;
  std::uint64_t commentAt_ = 0;  // the line in which the comment began that has not ended; 0 for none
};

/// Text is hex text where at least a fifth of its lines that are not empty holds data.
bool matches(std::string_view head) {
  constexpr std::size_t kWordsALine = 4;
  if (!isText(head)) return false;
  head = withoutMark(head);
  HexTextLine line;
  std::size_t data = 0, labels = 0;
  for (std::string_view text; takeLine(head, text);) {
    line.parse(text);
    if (line.kind() == Kind::kLabel) ++labels;
    // A slip among bytes, not a sentence with a number in it.
    if (line.kind() == Kind::kData || (line.kind() == Kind::kBad && line.fields().size() > 1)) ++data;
  }
  return data != 0 && data * kWordsALine >= labels;
}

void read(ByteSource &source, const ReadOptions &options, ReadSink &sink) {
  HexTextReader(source, options, sink).read();
}

}  // namespace

constinit const InputKind kHexText{"hex", "hex text", matches, read};

}  // namespace vesk::host
