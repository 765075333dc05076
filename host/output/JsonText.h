// JSON's strings and numbers, as they stand in every document of ours.
#pragma once

#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <type_traits>

#include "host/output/OutputBuffer.h"
#include "values/NumberText.h"

namespace vesk::host {

/// Copies a text of some four to thirty bytes, as keys are, without a call; returns the end of the copy. Two pieces
/// that overlap make all lengths between their own and twice that one case, so that few branches are guessed wrong.
inline char *copyShort(char *out, std::string_view text) {
  const auto pieces = [&](auto size) {
    std::memcpy(out, text.data(), size);
    std::memcpy(out + text.size() - size, text.data() + text.size() - size, size);
  };
  if (text.size() > 16 && text.size() <= 32)
    pieces(std::integral_constant<std::size_t, 16>());
  else if (text.size() > 8 && text.size() <= 16)
    pieces(std::integral_constant<std::size_t, 8>());
  else if (text.size() >= 4 && text.size() <= 8)
    pieces(std::integral_constant<std::size_t, 4>());
  else
    std::copy(text.begin(), text.end(), out);
  return out + text.size();
}

/// The text with U+FFFD in place of every byte that is not part of well-formed UTF-8.
std::string asUtf8(std::string_view text);

/// A JSON string, quotes included. Whatever the bytes are, what is written is well-formed UTF-8.
void appendJsonString(OutputBuffer &out, std::string_view text);

/// Two digits a byte, lower case, without blanks.
void appendHexDigits(OutputBuffer &out, std::string_view bytes);

/// Nanoseconds as seconds, exactly, with no more decimals than it takes: 3.000412, -0.5, 7.
void appendSeconds(OutputBuffer &out, std::int64_t nanoseconds);

/// The most that writeNumber may touch.
inline constexpr std::size_t kTextNumberRoom = 40;

/// A number at `out`; returns its end. Floats get the fewest digits that read back to the same value of their own type;
/// NaN and the infinities, for which JSON has no number, become null.
template <class Number>
char *writeNumber(char *out, Number value) noexcept {
  if constexpr (std::is_floating_point_v<Number>) {
    if (!std::isfinite(value)) return std::copy_n("null", 4, out);
    if (value == 0 && std::signbit(value)) return std::copy_n("-0.0", 4, out);  // "-0" is an integer to many readers
    return std::to_chars(out, out + kTextNumberRoom, value).ptr;
  } else if constexpr (sizeof(Number) == 8) {
    return writeDecimal(out, value);
  } else if constexpr (std::is_signed_v<Number>) {
    return writeDecimal(out, std::int32_t{value});
  } else {
    return writeDecimal(out, std::uint32_t{value});
  }
}

template <class Number>
void appendNumber(OutputBuffer &out, Number value) {
  out.advanceTo(writeNumber(out.room(kTextNumberRoom), value));
}

}  // namespace vesk::host
