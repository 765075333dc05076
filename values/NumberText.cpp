// The digit tables, and the number forms that are not worth inlining.
#include "values/NumberText.h"

#include <charconv>
#include <cmath>

namespace vesk {

namespace {

constexpr auto makeFourDigits() {
  std::array<std::array<char, 4>, 10000> table{};
  for (unsigned i = 0; i < table.size(); ++i)
    table[i] = {static_cast<char>('0' + i / 1000), static_cast<char>('0' + i / 100 % 10),
                static_cast<char>('0' + i / 10 % 10), static_cast<char>('0' + i % 10)};
  return table;
}

constexpr auto makeThreeHexDigits() {
  constexpr char digits[] = "0123456789abcdef";
  std::array<std::array<char, 4>, 4096> table{};
  for (unsigned i = 0; i < table.size(); ++i) table[i] = {digits[i >> 8], digits[i >> 4 & 15], digits[i & 15], ' '};
  return table;
}

}  // namespace

constexpr std::array<std::array<char, 4>, 10000> kFourDigits = makeFourDigits();
constexpr std::array<std::array<char, 4>, 4096> kThreeHexDigits = makeThreeHexDigits();

char *writeHex(char *out, std::uint64_t value, unsigned minimum, bool upperCase) noexcept {
  const char *digits = upperCase ? "0123456789ABCDEF" : "0123456789abcdef";
  const auto needed = static_cast<unsigned>(std::bit_width(value) + 3) / 4;
  const unsigned count = needed > minimum ? needed : minimum;
  for (unsigned i = count; i-- > 0; value >>= 4) out[i] = digits[value & 15];
  return out + count;
}

char *writeFixed(char *out, double value, unsigned decimals) noexcept {
  const double magnitude = std::fabs(value);
  const bool six = decimals == 6;
  const double scaled = magnitude * (six ? 1e6 : 1e3);
  constexpr double kRounder = 0x1p52;  // from here on a double holds integers only, so adding it rounds to one
  if (scaled >= kRounder / 2 || static_cast<double>(static_cast<float>(magnitude)) != magnitude)
    return std::to_chars(out, out + kFixedRoom, magnitude, std::chars_format::fixed, static_cast<int>(decimals)).ptr;
  const auto units = static_cast<std::uint64_t>((scaled + kRounder) - kRounder);
  const auto one = six ? std::uint64_t{1'000'000} : std::uint64_t{1'000};
  out = writeDecimal(out, units / one);
  auto fraction = static_cast<std::uint32_t>(units % one);
  if (six) {
    *out = '.';
    out = writeFourDigits(out + 1, fraction / 100);
    fraction %= 100;
    std::memcpy(out, kFourDigits[fraction].data() + 2, 2);
    return out + 2;
  }
  writeFourDigits(out, fraction);  // its first digit is always 0, and where the point belongs
  *out = '.';
  return out + 4;
}

}  // namespace vesk
