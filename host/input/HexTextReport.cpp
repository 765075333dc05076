// Judging the layout of hex text, and putting its lines together.
#include "host/input/HexTextReport.h"

#include <algorithm>
#include <charconv>

#include "host/input/FoundReports.h"
#include "host/input/HexTextLayout.h"
#include "host/input/PlainText.h"
#include "host/input/ReportBorders.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

constexpr std::size_t kPlainRun = 30;  // the bytes in a full line of 'xxd -p'

unsigned byteAt(std::string_view bytes, std::size_t at) {
  return static_cast<unsigned char>(bytes[at]);
}

bool consistsOf(std::string_view text, std::string_view characters) {
  return text.find_first_not_of(characters) == std::string_view::npos;
}

/// An offset as its neighbours are spelled.
std::string offsetLike(std::string_view neighbour, std::uint64_t offset, int base) {
  char digits[32];
  const std::string text(digits, std::to_chars(digits, digits + sizeof digits, offset, base).ptr);
  return std::string(neighbour.size() - std::min(neighbour.size(), text.size()), '0') + text;
}

}  // namespace

void HexTextReport::clear() {
  rows_.clear();
  data_.clear();
  bytes_.clear();
  repeatAt_.reset();
  problem_.reset();
  beginsAt_.reset();
  allRuns_ = equalRuns_ = true;
  runBytes_ = 0;
  suspectLine_ = expected_ = 0;
}

void HexTextReport::fail(const MessageKind &kind, std::uint64_t number, std::string text) {
  if (isEmpty()) firstLine_ = number;
  lastLine_ = std::max(lastLine_, number);
  if (!problem_) problem_ = {&kind, number, std::move(text)};
}

void HexTextReport::addRepeat(std::uint64_t number) {
  lastLine_ = number;
  if (problem_) return;
  if (rows_.empty()) return fail(kBadInput, number, "\"*\" repeats a line, but there is none before it");
  repeatAt_ = number;
}

/// A byte that is known to be the first of a report is not enough: it may as well stand in the middle of one. So a line
/// begins a new report where an array or a dump begins, or where the report before it is whole; behind a slip, where it
/// is a whole report itself.
bool HexTextReport::endsBefore(const HexTextLine &line) const {
  if (isEmpty()) return false;
  if (line.opensArray() || line.hasLabel()) return true;
  if (line.mayStartAtZero() && (rows_.empty() || !rows_[0].offset.empty())) return true;
  if (problem_) return !line.hasColonOffset() && isWholeReport(line.bytes());
  if (repeatAt_ || data_.empty()) return false;
  if (allRuns_ && line.isRun() && !line.hasColonOffset()) return !continuesRun(line);
  if (rows_[0].colon || !rows_[0].offset.empty()) return false;
  return isWhole() && !mayGoOn() && beginsReport(line.fields()[0].digits);
}

/// A text may have bytes behind its zero, so where its last line is as long as a full one it need not be the last.
bool HexTextReport::mayGoOn() const {
  const std::size_t first = rowEnd(0), last = data_.size() - rows_.back().begin;
  return expected_ == 0 && isTextReport(data_) && last == first && (first % 8 == 0 || first == kPlainRun);
}

bool HexTextReport::isWhole() const {
  if (problem_ || repeatAt_ || rows_.empty()) return false;
  if (allRuns_ || (!rows_[0].colon && rows_[0].offset.empty()))
    return data_.size() >= expected_ && (data_.size() == expected_ || isWholeReport(data_));
  return rows_.back().middle == data_.size();
}

/// Runs of digits are one report in lines of equal length, the last of which may be shorter, or one report a line. They
/// go on while the report is not whole. One whose end its ID does not tell goes on in lines as long as 'xxd -p' makes
/// them.
bool HexTextReport::continuesRun(const HexTextLine &line) const {
  std::size_t digits = 0;
  for (const auto &field : line.fields()) digits += field.digits.size();
  const std::size_t count = digits / 2;
  if (!equalRuns_ || count > runBytes_) return false;
  const KnownReport *known = findReport(byteAt(data_, 0));
  const bool beginsKnown = beginsReport(line.fields()[0].digits);
  if (known != nullptr && known->length == KnownReport::Length::kText) {
    const bool whole = data_.find('\0', 1) != std::string::npos;
    return !whole || (runBytes_ == kPlainRun && !beginsKnown);
  }
  if (known != nullptr && data_.size() < known->layoutSize)
    return runBytes_ == kPlainRun || data_.size() + count <= known->layoutSize;
  return runBytes_ == kPlainRun && !beginsKnown;
}

