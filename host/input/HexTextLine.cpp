// Taking a line of hex text apart.
#include "host/input/HexTextLine.h"

#include <algorithm>
#include <optional>

#include "host/input/FoundReports.h"
#include "host/input/PlainText.h"
#include "host/input/ReportBorders.h"
#include "host/report/KnownReports.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr std::size_t kHalf = 8;  // after so many bytes hexdump -C prints a second blank

constexpr bool isSeparator(char character) {
  return std::string_view(",;:[]{}()\"'=").find(character) != std::string_view::npos;
}

constexpr bool endsWord(char character) {
  return isBlank(character) || isSeparator(character) ||
         std::string_view("#|>\\").find(character) != std::string_view::npos;
}

bool isHex(std::string_view word) {
  return !word.empty() && std::all_of(word.begin(), word.end(), [](char c) { return hexDigit(c) >= 0; });
}

/// The word in quotes, short, and printable.
std::string quoted(std::string_view word) {
  constexpr std::size_t kMost = 24;
  std::string text = "\"";
  for (const char character : word.substr(0, kMost)) {
    const auto code = static_cast<unsigned char>(character);
    text += code < 0x20 || code >= 0x7f ? vesk::formatted<"\\x%02x">(unsigned{code}) : std::string(1, character);
  }
  return text + (word.size() > kMost ? "...\"" : "\"");
}

}  // namespace

bool beginsReport(std::string_view digits) {
  return findReport(static_cast<std::uint32_t>(parseNumber(digits.substr(0, 2), 16).value_or(0))) != nullptr;
}

void HexTextLine::reset() {
  fields_.clear();
  hasLabel_ = opensArray_ = colonOffset_ = parted_ = sawComment_ = python_ = false;
  isRun_ = true;
  words_ = likeHex_ = firstWordAt_ = textAt_ = 0;
  text_ = {};
}

void HexTextLine::parse(std::string_view line) {
  reset();
  likeReport_ = {};
  if (!inComment_ && line.find_first_not_of(" \t*") == std::string_view::npos &&
      std::count(line.begin(), line.end(), '*') == 1) {
    kind_ = Kind::kRepeat;
    return;
  }
  scan(line, 0);
  if (words_ != 0)
    judgeWords(line);
  else if (fields_.size() > kMostReportBytes)
    fail("the line has more than 65536 bytes");
  else if (fields_.size() == 1 && colonOffset_ && fields_[0].digits.size() <= 2)
    kind_ = Kind::kLabel;  // "E0:" announces what follows
  else if (!fields_.empty())
    kind_ = Kind::kData;
  else if (sawComment_)
    kind_ = Kind::kComment;
  else
    kind_ = line.find_first_not_of(" \t\v\f") == std::string_view::npos ? Kind::kBlank : Kind::kLabel;
}

/// Reads the fields from `from` to the end, a comment or the text column.
void HexTextLine::scan(std::string_view line, std::size_t from) {
  std::size_t at = from;
  bool afterSeparator = true;
  while (at < line.size() && fields_.size() <= kMostReportBytes) {
    if (inComment_) {
      const std::size_t end = line.find("*/", at);
      sawComment_ = true;
      if (end == std::string_view::npos) return;
      inComment_ = false;
      at = end + 2;
      continue;
    }
    const char character = line[at];
    if (character == '#' || line.substr(at, 2) == "//") {
      sawComment_ = true;
      return;
    }
    if (line.substr(at, 2) == "/*") {
      inComment_ = true;
      at += 2;
      continue;
    }
    if (isBlank(character)) {
      std::size_t end = at;
      while (end < line.size() && isBlank(line[end])) ++end;
      if (end == line.size()) return;
      if (endsField(line, at, end)) {
        text_ = line.substr(end);
        textAt_ = end + 1;
        return;
      }
      parted_ = !fields_.empty();
      at = end;
      continue;
    }
    if ((character == '|' || character == '>') && !fields_.empty()) return;
    if (character == '>' && words_ == 0) {  // a quotation in a letter
      ++at;
      continue;
    }
    if (isSeparator(character)) {
      if ((character == '[' || character == '{') && fields_.empty()) opensArray_ = true;
      const bool colonEnds = at + 1 == line.size() || isBlank(line[at + 1]);
      if (character == ':' && colonEnds && fields_.size() == 1 && words_ == 0 && !afterSeparator) {
        colonOffset_ = true;
      } else if (character == ',' || character == ';') {
        parted_ = !fields_.empty();
      }
      afterSeparator = true;
      ++at;
      continue;
    }
    if (line.substr(at, 2) == "\\x") at += 2;
    std::size_t end = at;
    while (end < line.size() && !endsWord(line[end])) ++end;
    if (end == at) ++end;  // a character that is nothing here
    takeField(line, at, end);
    afterSeparator = false;
    at = end;
  }
}

