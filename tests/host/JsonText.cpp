// Strings and numbers of JSON.
#include "host/output/JsonText.h"

#include <gtest/gtest.h>

#include <bit>
#include <cstdlib>
#include <limits>
#include <random>

namespace {

using namespace vesk::host;

std::string string(std::string_view text) {
  OutputBuffer out;
  appendJsonString(out, text);
  return std::string(out.text());
}

std::string seconds(std::int64_t nanoseconds) {
  OutputBuffer out;
  appendSeconds(out, nanoseconds);
  return std::string(out.text());
}

template <class Number>
std::string number(Number value) {
  OutputBuffer out;
  appendNumber(out, value);
  return std::string(out.text());
}

TEST(JsonString, plainTextStandsAsItIs) {
  EXPECT_EQ(string(""), R"("")");
  EXPECT_EQ(string("vesk 1.2/3"), R"("vesk 1.2/3")");
  EXPECT_EQ(string("\x7F"), "\"\x7F\"");
  EXPECT_EQ(string("\xC3\xA4\xE2\x82\xAC\xF0\x9F\x98\x80"), "\"\xC3\xA4\xE2\x82\xAC\xF0\x9F\x98\x80\"");
}

TEST(JsonString, escapesQuotesBackslashesAndControls) {
  EXPECT_EQ(string(R"(a"b\c)"), R"("a\"b\\c")");
  EXPECT_EQ(string("\b\f\n\r\t"), R"("\b\f\n\r\t")");
  EXPECT_EQ(string(std::string_view("a\0b", 3)), R"("a\u0000b")");
  EXPECT_EQ(string("\x01\x1F"), R"("\u0001\u001f")");
  EXPECT_EQ(string("\x1B[31m"), R"("\u001b[31m")");
}

TEST(JsonString, bytesThatAreNoTextBecomeReplacementCharacters) {
  const std::string r = "\xEF\xBF\xBD";
  EXPECT_EQ(string("\xFF"), '"' + r + '"');
  EXPECT_EQ(string("a\x80z"), "\"a" + r + "z\"");
  EXPECT_EQ(string("\xC0\x80"), '"' + r + r + '"');          // overlong
  EXPECT_EQ(string("\xED\xA0\x80"), '"' + r + r + r + '"');  // a surrogate
  EXPECT_EQ(string("\xF4\x90\x80\x80"), '"' + r + r + r + r + '"');
  EXPECT_EQ(string("\xE2\x82"), '"' + r + r + '"');  // cut short
  EXPECT_EQ(string("\xFF\n\xC3\xA4"), '"' + r + "\\n\xC3\xA4\"");
}

TEST(JsonSeconds, areExactAndShort) {
  EXPECT_EQ(seconds(0), "0");
  EXPECT_EQ(seconds(7'000'000'000), "7");
  EXPECT_EQ(seconds(3'000'412'000), "3.000412");
  EXPECT_EQ(seconds(1), "0.000000001");
  EXPECT_EQ(seconds(100'000'000), "0.1");
  EXPECT_EQ(seconds(-500'000'000), "-0.5");
  EXPECT_EQ(seconds(1'290'272'185'081'322'000), "1290272185.081322");
  EXPECT_EQ(seconds(std::numeric_limits<std::int64_t>::max()), "9223372036.854775807");
  EXPECT_EQ(seconds(std::numeric_limits<std::int64_t>::min()), "-9223372036.854775808");
}

TEST(JsonNumber, integersHaveAllTheirDigits) {
  EXPECT_EQ(number(std::uint8_t{255}), "255");
  EXPECT_EQ(number(std::uint16_t{65535}), "65535");
  EXPECT_EQ(number(std::uint32_t{4294967295}), "4294967295");
  EXPECT_EQ(number(std::uint64_t{18446744073709551615u}), "18446744073709551615");
  EXPECT_EQ(number(std::numeric_limits<std::int32_t>::min()), "-2147483648");
  EXPECT_EQ(number(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
  EXPECT_EQ(number(std::int32_t{0}), "0");
}

TEST(JsonNumber, floatsHaveTheFewestDigitsOfSinglePrecision) {
  EXPECT_EQ(number(0.1f), "0.1");
  EXPECT_EQ(number(36.6f), "36.6");
  EXPECT_EQ(number(1.0f), "1");
  EXPECT_EQ(number(0.0f), "0");
  EXPECT_EQ(number(-0.0f), "-0.0");
  EXPECT_EQ(number(16777216.0f), "16777216");
  EXPECT_EQ(number(1e-45f), "1e-45");
  EXPECT_EQ(number(3.4028235e38f), "3.4028235e+38");
  EXPECT_EQ(number(1250999.875), "1250999.875");
  EXPECT_EQ(number(0.1), "0.1");
}

TEST(JsonNumber, anyFloatReadsBackToItself) {
  std::mt19937 random(1);
  for (int i = 0; i < 100'000; ++i) {
    const auto value = std::bit_cast<float>(static_cast<std::uint32_t>(random()));
    if (!std::isfinite(value)) continue;
    const std::string text = number(value);
    ASSERT_EQ(std::bit_cast<std::uint32_t>(std::strtof(text.c_str(), nullptr)), std::bit_cast<std::uint32_t>(value))
        << text;
  }
}

TEST(JsonNumber, whatIsNoNumberIsNull) {
  EXPECT_EQ(number(std::numeric_limits<float>::quiet_NaN()), "null");
  EXPECT_EQ(number(-std::numeric_limits<float>::infinity()), "null");
  EXPECT_EQ(number(std::numeric_limits<double>::infinity()), "null");
}

}  // namespace
