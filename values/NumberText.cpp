// The digit tables, and the number forms that are not worth inlining.
#include "values/NumberText.h"

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
  std::array<char, 4 * 4096> table{};
  for (unsigned i = 0; i < 4096; ++i) {
    table[4 * i] = digits[i >> 8];
    table[4 * i + 1] = digits[i >> 4 & 15];
    table[4 * i + 2] = digits[i & 15];
    table[4 * i + 3] = ' ';
  }
  return table;
}

}  // namespace

constexpr std::array<std::array<char, 4>, 10000> kFourDigits = makeFourDigits();
constexpr std::array<char, 4 * 4096> kThreeHexDigits = makeThreeHexDigits();

char *writeHex(char *out, std::uint64_t value, unsigned minimum, bool upperCase) noexcept {
  const char *digits = upperCase ? "0123456789ABCDEF" : "0123456789abcdef";
  const auto needed = static_cast<unsigned>(std::bit_width(value) + 3) / 4;
  const unsigned count = needed > minimum ? needed : minimum;
  for (unsigned i = count; i-- > 0; value >>= 4) out[i] = digits[value & 15];
  return out + count;
}

}  // namespace vesk
