// Reading of hex text: one report after the other, each as soon as the next line is no more of it.
#include "host/input/HexText.h"

#include "host/input/FoundReports.h"
#include "host/input/HexTextReport.h"
#include "host/input/PlainText.h"
#include "host/input/ReportBorders.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

using Kind = HexTextLine::Kind;

/// What our own comments say: "# feature 0xE3 open-short-result, 57 bytes, 3.000412 s"; 0 for any other.
std::uint64_t lengthInComment(std::string_view text) {
  for (const std::string_view begin : {"# feature 0x", "# input 0x", "# output 0x"}) {
    if (!text.starts_with(begin)) continue;
    const std::size_t comma = text.find(", ");
    if (comma == std::string_view::npos) return 0;
    std::string_view rest = text.substr(comma + 2);
    const auto bytes = parseNumber(takeWord(rest), 10);
    return bytes && rest.starts_with(" byte") ? *bytes : 0;
  }
  return 0;
}

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
        if (const std::uint64_t bytes = lengthInComment(text); bytes != 0) {
          finishReport();
          report_.expect(bytes);
        }
        return;
      case Kind::kBlank:
        return finishReport();
      case Kind::kLabel:
        finishReport();
        if (text.find_first_not_of(" \t{}[]();,") != std::string_view::npos) sayLabel();
        return;
      case Kind::kRepeat:
        return report_.addRepeat(number_);
      case Kind::kBad:
        if (report_.isWhole()) finishReport();
        return report_.fail(kBadInput, number_, line_.problem());
      case Kind::kData:
        if (report_.endsBefore(line_)) finishReport();
        return report_.add(line_, number_);
    }
  }

  void finishReport() {
    if (report_.isEmpty()) return report_.clear();
    report_.finish();
    if (const auto &problem = report_.problem()) {
      sayProblem(*problem);
    } else {
      const Place place = Place::line(report_.firstLine());
      if (const auto offset = report_.beginsAt())
        found_.say(kDumpBegin, place,
                   "the dump begins at offset " + formatted<"0x%llX">(static_cast<unsigned long long>(*offset)) +
                       ", not at 0; its first byte is taken for the report ID");
      sayBorders(place);
      found_.addUntyped(report_.bytes(), place);
    }
    report_.clear();
  }

  void sayLabel() {
    const Place place = Place::line(number_);
    if (const std::string_view digits = line_.likeReport(); !digits.empty())
      found_.say(kReportBorder, place,
                 "\"" + std::string(digits.substr(0, 24)) +
                     "\" could be a report, but among words it is taken for a part of a label; in a line of its own it "
                     "is one");
    else
      found_.say(kTextSkipped, place, "words, taken as a label");
  }

  /// A slip takes more with it than its line where a report is spread over several.
  void sayProblem(const HexTextReport::Problem &problem) {
    std::string text = problem.text;
    if (report_.lastLine() > report_.firstLine())
      text += "; lines " + std::to_string(report_.firstLine()) + " to " + std::to_string(report_.lastLine()) +
              " are left out";
    found_.say(*problem.kind, Place::line(problem.line), text);
  }

  /// What was taken for one report may be several.
  void sayBorders(const Place &place) {
    if (report_.isAsExpected()) return;
    if (const std::size_t count = countReports(report_.bytes()); count > 1)
      found_.say(kRawManyReports, place,
                 "read as one report; its bytes would make " + std::to_string(count) +
                     " reports one behind the other, between which empty lines are wanted");
    else if (const std::uint64_t line = report_.suspectLine(); line != 0)
      found_.say(kReportBorder, Place::line(line),
                 "begins as a report does, but is taken for a part of the one that begins in line " +
                     std::to_string(report_.firstLine()) + "; an empty line would part them");
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
