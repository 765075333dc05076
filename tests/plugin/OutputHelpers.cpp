// Number arrays in both forms, and what printStrings writes to the real standard output.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <bit>
#include <cstdio>
#include <cstring>
#include <limits>
#include <random>

#include "plugin/HIDReportVeskPlugin.h"
#include "tests/CaptureStdout.h"
#include "tests/Text.h"

namespace {

using test::captureStdout;
using test::printed;
using testing::ElementsAre;

std::vector<std::string> all(const DisplayLines &lines) {
  return {lines.begin(), lines.end()};
}

class OutputHelpers : public testing::Test {
 protected:
  std::unique_ptr<HIDReportVeskPlugin> plugin = HIDReportVeskPlugin::init();

  std::vector<std::string> uint32Lines(const std::vector<std::uint32_t> &values, const char *format) {
    DisplayLines lines;
    plugin->addArrayUint32(lines, values.data(), static_cast<std::uint32_t>(values.size()), format);
    return all(lines);
  }
  std::vector<std::string> int32Lines(const std::vector<std::int32_t> &values, const char *format) {
    DisplayLines lines;
    plugin->addArrayInt32(lines, values.data(), static_cast<std::uint32_t>(values.size()), format);
    return all(lines);
  }
  std::vector<std::string> floatLines(const std::vector<float> &values, const char *format) {
    DisplayLines lines;
    plugin->addArrayFloat(lines, values.data(), static_cast<std::uint32_t>(values.size()), format);
    return all(lines);
  }
};

TEST_F(OutputHelpers, NineValuesMakeTwoLines) {
  EXPECT_THAT(uint32Lines({0, 1, 2, 3, 4, 5, 6, 7, 8}, "%08x "),
              ElementsAre("00000000 00000001 00000002 00000003 00000004 00000005 00000006 00000007 ", "00000008 "));
}

TEST_F(OutputHelpers, CountOfLines) {
  const std::size_t wanted[] = {1, 1, 1, 1, 1, 1, 1, 1, 1, 2, 2, 2, 2, 2, 2, 2, 2, 3};
  for (std::size_t count = 0; count < std::size(wanted); ++count) {
    const auto lines = uint32Lines(std::vector<std::uint32_t>(count, 5), "%08x ");
    EXPECT_EQ(lines.size(), wanted[count]) << count;
    EXPECT_EQ(lines.back().size(), count == 0 ? 0 : 9 * ((count - 1) % 8 + 1)) << count;
    EXPECT_EQ(int32Lines(std::vector<std::int32_t>(count, 5), "%08x "), lines);
    EXPECT_EQ(floatLines(std::vector<float>(count, 5), "% -13.3f ").size(), wanted[count]);
  }
}

TEST_F(OutputHelpers, NoValuesMakeOneEmptyLine) {
  EXPECT_THAT(uint32Lines({}, "%14d "), ElementsAre(""));
  EXPECT_THAT(int32Lines({}, "%08x "), ElementsAre(""));
  EXPECT_THAT(floatLines({}, "% -13.3f "), ElementsAre(""));
  EXPECT_THAT(uint32Lines({}, "<%u>"), ElementsAre(""));
}

TEST_F(OutputHelpers, SignOfWords) {
  EXPECT_THAT(uint32Lines({0xFFFFFFFF}, "%14d "), ElementsAre("            -1 "));  // 12 blanks and "-1" are 14 columns
  EXPECT_THAT(uint32Lines({0xFFFFFFFF}, "%08x "), ElementsAre("ffffffff "));
  EXPECT_THAT(uint32Lines({0x80000000, 0x7FFFFFFF}, "%14d "), ElementsAre("   -2147483648     2147483647 "));
  EXPECT_THAT(int32Lines({-1, 1}, "%14d "), ElementsAre("            -1              1 "));
  EXPECT_THAT(int32Lines({-1, 1}, "%08x "), ElementsAre("ffffffff 00000001 "));
}

TEST_F(OutputHelpers, Floats) {
  EXPECT_THAT(floatLines({1.5f, -1.5f}, "% -13.3f "), ElementsAre(" 1.500        -1.500        "));
  EXPECT_THAT(floatLines({1.0f}, "% -13.3f "), ElementsAre(" 1.000        "));
  EXPECT_THAT(floatLines({-2.5f}, "% -13.3f "), ElementsAre("-2.500        "));
  const float infinity = std::numeric_limits<float>::infinity(), nan = std::numeric_limits<float>::quiet_NaN();
  EXPECT_THAT(floatLines({infinity, -infinity, nan, -nan, -0.0f}, "% -13.3f "),
              ElementsAre(" inf          -inf           nan          -nan          -0.000        "));
  EXPECT_THAT(floatLines({-std::numeric_limits<float>::max()}, "% -13.3f "),
              ElementsAre("-340282346638528859811704183484516925440.000 "));  // longer than its column, and whole
}

TEST_F(OutputHelpers, FormatsOfTheCallerGoThroughTheCLibrary) {
  EXPECT_THAT(uint32Lines({1, 0xFFFFFFFF}, "<%u>"), ElementsAre("<1><4294967295>"));
  EXPECT_THAT(int32Lines({-1, 70000}, "%+d|"), ElementsAre("-1|+70000|"));
  EXPECT_THAT(floatLines({1.5f, 1e20f}, "%.1f;"), ElementsAre("1.5;100000002004087734272.0;"));
  EXPECT_THAT(uint32Lines(std::vector<std::uint32_t>(9, 3), "%i"), ElementsAre("33333333", "3"));
  EXPECT_THAT(uint32Lines({1, 2}, "-"), ElementsAre("--"));
  EXPECT_THAT(uint32Lines({1, 2}, ""), ElementsAre(""));
}

TEST_F(OutputHelpers, FormatsThatResembleTheUsualOnes) {
  EXPECT_THAT(uint32Lines({10, 11}, "%08x |"), ElementsAre("0000000a |0000000b |"));
  EXPECT_THAT(uint32Lines({10}, "%08x"), ElementsAre("0000000a"));
  EXPECT_THAT(uint32Lines({10}, "%08x x"), ElementsAre("0000000a x"));
  EXPECT_THAT(int32Lines({-1}, "%14d  "), ElementsAre("            -1  "));
  EXPECT_THAT(floatLines({1.5f}, "% -13.3f|"), ElementsAre(" 1.500       |"));
  EXPECT_THAT(uint32Lines({10}, "-----"), ElementsAre("-----"));  // as long, and another at every character
  EXPECT_THAT(int32Lines({10}, "%14d-"), ElementsAre("            10-"));
}

TEST_F(OutputHelpers, RandomValuesAtOddAddressesLikePrintf) {
  std::mt19937 random(5);
  for (int round = 0; round < 2000; ++round) {
    const auto count = static_cast<std::uint32_t>(random() % 20 + 1);
    std::vector<char> memory(4 * count + 1);
    for (char &byte : memory) byte = static_cast<char>(random());
    const char *data = memory.data() + 1;
    std::vector<std::string> words[4];
    for (std::uint32_t i = 0; i < count; ++i) {
      std::uint32_t bits = 0;
      std::memcpy(&bits, data + 4 * i, 4);
      const std::string texts[] = {printed("%08x ", bits), printed("%14d ", static_cast<std::int32_t>(bits)),
                                   printed("% -13.3f ", double{std::bit_cast<float>(bits)}), printed("%11u,", bits)};
      for (std::size_t k = 0; k < 4; ++k) {
        if (i % 8 == 0) words[k].emplace_back();
        words[k].back() += texts[k];
      }
    }
    DisplayLines hex, decimal, floats, other, signedHex, signedDecimal;
    plugin->addArrayUint32(hex, data, count, "%08x ");
    plugin->addArrayUint32(decimal, data, count, "%14d ");
    plugin->addArrayFloat(floats, data, count, "% -13.3f ");
    plugin->addArrayUint32(other, data, count, "%11u,");
    plugin->addArrayInt32(signedHex, data, count, "%08x ");
    plugin->addArrayInt32(signedDecimal, data, count, "%14d ");
    ASSERT_EQ(all(hex), words[0]);
    ASSERT_EQ(all(decimal), words[1]);
    ASSERT_EQ(all(floats), words[2]);
    ASSERT_EQ(all(other), words[3]);
    ASSERT_EQ(all(signedHex), words[0]);
    ASSERT_EQ(all(signedDecimal), words[1]);
  }
}

TEST_F(OutputHelpers, ArraysAppendToWhatIsThere) {
  DisplayLines lines;
  lines.add("title");
  const std::uint32_t values[] = {1};
  plugin->addArrayUint32(lines, values, 1, "%08x ");
  EXPECT_THAT(all(lines), ElementsAre("title", "00000001 "));
}

TEST_F(OutputHelpers, NeitherFlagIsLookedAt) {
  for (const bool flag : {false, true}) {
    plugin->setDisplayDecimal(flag);
    plugin->setUseStrings(!flag);
    EXPECT_THAT(uint32Lines({10}, "%08x "), ElementsAre("0000000a "));
    EXPECT_THAT(uint32Lines({10}, "%14d "), ElementsAre("            10 "));
    EXPECT_EQ(plugin->arrayWithUint32Array("\x0A\0\0", 1).as<std::vector<std::uint32_t>>(),
              std::vector<std::uint32_t>{10});
  }
}

TEST_F(OutputHelpers, ArraysAsValues) {
  const unsigned char bytes[] = {0xEE, 0xFF, 0xFF, 0xFF, 0xFF, 1, 0, 0, 0x80, 1, 0, 0xA0, 0x7F};
  const void *odd = bytes + 1;
  EXPECT_THAT(plugin->arrayWithUint32Array(odd, 2).as<std::vector<std::uint32_t>>(),
              ElementsAre(0xFFFFFFFFu, 0x80000001u));
  EXPECT_THAT(plugin->arrayWithInt32Array(odd, 2).as<std::vector<std::int32_t>>(), ElementsAre(-1, -2147483647));
  const ReportValue floats = plugin->arrayWithFloatArray(odd, 3);
  EXPECT_EQ(std::bit_cast<std::uint32_t>(floats.as<std::vector<float>>()[0]), 0xFFFFFFFFu);
  EXPECT_EQ(std::bit_cast<std::uint32_t>(floats.as<std::vector<float>>()[2]),
            0x7FA00001u);  // a signalling NaN stays one
  EXPECT_EQ(plugin->arrayWithUint32Array(odd, 0).as<std::vector<std::uint32_t>>().size(), 0u);
  EXPECT_EQ(plugin->arrayWithInt32Array(odd, 0).as<std::vector<std::int32_t>>().size(), 0u);
  EXPECT_EQ(plugin->arrayWithFloatArray(odd, 0).as<std::vector<float>>().size(), 0u);
}

TEST_F(OutputHelpers, PrintStrings) {
  DisplayLines none, some;
  some.add("first");
  some.add("");
  some.add("third \xC3\xA4 ");
  bool result = true;
  EXPECT_EQ(captureStdout([&] { result = plugin->printStrings(nullptr); }), "");
  EXPECT_FALSE(result);
  EXPECT_EQ(captureStdout([&] { result = plugin->printStrings(&none); }), "\n\n");
  EXPECT_TRUE(result);
  result = false;
  EXPECT_EQ(captureStdout([&] { result = plugin->printStrings(&some); }), "\nfirst\n\nthird \xC3\xA4 \n\n");
  EXPECT_TRUE(result);
}

TEST_F(OutputHelpers, PrintStringsKeepsTheHostsOwnOrder) {
  DisplayLines lines;
  lines.add("line");
  EXPECT_EQ(captureStdout([&] {
              std::fputs("before|", stdout);
              plugin->printStrings(&lines);
              std::fputs("|after", stdout);
            }),
            "before|\nline\n\n|after");
}

}  // namespace