/// Whether blanks from `from` to `to` end the hex field of a dump, so that its text column follows. Between fields
/// there is one blank, or two in the middle of a line from hexdump -C.
bool HexTextLine::endsField(std::string_view line, std::size_t from, std::size_t to) const {
  if (fields_.size() < 2 || words_ != 0) return false;
  const auto tabs = static_cast<std::size_t>(std::count(line.begin() + static_cast<std::ptrdiff_t>(from),
                                                        line.begin() + static_cast<std::ptrdiff_t>(to), '\t'));
  // A tab ends it too, unless tabs are what parts the bytes.
  const std::string_view next = line.substr(to, std::min(line.find_first_of(" \t", to), line.size()) - to);
  const bool goesOn = to - from == 1 && isHex(next) && next.size() == fields_[1].digits.size();
  const std::size_t blanks = to - from + (goesOn ? 0 : tabs);
  if (blanks < 2) return false;
  if (colonOffset_) return true;
  if (!mayHaveOffset()) return false;
  return blanks > 2 || fields_.size() != 1 + kHalf;
}

void HexTextLine::takeField(std::string_view line, std::size_t begin, std::size_t end) {
  std::string_view word = line.substr(begin, end - begin);
  const bool prefixed = word.starts_with("0x") || word.starts_with("0X");
  const std::string_view digits = word.substr(prefixed ? 2 : 0);
  const bool python = fields_.empty() && word == "b" && end < line.size() && (line[end] == '\'' || line[end] == '"');
  python_ = python_ || (python && line.find("\\x", end) != std::string_view::npos);
  if (takeDashed(line, begin, end)) return;
  if (isHex(digits) && !python) {
    fields_.push_back({digits, begin + 1, prefixed});
    isRun_ = isRun_ && !parted_;
    if (digits.size() == 1 || digits.size() % 2 == 0) ++likeHex_;
    return;
  }
  if (words_++ == 0) {
    firstWord_ = word;
    firstWordAt_ = begin + 1;
  }
}

/// "e0-0d-05-00", which is not to be a date or a range of reports: it stands alone, or begins with the ID of a report.
bool HexTextLine::takeDashed(std::string_view line, std::size_t begin, std::size_t end) {
  std::string_view word = line.substr(begin, end - begin);
  if (word.ends_with('-')) word.remove_suffix(1);  // it goes on in the next line
  if (word.size() < 5 || word.size() % 3 != 2) return false;
  std::string bytes;
  for (std::size_t i = 0; i < word.size(); ++i)
    if (i % 3 == 2 ? word[i] != '-' : hexDigit(word[i]) < 0) return false;
  for (std::size_t i = 0; i < word.size(); i += 3)
    bytes += static_cast<char>(hexDigit(word[i]) * 16 + hexDigit(word[i + 1]));
  const bool isAlone = fields_.empty() && words_ == 0 && line.find_first_not_of(" \t", end) == std::string_view::npos;
  const bool isLong = isAlone ? bytes.size() >= 3 : bytes.size() >= 4 && beginsReport(word);
  if (!isLong && !isWholeReport(bytes)) return false;
  for (std::size_t i = 0; i < word.size(); i += 3) fields_.push_back({word.substr(i, 2), begin + 1 + i, false});
  likeHex_ += bytes.size();
  return true;
}