void HexTextReport::add(const HexTextLine &line, std::uint64_t number) {
  if (isEmpty()) firstLine_ = number;
  lastLine_ = number;
  if (problem_) return;
  if (const auto refusal = refuseLayout(line, rows_.empty())) return fail(*refusal->kind, number, refusal->text);

  Row row{number, {}, data_.size(), 0, true, line.hasColonOffset(), repeatAt_.has_value(), line.textColumnAt()};
  repeatAt_.reset();
  if (line.hasColonOffset() || line.mayHaveOffset()) row.offset = line.fields()[0].digits;
  addBytes(line, number, row);
  if (problem_) return;
  const std::size_t count = data_.size() - row.begin;
  rows_.push_back(std::move(row));
  allRuns_ = allRuns_ && line.isRun() && !line.hasColonOffset();
  if (rows_.size() == 1) runBytes_ = count;
  equalRuns_ = equalRuns_ && count == runBytes_;
  if (data_.size() > 2 * kMostReportBytes || rows_.size() > kMostReportBytes)
    return fail(kBadInput, number,
                "the report that begins in line " + std::to_string(firstLine_) + " has more than 65536 bytes");
  if (const auto refusal = refuseSwappedText(line, std::string_view(data_).substr(rows_.back().middle)))
    fail(*refusal->kind, number, refusal->text);
}

void HexTextReport::addBytes(const HexTextLine &line, std::uint64_t number, Row &row) {
  const auto wrong = [&](const HexTextLine::Field &field, std::string_view what) {
    fail(kBadInput, number,
         (field.prefixed ? "\"0x" : "\"") + std::string(field.digits.substr(0, 24)) + "\" in column " +
             std::to_string(field.column) + std::string(what));
  };
  for (const auto &field : line.fields()) {
    const std::string_view digits = field.digits;
    const bool mayBeOffset = &field == &line.fields()[0] && !row.offset.empty();
    if (digits.size() == 1) {
      data_ += static_cast<char>(hexDigit(digits[0]));
    } else if (digits.size() % 2 != 0) {
      row.firstIsBytes = false;
      if (!mayBeOffset)
        return wrong(field, consistsOf(digits, "0123456789")
                                ? " has an odd number of digits; decimal numbers are not read"
                                : " has an odd number of digits");
    } else if (field.prefixed && digits.size() > 2 && line.fields().size() > 1 && !mayBeOffset) {
      return wrong(field, " is more than a byte");
    } else {
      for (std::size_t i = 0; i < digits.size(); i += 2)
        data_ += static_cast<char>(hexDigit(digits[i]) * 16 + hexDigit(digits[i + 1]));
    }
    if (&field == &line.fields()[0]) row.middle = data_.size();
  }
}

std::size_t HexTextReport::rowEnd(std::size_t row) const {
  return row + 1 < rows_.size() ? rows_[row + 1].begin : data_.size();
}

void HexTextReport::finish() {
  if (problem_) return;
  if (hasOffsets())
    joinByOffsets();
  else
    joinAsData();
  if (!problem_ && bytes_.size() > kMostReportBytes)
    fail(kBadInput, firstLine_, "the report has more than 65536 bytes");
  if (!problem_ && bytes_.empty()) fail(kBadInput, firstLine_, "the dump has no bytes");
}

/// Whether the first fields are offsets: they have a colon, or begin at zero, or grow as the bytes do.
bool HexTextReport::hasOffsets() const {
  if (rows_[0].colon) return true;
  const auto mayBe = [](const Row &row) { return !row.offset.empty(); };
  if (rows_[0].middle == rowEnd(0) || !std::all_of(rows_.begin(), rows_.end(), mayBe)) return false;
  if (!rows_[0].firstIsBytes || consistsOf(rows_[0].offset, "0")) return true;
  if (rows_.size() < 2) return false;
  for (const int base : bases()) {
    const auto first = parseNumber(rows_[0].offset, base), second = parseNumber(rows_[1].offset, base);
    if (first && second && *second == *first + (rowEnd(0) - rows_[0].middle)) return true;
  }
  return false;
}

