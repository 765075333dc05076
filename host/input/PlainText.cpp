// The judgement on text, and times.
#include "host/input/PlainText.h"

#include <algorithm>

#include "values/Utf8.h"

namespace vesk::host {

namespace {

bool isControl(char character) {
  const auto code = static_cast<unsigned char>(character);
  return (code < 0x20 && (code < '\t' || code > '\r') && code != 0x1b) || code == 0x7f;
}

}  // namespace

bool isText(std::string_view head) {
  if (head.empty() || std::any_of(head.begin(), head.end(), isControl)) return false;
  if (static_cast<unsigned char>(head[0]) < 0x80) return true;
  for (std::size_t cut = 0; cut < 4 && cut < head.size(); ++cut)
    if (isUtf8(head.substr(0, head.size() - cut))) return true;
  return false;
}

std::optional<std::int64_t> parseSeconds(std::string_view text) {
  constexpr std::uint64_t kMostSeconds = 9'000'000'000;  // in nanoseconds just within 63 bits
  const std::size_t point = text.find('.');
  const auto seconds = parseNumber(text.substr(0, point), 10);
  if (!seconds || *seconds > kMostSeconds) return {};
  std::uint64_t fraction = 0;
  if (point != std::string_view::npos) {
    const std::string_view digits = text.substr(point + 1);
    const auto value = parseNumber(digits, 10);
    if (!value || digits.size() > 9) return {};
    fraction = *value;
    for (std::size_t place = digits.size(); place < 9; ++place) fraction *= 10;
  }
  return static_cast<std::int64_t>(*seconds * 1'000'000'000 + fraction);
}

std::string_view takeBytes(std::string_view text, std::string &out) {
  for (std::string_view word = takeWord(text); !word.empty(); word = takeWord(text)) {
    const int high = hexDigit(word[0]), low = word.size() == 2 ? hexDigit(word[1]) : -1;
    if (high < 0 || low < 0) return word;
    out += static_cast<char>(high * 16 + low);
  }
  return {};
}

}  // namespace vesk::host
