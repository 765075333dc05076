// Escapes, and what becomes of bytes that are no text.
#include "host/output/JsonText.h"

#include <array>

#include "values/Utf8.h"

namespace vesk::host {

namespace {

/// For each byte the letter behind its backslash, 'u' for a \u00XX, or 0 where it stands for itself.
constexpr auto kEscapes = [] {
  std::array<char, 256> escapes{};
  for (std::size_t c = 0; c < 0x20; ++c) escapes[c] = 'u';
  escapes['\b'] = 'b';
  escapes['\f'] = 'f';
  escapes['\n'] = 'n';
  escapes['\r'] = 'r';
  escapes['\t'] = 't';
  escapes['"'] = '"';
  escapes['\\'] = '\\';
  return escapes;
}();

char escapeOf(char c) {
  return kEscapes[static_cast<unsigned char>(c)];
}

void appendEscape(OutputBuffer &out, char c) {
  char *end = out.room(kNumberRoom);
  *end++ = '\\';
  *end++ = escapeOf(c);
  if (escapeOf(c) == 'u') end = writeHex(end, static_cast<unsigned char>(c), 4, false);
  out.advanceTo(end);
}

/// How many bytes at the start of `text` are one well-formed character; 0 for none.
std::size_t characterSize(std::string_view text) {
  for (std::size_t size = 1; size <= std::min<std::size_t>(4, text.size()); ++size)
    if (isUtf8(text.substr(0, size))) return size;
  return 0;
}

/// Most texts are short and plain.
bool isPlain(std::string_view text) {
  return std::all_of(text.begin(), text.end(), [](char c) { return c >= 0 && escapeOf(c) == 0; });
}

void appendEscaped(OutputBuffer &out, std::string_view text) {
  out.append('"');
  for (std::size_t begin = 0; begin < text.size();) {
    std::size_t end = begin;
    while (end < text.size() && escapeOf(text[end]) == 0) ++end;
    out.append(text.substr(begin, end - begin));
    if (end < text.size()) appendEscape(out, text[end++]);
    begin = end;
  }
  out.append('"');
}

}  // namespace

std::string asUtf8(std::string_view text) {
  std::string clean;
  while (!text.empty()) {
    const std::size_t size = characterSize(text);
    clean += size == 0 ? "\xEF\xBF\xBD" : text.substr(0, size);
    text.remove_prefix(std::max<std::size_t>(size, 1));
  }
  return clean;
}

void appendJsonString(OutputBuffer &out, std::string_view text) {
  if (isPlain(text)) {
    char *end = out.room(text.size() + 2);
    *end++ = '"';
    end = std::copy(text.begin(), text.end(), end);
    *end++ = '"';
    out.advanceTo(end);
  } else if (isUtf8(text)) {
    appendEscaped(out, text);
  } else {
    appendEscaped(out, asUtf8(text));
  }
}

void appendHexDigits(OutputBuffer &out, std::string_view bytes) {
  char *end = out.room(2 * bytes.size());
  for (const char byte : bytes) end = writeHex(end, static_cast<unsigned char>(byte), 2, false);
  out.advanceTo(end);
}

void appendSeconds(OutputBuffer &out, std::int64_t nanoseconds) {
  constexpr std::uint64_t kSecond = 1'000'000'000;
  const auto bits = static_cast<std::uint64_t>(nanoseconds);
  const std::uint64_t magnitude = nanoseconds < 0 ? 0 - bits : bits;
  char *end = out.room(2 * kNumberRoom);
  if (nanoseconds < 0) *end++ = '-';
  end = writeDecimal(end, magnitude / kSecond);
  if (const auto fraction = static_cast<std::uint32_t>(magnitude % kSecond); fraction != 0) {
    *end++ = '.';
    *end++ = static_cast<char>('0' + fraction / 100'000'000);
    end = writeFourDigits(writeFourDigits(end, fraction / 10'000 % 10'000), fraction % 10'000);
    while (end[-1] == '0') --end;
  }
  out.advanceTo(end);
}

}  // namespace vesk::host
