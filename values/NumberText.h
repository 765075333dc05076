// Numbers to digits through look-up tables: what PrintfFormat and the host's JSON writer are built on.
// Every function writes at `out`, without a terminating zero, and returns the end of what it wrote.
#pragma once

#include <array>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>

namespace vesk {

/// The most that writeDecimal and writeHex may touch behind `out`, digits and scratch together.
inline constexpr std::size_t kNumberRoom = 24;

extern const std::array<std::array<char, 4>, 10000> kFourDigits;  // "0000" to "9999"
extern const std::array<char, 4 * 4096> kThreeHexDigits;          // "000 001 ... fff "

inline char *writeFourDigits(char *out, std::uint32_t value) noexcept {
  std::memcpy(out, kFourDigits.data()[value].data(), 4);
  return out + 4;
}

/// 0 to 9999 without leading zeros.
inline char *writeUpToFourDigits(char *out, std::uint32_t value) noexcept {
  std::uint32_t digits;
  std::memcpy(&digits, kFourDigits.data()[value].data(), 4);
  // The first digit is the lowest byte. The last one is marked, so that a zero keeps it.
  const int leadingZeros = std::countr_zero((digits & 0x0F0F0F0Fu) | 0x01000000u) / 8;
  digits >>= 8 * leadingZeros;
  std::memcpy(out, &digits, 4);
  return out + 4 - leadingZeros;
}

/// Eight digits of a number below 100000000, leading zeros too: as the number whose lowest byte is the first character.
inline std::uint64_t eightDigits(std::uint32_t value) noexcept {
  std::uint32_t high, low;
  std::memcpy(&high, kFourDigits.data()[value / 10'000].data(), 4);
  std::memcpy(&low, kFourDigits.data()[value % 10'000].data(), 4);
  return high | std::uint64_t{low} << 32;
}

/// How many zeros stand before the first digit; the last one is marked, so that a zero keeps it.
inline int leadingZeros(std::uint64_t eightDigits) noexcept {
  return std::countr_zero((eightDigits & 0x0F0F0F0F0F0F0F0Fu) | std::uint64_t{1} << 56) / 8;
}

inline char *writeEightDigits(char *out, std::uint32_t value) noexcept {
  const std::uint64_t digits = eightDigits(value);
  std::memcpy(out, &digits, 8);
  return out + 8;
}

/// One branch only, at a size that few columns of numbers cross: lengths are random, and a branch at each would cost
/// more than the digits.
[[gnu::always_inline]] inline char *writeDecimal(char *out, std::uint32_t value) noexcept {
  if (value >= 100'000'000) return writeEightDigits(writeUpToFourDigits(out, value / 100'000'000), value % 100'000'000);
  const std::uint64_t digits = eightDigits(value);
  const int zeros = leadingZeros(digits);
  const std::uint64_t text = digits >> 8 * zeros;
  std::memcpy(out, &text, 8);
  return out + 8 - zeros;
}

inline char *writeDecimal(char *out, std::uint64_t value) noexcept {
  if (value <= UINT32_MAX) return writeDecimal(out, static_cast<std::uint32_t>(value));
  return writeEightDigits(writeDecimal(out, value / 100'000'000), static_cast<std::uint32_t>(value % 100'000'000));
}

/// |value|, without a branch: signs are as random as lengths.
template <class Unsigned>
Unsigned magnitudeOf(Unsigned bits, bool negative) noexcept {
  const Unsigned mask = Unsigned{0} - negative;
  return (bits ^ mask) - mask;
}

inline char *writeDecimal(char *out, std::int32_t value) noexcept {
  *out = '-';
  return writeDecimal(out + (value < 0), magnitudeOf(static_cast<std::uint32_t>(value), value < 0));
}

inline char *writeDecimal(char *out, std::int64_t value) noexcept {
  *out = '-';
  return writeDecimal(out + (value < 0), magnitudeOf(static_cast<std::uint64_t>(value), value < 0));
}

/// As "%<Width>i" prints it: right-aligned, the sign before the first digit.
template <unsigned Width>
char *writeAlignedDecimal(char *out, bool negative, std::uint32_t magnitude) noexcept {
  static_assert(Width >= 11, "ten digits and a sign");
  std::memset(out, ' ', Width);
  char *const lastEight = out + Width - 8;
  char *first = lastEight;
  if (magnitude < 100'000'000) {
    std::uint64_t digits = eightDigits(magnitude);
    const int zeros = leadingZeros(digits);
    digits ^= 0x1010101010101010u & ((std::uint64_t{1} << 8 * zeros) - 1);  // '0' to ' '
    std::memcpy(lastEight, &digits, 8);
    first += zeros;
  } else {
    const std::uint32_t high = magnitude / 100'000'000;
    first -= high < 10 ? 1 : 2;
    writeUpToFourDigits(first, high);  // what it writes behind its digits is written over
    writeEightDigits(lastEight, magnitude % 100'000'000);
  }
  first[-1] = negative ? '-' : ' ';
  return out + Width;
}

/// Exactly eight lower-case digits; the byte behind them is a blank then.
inline char *writeHex8(char *out, std::uint32_t value) noexcept {
  const char *table = kThreeHexDigits.data();
  std::memcpy(out, table + 1 + 4 * (value >> 24), 4);  // of "0ff " the last two; what follows is written over
  std::memcpy(out + 2, table + 4 * (value >> 12 & 0xFFF), 4);
  std::memcpy(out + 5, table + 4 * (value & 0xFFF), 4);
  return out + 8;
}

/// At least `minimum` digits, at most 16, in either case.
char *writeHex(char *out, std::uint64_t value, unsigned minimum, bool upperCase) noexcept;

/// The most that writeFixed may touch: a double's 309 digits, the point and six decimals.
inline constexpr std::size_t kFixedRoom = 320;

/// |value| with 3 or 6 decimals, correctly rounded, ties to even, as "%.3f" and "%.6f" print it; `value` is finite.
/// A value that a float can hold takes the short way: times 1000 (10 bits) or 1000000 (20 bits) its 24 bits stay exact
/// in a double, so one rounding to integer is the only rounding there is. All else goes through std::to_chars.
template <unsigned Decimals>
char *writeFixed(char *out, double value) noexcept {
  static_assert(Decimals == 3 || Decimals == 6);
  constexpr std::uint32_t kUnits = Decimals == 3 ? 1'000 : 1'000'000;
  constexpr double kRounder = 0x1p52;  // from here on a double holds integers only, so adding it rounds to one
  const double magnitude = std::fabs(value);
  const double scaled = magnitude * kUnits;
  if (!(scaled < kRounder / 2) || static_cast<double>(static_cast<float>(magnitude)) != magnitude)
    return std::to_chars(out, out + kFixedRoom, magnitude, std::chars_format::fixed, Decimals).ptr;
  const auto units = static_cast<std::uint64_t>((scaled + kRounder) - kRounder);
  const std::uint64_t whole = units / kUnits;
  out = whole < 10'000 ? writeUpToFourDigits(out, static_cast<std::uint32_t>(whole)) : writeDecimal(out, whole);
  const auto fraction = static_cast<std::uint32_t>(units % kUnits);
  if constexpr (Decimals == 6) {
    writeFourDigits(out, fraction / 1'000);
    std::memcpy(out + 4, kFourDigits.data()[fraction % 1'000].data() + 1, 3);
  } else {
    writeFourDigits(out, fraction);
  }
  *out = '.';  // where the first of four digits is always a zero
  return out + 1 + Decimals;
}

}  // namespace vesk
