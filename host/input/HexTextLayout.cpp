// Telling layouts of hex text apart.
#include "host/input/HexTextLayout.h"

#include <algorithm>

#include "host/input/PlainText.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

LayoutRefusal refuse(const MessageKind &kind, const std::string &what) {
  return {&kind, what + "; print them with 'xxd', 'hexdump -C' or 'od -Ax -v -tx1'"};
}

/// Of eight binary digits.
bool areReportId(std::string_view bits) {
  return findReport(static_cast<std::uint32_t>(parseNumber(bits, 2).value_or(0))) != nullptr;
}

bool consistsOf(std::string_view text, std::string_view characters) {
  return text.find_first_not_of(characters) == std::string_view::npos;
}

/// Whether a text column begins with these bytes, a dot for each that cannot be printed.
template <typename ByteAt>
bool shows(std::string_view text, std::size_t count, ByteAt byteAt) {
  if (text.size() < count) return false;
  for (std::size_t i = 0; i < count; ++i) {
    const char byte = byteAt(i);
    if (text[i] != (byte >= 0x20 && byte < 0x7f ? byte : '.')) return false;
  }
  return true;
}

}  // namespace

std::optional<LayoutRefusal> refuseLayout(const HexTextLine &line, bool isFirst) {
  const auto &fields = line.fields();
  const std::string_view front = fields[0].digits;
  const bool colon = line.hasColonOffset();
  // Offsets of od and hexdump, which have words behind them.
  const bool offset = !colon && !fields[0].prefixed && fields.size() > 1 &&
                      (front.size() == 7 || (isFirst && front.size() >= 6 && consistsOf(front, "0")));
  const std::size_t first = offset || colon ? 1 : 0;
  const std::size_t digits = line.digitsFrom(first);
  const bool several = fields.size() > first + 1;
  const auto allConsistOf = [&](std::string_view characters) {
    return std::all_of(fields.begin() + static_cast<std::ptrdiff_t>(first), fields.end(),
                       [&](const auto &field) { return consistsOf(field.digits, characters); });
  };

  if (digits == 8 && isFirst && allConsistOf("01")) {
    const std::string_view text = line.textColumn();
    if (colon ? text.empty() || text.size() == fields.size() - 1 : several && areReportId(fields[first].digits))
      return refuse(kBitText, "the bytes are written as bits, as from 'xxd -b'");
  }
  if (colon) return {};
  const bool octalWords = (digits == 6 || digits == 11) && (offset || (several && isFirst));
  const bool octalBytes = digits == 3 && (offset || several);
  if ((octalWords || octalBytes) && allConsistOf("01234567"))
    return refuse(kOctalText, "the bytes are written as octal numbers, as from 'od' without options");
  if (offset && digits == 5 && allConsistOf("0123456789"))
    return refuse(kDecimalText, "the bytes are written as decimal words, as from 'hexdump -d'");
  if ((digits == 4 || digits == 8 || digits == 16) && !fields[first].prefixed) {
    const bool swappedId = isFirst && several && !beginsReport(front) && beginsReport(front.substr(front.size() - 2));
    if (offset || swappedId)
      return refuse(kSwappedWords,
                    "the bytes stand in words, swapped as on most machines, as from 'hexdump' without -C or 'od -tx2'");
  }
  return {};
}

std::optional<LayoutRefusal> refuseSwappedText(const HexTextLine &line, std::string_view bytes) {
  if (!line.hasColonOffset() || line.fields().size() < 2) return {};
  const std::size_t group = line.fields()[1].digits.size() / 2;
  std::string_view text = line.textColumn();
  if (group < 2 || shows(text, bytes.size(), [&](std::size_t i) { return bytes[i]; })) return {};
  // A last group of fewer bytes stands apart, at the right end of its column, and looks like the text.
  if (const std::size_t blank = text.find(' '); blank != std::string_view::npos && blank < 2 * group &&
                                                blank % 2 == 0 && consistsOf(text.substr(0, blank), "0123456789abcdef"))
    text.remove_prefix(std::min(text.find_first_not_of(' ', blank), text.size()));
  const std::size_t whole = bytes.size() / group * group;
  if (!shows(text, whole, [&](std::size_t i) { return bytes[i / group * group + group - 1 - i % group]; })) return {};
  return refuse(kSwappedWords, "the text column shows that the bytes of each group are swapped, as from 'xxd -e'");
}

}  // namespace vesk::host
