// What the readers of text have in common: is it text, its numbers, its hex digits.
#pragma once

#include <charconv>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace vesk::host {

/// Whether an input that begins with `head` is text: no control characters but those that texts have, and where the
/// first byte is beyond ASCII, as most report IDs are, UTF-8. `head` may end within a character.
bool isText(std::string_view head);

/// The value of a hex digit; -1 for any other character.
constexpr int hexDigit(char character) {
  if (character >= '0' && character <= '9') return character - '0';
  if (character >= 'a' && character <= 'f') return character - 'a' + 10;
  if (character >= 'A' && character <= 'F') return character - 'A' + 10;
  return -1;
}

constexpr bool isBlank(char character) {
  return character == ' ' || character == '\t';
}

/// All of `digits` as a number without a sign; nothing where it is no number or too large.
inline std::optional<std::uint64_t> parseNumber(std::string_view digits, int base) {
  std::uint64_t value = 0;
  const char *const end = digits.data() + digits.size();
  const auto [stop, error] = std::from_chars(digits.data(), end, value, base);
  if (digits.empty() || error != std::errc() || stop != end) return {};
  return value;
}

/// "<seconds>.<up to nine digits>" in nanoseconds; nothing where it is no such number or too large.
std::optional<std::int64_t> parseSeconds(std::string_view text);

/// The head without a byte-order mark.
constexpr std::string_view withoutMark(std::string_view head) {
  return head.starts_with("\xef\xbb\xbf") ? head.substr(3) : head;
}

/// Takes the next word, which blanks end, from the front of `text`; empty at the end.
constexpr std::string_view takeWord(std::string_view &text) {
  std::size_t begin = 0;
  while (begin < text.size() && isBlank(text[begin])) ++begin;
  std::size_t end = begin;
  while (end < text.size() && !isBlank(text[end])) ++end;
  const std::string_view word = text.substr(begin, end - begin);
  text.remove_prefix(end);
  return word;
}

/// Bytes of two hex digits each with blanks between them, appended to `out`. Returns the word that is no byte; empty
/// where all are.
std::string_view takeBytes(std::string_view text, std::string &out);

/// Takes the next line, without its line end, from the front of a head; false at the end. The last line may be cut.
constexpr bool takeLine(std::string_view &head, std::string_view &line) {
  if (head.empty()) return false;
  const std::size_t lineFeed = head.find('\n');
  line = head.substr(0, lineFeed);
  head.remove_prefix(lineFeed == std::string_view::npos ? head.size() : lineFeed + 1);
  if (line.ends_with('\r')) line.remove_suffix(1);
  return true;
}

}  // namespace vesk::host