/// A line with words: a label where most of it is words, with or without data behind it; else a slip.
void HexTextLine::judgeWords(std::string_view line) {
  const std::size_t all = words_ + fields_.size(), likeHex = likeHex_;
  // Of one word and one number "length: 64" is a label; "0g 64" is a slip.
  const bool keyed = (line.find(": ") != std::string_view::npos || line.find("= ") != std::string_view::npos ||
                      line.ends_with(':') || line.ends_with('=')) &&
                     fields_.size() == 1 && firstWordAt_ < fields_[0].column;
  const bool python = python_;
  // A line with an offset is never a label.
  const bool offset = !fields_.empty() && fields_[0].column == 1 && fields_[0].digits.size() >= 6;
  const std::string problem =
      quoted(firstWord_) + " in column " + std::to_string(firstWordAt_) + " is no hexadecimal byte" +
      (offset ? ", as 'xxd', 'hexdump -C' and 'od -Ax -v -tx1' print them behind an offset" : "");
  if (dataBehindLabel(line)) {
    kind_ = Kind::kData;
    hasLabel_ = true;
    isRun_ = false;
  } else if (2 * likeHex < all + (keyed ? 1 : 0) && !offset && !python) {
    kind_ = Kind::kLabel;
  } else {
    fail(problem);
  }
}

bool HexTextLine::dataBehindLabel(std::string_view line) {
  const auto behind = [line](std::string_view mark) -> std::optional<std::size_t> {
    const std::size_t at = line.rfind(mark);
    if (at == std::string_view::npos) return {};
    return at + mark.size();
  };
  const std::size_t brace = line.find('{');
  const bool hasBrace = brace != std::string_view::npos;
  for (const auto &from : {hasBrace ? std::optional(brace) : std::nullopt, behind("= "), behind(": "), behind("\":")}) {
    if (!from) continue;
    reset();
    inComment_ = false;
    scan(line, *from);
    if (words_ != 0 || fields_.empty()) continue;
    if (hasBrace && *from == brace) return true;
    // A number behind a word need not be a report: "length: 64".
    const std::string_view first = fields_[0].digits;
    if (colonOffset_ || !beginsReport(first)) continue;
    if (fields_.size() > 1 || first.size() >= 14) return true;
    if (first.size() >= 4 && first.size() % 2 == 0 && !fields_[0].prefixed) likeReport_ = first;
  }
  return false;
}

void HexTextLine::fail(std::string problem) {
  kind_ = Kind::kBad;
  problem_ = std::move(problem);
}

std::string HexTextLine::bytes() const {
  std::string bytes;
  for (const Field &field : fields_) {
    if (field.digits.size() == 1) bytes += static_cast<char>(hexDigit(field.digits[0]));
    for (std::size_t i = 0; i + 1 < field.digits.size(); i += 2)
      bytes += static_cast<char>(hexDigit(field.digits[i]) * 16 + hexDigit(field.digits[i + 1]));
  }
  return bytes;
}

bool HexTextLine::mayHaveOffset() const {
  if (fields_.empty() || fields_[0].prefixed || fields_[0].digits.size() < 4 || fields_[0].digits.size() > 16)
    return false;
  return fields_.size() == 1 || digitsFrom(1) == 2;
}

bool HexTextLine::mayStartAtZero() const {
  if (fields_.size() < 2 || !(colonOffset_ || mayHaveOffset() || fields_[0].digits.size() >= 6)) return false;
  return fields_[0].digits.find_first_not_of('0') == std::string_view::npos;
}

std::size_t HexTextLine::digitsFrom(std::size_t first) const {
  if (first >= fields_.size()) return 0;
  const std::size_t digits = fields_[first].digits.size();
  for (std::size_t i = first + 1; i < fields_.size(); ++i)
    if (fields_[i].digits.size() != digits) return 0;
  return digits;
}

}  // namespace vesk::host