/// The number systems that the offsets may be in; what agrees with the bytes decides. od's seven digits are octal or
/// decimal, and xxd can be asked for decimal ones.
std::vector<int> HexTextReport::bases() const {
  if (!rows_[0].colon && rows_[0].offset.size() == 7) return {8, 10};
  return {16, 10};
}

void HexTextReport::joinByOffsets() {
  for (const int base : bases()) {
    if (joinByOffsets(base, false)) return;
    bytes_.clear();
  }
  joinByOffsets(bases()[0], true);
}

bool HexTextReport::joinByOffsets(int base, bool report) {
  const auto wrong = [&](std::uint64_t line, std::string text) {
    if (report) fail(kBadInput, line, std::move(text));
    return false;
  };
  const auto start = parseNumber(rows_[0].offset, base);
  if (!start) return wrong(rows_[0].line, "\"" + rows_[0].offset + "\" is no offset");
  std::string_view before;  // the bytes of the row before
  for (std::size_t i = 0; i < rows_.size(); ++i) {
    const Row &row = rows_[i];
    const auto offset = parseNumber(row.offset, base);
    const bool hasOffset = row.colon == rows_[0].colon && offset;
    const std::uint64_t expected = *start + bytes_.size();
    if (!hasOffset)
      return wrong(row.line,
                   "an offset was expected at the start of the line, " + offsetLike(rows_[0].offset, expected, base));
    if (row.repeatBefore) {
      if (*offset < expected || *offset - expected > kMostReportBytes || before.empty() ||
          (*offset - expected) % before.size() != 0)
        return wrong(row.line, "offset " + row.offset + " is no whole number of lines behind " +
                                   offsetLike(rows_[0].offset, expected, base) +
                                   ", where \"*\" repeats the line before");
      for (std::uint64_t left = *offset - expected; left != 0; left -= before.size()) bytes_ += before;
    } else if (*offset != expected) {
      return wrong(row.line, "offset " + row.offset + " where " + offsetLike(rows_[0].offset, expected, base) +
                                 " was expected; a line is missing or has too few bytes");
    }
    if (bytes_.size() > kMostReportBytes) return wrong(row.line, "the report has more than 65536 bytes");
    before = std::string_view(data_).substr(row.middle, rowEnd(i) - row.middle);
    bytes_ += before;
  }
  if (repeatAt_)
    return wrong(*repeatAt_,
                 "the dump ends with \"*\", so its length is unknown; the line with the last offset is missing");
  if (*start != 0) beginsAt_ = *start;
  return true;
}

void HexTextReport::joinAsData() {
  std::optional<std::uint64_t> repeat = repeatAt_;
  for (const Row &row : rows_) {
    if (row.repeatBefore && !repeat) repeat = row.line;
    if (!row.firstIsBytes) return fail(kBadInput, row.line, "\"" + row.offset + "\" has an odd number of digits");
    if (row.cutAt != 0)
      return fail(kBadInput, row.line,
                  "what stands in column " + std::to_string(row.cutAt) +
                      " is set off like a text column, but the line has no offset");
    if (row.colon) return fail(kBadInput, row.line, "an offset, but the lines before it have none");
  }
  if (repeat)
    return fail(
        kBadInput, *repeat,
        "\"*\" stands for repeated lines, but without offsets nobody knows how many; print it with 'od -An -v -tx1'");
  bytes_ = data_;
  if (isWholeReport(bytes_) && !isTextReport(bytes_)) return;
  const std::size_t length = reportLength(bytes_);
  for (std::size_t i = 1; i < rows_.size() && suspectLine_ == 0; ++i) {
    const std::string_view row = std::string_view(data_).substr(rows_[i].begin, rowEnd(i) - rows_[i].begin);
    const bool isBehind = rows_[i].begin >= length && reportLength(row) != 0;
    if (isBehind || isWholeReport(row)) suspectLine_ = rows_[i].line;
  }
}

}  // namespace vesk::host
