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

inline char *writeDecimal(char *out, std::uint32_t value) noexcept {
  if (value < 10'000) return writeUpToFourDigits(out, value);
  if (value < 100'000'000) return writeFourDigits(writeUpToFourDigits(out, value / 10'000), value % 10'000);
  out = writeUpToFourDigits(out, value / 100'000'000);
  return writeFourDigits(writeFourDigits(out, value / 10'000 % 10'000), value % 10'000);
}

inline char *writeDecimal(char *out, std::uint64_t value) noexcept {
  if (value <= UINT32_MAX) return writeDecimal(out, static_cast<std::uint32_t>(value));
  const auto low = static_cast<std::uint32_t>(value % 100'000'000);
  out = writeDecimal(out, value / 100'000'000);
  return writeFourDigits(writeFourDigits(out, low / 10'000), low % 10'000);
}

inline char *writeDecimal(char *out, std::int32_t value) noexcept {
  const auto bits = static_cast<std::uint32_t>(value);
  if (value >= 0) return writeDecimal(out, bits);
  *out = '-';
  return writeDecimal(out + 1, 0u - bits);
}

inline char *writeDecimal(char *out, std::int64_t value) noexcept {
  const auto bits = static_cast<std::uint64_t>(value);
  if (value >= 0) return writeDecimal(out, bits);
  *out = '-';
  return writeDecimal(out + 1, std::uint64_t{0} - bits);
}

/// 0 to 9999 in four columns, blanks for leading zeros; returns how many there are.
inline unsigned writeFourColumns(char *out, std::uint32_t value) noexcept {
  std::uint32_t digits;
  std::memcpy(&digits, kFourDigits.data()[value].data(), 4);
  const int leadingZeros = std::countr_zero((digits & 0x0F0F0F0Fu) | 0x01000000u) / 8;
  digits ^= 0x10101010u & ((1u << 8 * leadingZeros) - 1);  // '0' to ' '
  std::memcpy(out, &digits, 4);
  return static_cast<unsigned>(leadingZeros);
}

/// As "%<Width>i" prints it: right-aligned, the sign before the first digit.
template <unsigned Width>
char *writeAlignedDecimal(char *out, bool negative, std::uint32_t magnitude) noexcept {
  static_assert(Width >= 12, "ten digits in three groups of four");
  std::memset(out, ' ', Width);
  unsigned first;  // the first digit's column
  if (magnitude < 10'000) {
    first = Width - 4 + writeFourColumns(out + Width - 4, magnitude);
  } else if (magnitude < 100'000'000) {
    first = Width - 8 + writeFourColumns(out + Width - 8, magnitude / 10'000);
    writeFourDigits(out + Width - 4, magnitude % 10'000);
  } else {
    first = Width - 12 + writeFourColumns(out + Width - 12, magnitude / 100'000'000);
    writeFourDigits(out + Width - 8, magnitude / 10'000 % 10'000);
    writeFourDigits(out + Width - 4, magnitude % 10'000);
  }
  out[first - 1] = negative ? '-' : ' ';
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
  out = writeDecimal(out, units / kUnits);
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
