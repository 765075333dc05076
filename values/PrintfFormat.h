// The subset of printf that the display lines use, parsed, checked and expanded by the compiler, so that a format
// stands in the code exactly as it is printed. What it writes is what the C library writes, in every locale.
//
// Conversions: %[flags][width][.3|.6][ll](s|i|d|u|x|X|f) with the flags '-', '0' and ' '. Anything else does not
// compile.
#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

#include "values/LittleEndian.h"
#include "values/NumberText.h"
#include "values/TextBlocks.h"

namespace vesk {

template <std::size_t Size>
struct FormatText {
  char text[Size];
  consteval FormatText(const char (&literal)[Size]) { std::copy_n(literal, Size, text); }  // NOLINT: implicit
};

namespace format {

struct Conversion {
  std::size_t begin = 0, end = 0;  // its place in the format
  char kind = 0;
  bool left = false, zeros = false, blank = false, longLong = false;
  unsigned width = 0, precision = 6;
};

template <FormatText F>
inline constexpr std::size_t kLength = sizeof(F.text) - 1;

/// The conversion whose '%' stands at text[begin]. What is not in the subset ends the compilation at a throw.
constexpr Conversion parseConversion(const char *text, std::size_t begin) {
  Conversion c;
  c.begin = begin;
  std::size_t at = begin + 1;
  for (;; ++at) {
    if (text[at] == '-')
      c.left = true;
    else if (text[at] == '0')
      c.zeros = true;
    else if (text[at] == ' ')
      c.blank = true;
    else
      break;
  }
  for (; text[at] >= '0' && text[at] <= '9'; ++at) c.width = c.width * 10 + static_cast<unsigned>(text[at] - '0');
  const bool hasPrecision = text[at] == '.';
  if (hasPrecision) {
    c.precision = static_cast<unsigned>(text[at + 1] - '0');
    at += 2;
  }
  if (text[at] == 'l' && text[at + 1] == 'l') {
    c.longLong = true;
    at += 2;
  }
  c.kind = text[at] == 'd' ? 'i' : text[at];
  c.end = at + 1;
  const bool hex = c.kind == 'x' || c.kind == 'X', integer = hex || c.kind == 'i' || c.kind == 'u';
  if (!integer && c.kind != 's' && c.kind != 'f') throw "a conversion that is not in the subset";
  if (c.zeros && !hex) throw "leading zeros are for hexadecimal numbers";
  if (hex && c.width != 0 && !c.zeros) throw "a width of hexadecimal digits wants leading zeros";
  if ((c.blank || c.left) && c.kind != 'f') throw "the blank flag and left alignment are for floats";
  if (c.longLong && !integer) throw "ll is for integers";
  if (hasPrecision && c.kind != 'f') throw "a precision is for floats";
  if (c.kind == 'f' && c.precision != 3 && c.precision != 6) throw "floats have 3 or 6 decimals";
  return c;
}

template <FormatText F>
inline constexpr std::size_t kCount = static_cast<std::size_t>(std::count(F.text, F.text + kLength<F>, '%'));

template <FormatText F>
inline constexpr auto kConversions = [] {
  std::array<Conversion, kCount<F>> all{};
  std::size_t from = 0;
  for (Conversion &conversion : all) {
    while (F.text[from] != '%') ++from;
    conversion = parseConversion(F.text, from);
    from = conversion.end;
  }
  return all;
}();

template <class T>
constexpr const T &plain(const T &argument) {
  return argument;
}
template <class T>
T plain(const LittleEndian<T> &field) {
  return field;
}

/// The most that a number or a block takes.
template <Conversion C, class T>
inline constexpr std::size_t kRoom = C.width + (C.kind == 'f' ? kFixedRoom + 1 : kNumberRoom);
template <Conversion C, class T>
requires kIsBlock<T>
inline constexpr std::size_t kRoom<C, T> = T::kBlock;

template <Conversion C, class T>
std::size_t room(const T &argument) noexcept {
  if constexpr (C.kind == 's' && !kIsBlock<T>)
    return C.width + std::string_view(argument).size();
  else
    return kRoom<C, T>;
}

/// Moves [begin, end) to the right edge of `width` columns that start at `begin`.
inline char *alignRight(char *begin, char *end, unsigned width) noexcept {
  const auto size = static_cast<std::size_t>(end - begin);
  if (size >= width) return end;
  std::memmove(begin + width - size, begin, size);
  std::memset(begin, ' ', width - size);
  return begin + width;
}

template <Conversion C>
char *writeText(char *out, std::string_view text) noexcept {
  if (text.size() < C.width) {
    std::memset(out, ' ', C.width - text.size());
    out += C.width - text.size();
  }
  if (!text.empty()) std::memcpy(out, text.data(), text.size());
  return out + text.size();
}

template <Conversion C>
char *writeFloat(char *out, double value) noexcept {
  char *const begin = out;
  if constexpr (C.left) std::memset(begin, ' ', C.width);
  *out = std::signbit(value) ? '-' : ' ';
  out += std::signbit(value) || C.blank;
  if (std::isfinite(value))
    out = writeFixed<C.precision>(out, value);
  else
    out = std::copy_n(std::isnan(value) ? "nan" : "inf", 3, out);
  if constexpr (C.left)
    return std::max(out, begin + C.width);
  else
    return alignRight(begin, out, C.width);
}

template <Conversion C, class T>
[[gnu::always_inline]] inline char *writeInteger(char *out, T value) noexcept {
  static_assert(std::is_integral_v<T> && (sizeof(T) == 8) == C.longLong,
                "a 64-bit number is printed with ll, no other is");
  using Unsigned = std::conditional_t<C.longLong, std::uint64_t, std::uint32_t>;
  const auto bits = static_cast<Unsigned>(value);
  const bool negative = C.kind == 'i' && static_cast<std::make_signed_t<Unsigned>>(bits) < 0;
  const Unsigned magnitude = magnitudeOf(bits, negative);
  if constexpr (C.kind == 'x' && C.width == 8 && !C.longLong) {
    return writeHex8(out, bits);
  } else if constexpr (C.kind == 'x' || C.kind == 'X') {
    return writeHex(out, bits, C.width == 0 ? 1 : C.width, C.kind == 'X');
  } else if constexpr (C.width >= 12 && !C.longLong) {
    return writeAlignedDecimal<C.width>(out, negative, magnitude);
  } else {
    char *first = out;
    if (negative) [[unlikely]]
      *first++ = '-';
    return alignRight(out, writeDecimal(first, magnitude), C.width);
  }
}

template <Conversion C, class T>
char *writeConversion(char *out, const T &argument) noexcept {
  if constexpr (kIsBlock<T>) {
    static_assert(C.kind == 's' && (C.width == 0 || std::is_same_v<T, Label<C.width>>), "a label of another width");
    std::memcpy(out, argument.text, T::kBlock);
    return out + argument.size;
  } else if constexpr (C.kind == 's') {
    return writeText<C>(out, argument);
  } else if constexpr (C.kind == 'f') {
    return writeFloat<C>(out, argument);
  } else {
    return writeInteger<C>(out, argument);
  }
}

/// Copies the literal text between the conversions Before - 1 and Before.
template <FormatText F, std::size_t Before>
char *writeLiteral(char *out) noexcept {
  constexpr auto &all = kConversions<F>;
  constexpr std::size_t begin = Before == 0 ? 0 : all[Before - 1].end;
  constexpr std::size_t end = Before == all.size() ? kLength<F> : all[Before].begin;
  if constexpr (end > begin) std::memcpy(out, F.text + begin, end - begin);
  return out + (end - begin);
}

}  // namespace format

/// One format: how much room a line of it may need, and writing it there.
template <FormatText F>
struct Format {
  template <class... Args>
  static std::size_t room(const Args &...args) noexcept {
    static_assert(sizeof...(Args) == format::kCount<F>, "as many arguments as conversions");
    return [&]<std::size_t... I>(std::index_sequence<I...>) {
      return (format::kLength<F> + ... + format::room<format::kConversions<F>[I]>(format::plain(args)));
    }
    (std::index_sequence_for<Args...>());
  }

  /// The most bytes that a line takes, whatever its numbers and blocks are.
  template <class... Args>
  static constexpr std::size_t kRoom = []<std::size_t... I>(std::index_sequence<I...>) {
    return (format::kLength<F> + ... + format::kRoom<format::kConversions<F>[I], Args>);
  }
  (std::index_sequence_for<Args...>());

  /// REQUIRES: room(args...) writable bytes. Returns the end of the text; no terminating zero.
  template <class... Args>
  static char *write(char *out, const Args &...args) noexcept {
    [&]<std::size_t... I>(std::index_sequence<I...>) {
      ((out = format::writeLiteral<F, I>(out),
        out = format::writeConversion<format::kConversions<F>[I]>(out, format::plain(args))),
       ...);
    }
    (std::index_sequence_for<Args...>());
    return format::writeLiteral<F, sizeof...(Args)>(out);
  }
};

/// The same as a string of its own.
template <FormatText F, class... Args>
std::string formatted(const Args &...args) {
  std::string text(Format<F>::room(args...), '\0');
  text.resize(static_cast<std::size_t>(Format<F>::write(text.data(), args...) - text.data()));
  return text;
}

}  // namespace vesk
