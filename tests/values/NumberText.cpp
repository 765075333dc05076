// Digits against the C library, and that nothing is touched beyond the room that a writer announces.
#include "values/NumberText.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>
#include <string>

#include "tests/Text.h"

namespace {

using test::printed;

/// What `write` writes; fails when it touches more than `room` bytes.
template <class Write>
std::string written(std::size_t room, Write write) {
  std::string memory(room + 8, '\x5A');
  char *const end = write(memory.data());
  EXPECT_EQ(memory.substr(room), std::string(8, '\x5A'));
  return memory.substr(0, static_cast<std::size_t>(end - memory.data()));
}
template <class Number>
std::string decimal(Number value) {
  return written(vesk::kNumberRoom, [=](char *out) { return vesk::writeDecimal(out, value); });
}

TEST(NumberText, FourDigits) {
  for (unsigned value = 0; value < 10000; ++value) {
    ASSERT_EQ(written(4, [=](char *out) { return vesk::writeFourDigits(out, value); }), printed("%04u", value));
    ASSERT_EQ(written(4, [=](char *out) { return vesk::writeUpToFourDigits(out, value); }), printed("%u", value));
  }
}

TEST(NumberText, DecimalsAroundEveryPowerOfTenAndTwo) {
  const auto check = [](std::uint64_t v) {
    const auto low = static_cast<std::uint32_t>(v);
    ASSERT_EQ(decimal(v), std::to_string(v));
    ASSERT_EQ(decimal(static_cast<std::int64_t>(v)), std::to_string(static_cast<std::int64_t>(v)));
    ASSERT_EQ(decimal(low), std::to_string(low));
    ASSERT_EQ(decimal(static_cast<std::int32_t>(low)), std::to_string(static_cast<std::int32_t>(low)));
  };
  for (int near = -3; near <= 3; ++near) {
    const auto offset = static_cast<std::uint64_t>(near);
    std::uint64_t ten = 1;
    for (int i = 0; i < 20; ++i, ten *= 10) check(ten + offset);
    for (int bit = 0; bit < 64; ++bit) check((std::uint64_t{1} << bit) + offset);
  }
}

TEST(NumberText, RandomDecimals) {
  std::mt19937_64 random(1);
  for (int i = 0; i < 100000; ++i) {
    const std::uint64_t v = random() >> random() % 64;
    ASSERT_EQ(decimal(v), std::to_string(v));
    ASSERT_EQ(decimal(static_cast<std::uint32_t>(v)), std::to_string(static_cast<std::uint32_t>(v)));
    ASSERT_EQ(decimal(static_cast<std::int32_t>(v)), std::to_string(static_cast<std::int32_t>(v)));
    ASSERT_EQ(decimal(-static_cast<std::int64_t>(v >> 1)), std::to_string(-static_cast<std::int64_t>(v >> 1)));
  }
}

TEST(NumberText, AlignedDecimals) {
  std::mt19937 random(4);
  const auto check = [](std::uint32_t v) {
    const auto s = static_cast<std::int32_t>(v);
    const std::uint32_t magnitude = s < 0 ? 0u - v : v;
    ASSERT_EQ(written(14, [=](char *out) { return vesk::writeAlignedDecimal<14>(out, s < 0, magnitude); }),
              printed("%14d", s));
    ASSERT_EQ(written(12, [=](char *out) { return vesk::writeAlignedDecimal<12>(out, false, v); }), printed("%12u", v));
  };
  for (std::uint64_t ten = 1; ten <= 10'000'000'000; ten *= 10)
    for (std::uint64_t near = 0; near < 5; ++near) {
      check(static_cast<std::uint32_t>(ten + near - 2));
      check(static_cast<std::uint32_t>(near - 2 - ten));
    }
  for (std::uint32_t value = 0; value < 20000; ++value) check(value), check(0u - value), check(0x80000000u + value);
  for (int i = 0; i < 100000; ++i) check(static_cast<std::uint32_t>(random() >> random() % 32));
}

TEST(NumberText, Hex8) {
  std::mt19937 random(2);
  const auto check = [](std::uint32_t v) {
    ASSERT_EQ(written(9, [=](char *out) { return vesk::writeHex8(out, v); }), printed("%08x", v));
  };
  for (std::uint32_t half = 0; half < 0x10000; ++half) check(half), check(half << 16), check(half << 8);
  for (int i = 0; i < 100000; ++i) check(static_cast<std::uint32_t>(random()));
}

TEST(NumberText, HexOfEveryMinimum) {
  std::mt19937_64 random(3);
  for (int i = 0; i < 20000; ++i) {
    const unsigned long long v = i == 0 ? 0 : random() >> random() % 64;
    const int minimum = static_cast<int>(random() % 16) + 1;
    const auto hex = [&](bool upper) {
      return written(vesk::kNumberRoom,
                     [=](char *out) { return vesk::writeHex(out, v, static_cast<unsigned>(minimum), upper); });
    };
    ASSERT_EQ(hex(false), printed("%0*llx", minimum, v));
    ASSERT_EQ(hex(true), printed("%0*llX", minimum, v));
  }
}

void expectFixed(double value) {
  ASSERT_EQ(written(vesk::kFixedRoom, [=](char *out) { return vesk::writeFixed<3>(out, value); }),
            printed("%.3f", std::fabs(value)))
      << printed("%a", value);
  ASSERT_EQ(written(vesk::kFixedRoom, [=](char *out) { return vesk::writeFixed<6>(out, value); }),
            printed("%.6f", std::fabs(value)))
      << printed("%a", value);
}

TEST(NumberText, FixedAtTiesAndEdges) {
  for (const double value : {0.0,
                             -0.0,
                             0.0005,
                             0.0015,
                             0.0025,
                             2.5e-3,
                             0.0000005,
                             0.0000015,
                             0.5,
                             0.9995,
                             0.99949999,
                             999.9995,
                             9999.9996,
                             10000.0,
                             10000.5,
                             0.9999995,
                             1e15,
                             1e16,
                             1e22,
                             1e23,
                             1e300,
                             4503599627370.496,
                             2251799813685.2475})
    expectFixed(value), expectFixed(-value);
  using Double = std::numeric_limits<double>;
  using Float = std::numeric_limits<float>;
  for (const double value : {Double::min(), Double::denorm_min(), Double::max(), double{Float::min()},
                             double{Float::denorm_min()}, double{Float::max()}})
    expectFixed(value), expectFixed(-value);
  for (int exponent = -1074; exponent < 1024; ++exponent) {
    const double power = std::ldexp(1.0, exponent);
    for (const double value : {power, std::nextafter(power, 0), std::nextafter(power, Double::max()), power * 1.5})
      expectFixed(value);
  }
}

/// Sixteenths, 32nds ... are exact in binary, so that many of them are true ties in the last decimal.
TEST(NumberText, FixedTies) {
  for (int bits = 1; bits <= 12; ++bits)
    for (int numerator = 1; numerator < 5000; numerator += 2) expectFixed(std::ldexp(numerator, -bits));
}

TEST(NumberText, FixedWhereTheShortWayEnds) {
  for (const double limit : {0x1p51 / 1e3, 0x1p51 / 1e6, 0x1p52 / 1e3, 0x1p52 / 1e6, 0x1p53 / 1e3, 0x1p53 / 1e6}) {
    auto value = static_cast<float>(limit);
    for (int i = 0; i < 50; ++i) value = std::nextafter(value, 0.0f);
    for (int i = 0; i < 100; ++i, value = std::nextafter(value, std::numeric_limits<float>::max()))
      expectFixed(double{value});
  }
}

}  // namespace
