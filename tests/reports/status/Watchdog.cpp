// Watchdog, feature 0xDF.
#include <bit>
#include <cstdlib>

#include "tests/Support.h"

namespace {

using namespace test;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

Report watchdog() {
  return Report(0xDF, 25);
}

/// In single precision throughout; the constant is the float nearest to a millionth.
double wallclock(std::uint64_t timestamp) {
  volatile float ticks = static_cast<float>(timestamp);
  volatile float seconds = ticks * std::bit_cast<float>(0x358637BDu);
  return double{seconds};
}

std::vector<Field> fields() {
  return {
      {1, 4, {{2, show("    Feed Count:%u", 1, 4)}}, {{"Count", keep<std::uint32_t>(1)}}},
      {5,
       8,
       {{3, show("Feed Timestamp:0x%016llX", 5, 8)},
        {4, [](const Report &r) { return printed("Feed Wallclock:%15.3f", wallclock(r.number(5, 8))); }}},
       {{"Timestamp", keep<std::int64_t>(5)},
        {"Wallclock", [](const Report &r) { return leaf(wallclock(r.number(5, 8))); }}}},
      {13, 4, {{5, show("      Register:0x%08X", 13, 4)}}, {{"Register", keep<std::uint32_t>(13)}}},
      {17, 4, {{6, show("          Wake:%u", 17, 4)}}, {{"Wake", keep<std::uint32_t>(17)}}},
      {21, 4, {{7, show("         Sleep:%u", 21, 4)}}, {{"Idle", keep<std::uint32_t>(21)}}},
  };
}

TEST(Watchdog, AllZero) {
  EXPECT_THAT(decodeLines(watchdog()),
              ElementsAre("Watchdog Data:", "    Feed Count:0", "Feed Timestamp:0x0000000000000000",
                          "Feed Wallclock:          0.000", "      Register:0x00000000", "          Wake:0",
                          "         Sleep:0"));
  EXPECT_THAT(keysOf(decodeValue(watchdog())),
              UnorderedElementsAre("Count", "Timestamp", "Wallclock", "Register", "Wake", "Idle"));
}

TEST(Watchdog, EveryOffset) {
  expectEveryOffset(0xDF, 25, fields(), false, {0x01, 0x80, 0x6D, 0xFF}, 3000);
}
TEST(Watchdog, NothingElseIsRead) {
  expectNothingElseIsRead(0xDF, 25);
}
TEST(Watchdog, EveryLength) {
  expectEveryLength(0xDF, 25);
}

TEST(Watchdog, WallclockIsSinglePrecision) {
  struct {
    std::uint64_t timestamp;
    const char *line;
    double value;
  } const rows[] = {
      {0, "Feed Wallclock:          0.000", 0},
      {100000000, "Feed Wallclock:        100.000", 100},
      {1250999896491, "Feed Wallclock:    1250999.875", 1250999.875},
      {0x123456789AB, "Feed Wallclock:    1250999.875", 1250999.875},
      {0xFFFFFFFFFFFFFFFF, "Feed Wallclock:18446744027136.000", 18446744027136.0},
  };
  for (const auto &row : rows) {
    EXPECT_EQ(decodeLines(watchdog().u64(5, row.timestamp))[3], row.line);
    EXPECT_EQ(decodeValue(watchdog().u64(5, row.timestamp)).at("Wallclock").as<double>(), row.value);
  }
}

TEST(Watchdog, TimestampIsUnsignedOnScreenAndSignedAsAValue) {
  const Report report = watchdog().u64(5, 0xFFFFFFFFFFFFFFFF);
  EXPECT_EQ(decodeLines(report)[2], "Feed Timestamp:0xFFFFFFFFFFFFFFFF");
  EXPECT_EQ(decodeValue(report).at("Timestamp").as<std::int64_t>(), -1);
  EXPECT_EQ(decodeValue(watchdog().u64(5, std::uint64_t{1} << 63)).at("Timestamp").as<std::int64_t>(),
            std::numeric_limits<std::int64_t>::min());
}

TEST(Watchdog, Examples) {
  EXPECT_EQ(decodeLines(watchdog().u32(13, 0xABC))[4], "      Register:0x00000ABC");
  EXPECT_EQ(decodeLines(watchdog().u32(1, 4294967295))[1], "    Feed Count:4294967295");
  EXPECT_EQ(decodeLines(watchdog().u32(21, 9))[6], "         Sleep:9");
  EXPECT_EQ(decodeValue(watchdog().u32(21, 9)).at("Idle").as<std::uint32_t>(), 9u);
}

TEST(Watchdog, FormsAgree) {
  expectDifferences(
      0xDF, 25,
      {"Sleep on screen, Idle as value", "timestamp unsigned on screen, signed as value",
       "wallclock to three decimals on screen"},
      [](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &seen) {
        const auto number = [&](std::size_t line, int base) {
          return std::strtoull(behind(lines[line], ":").c_str(), nullptr, base);
        };
        EXPECT_EQ(value.at("Count"), "u32 " + std::to_string(number(1, 10)));
        EXPECT_EQ(value.at("Register"), "u32 " + std::to_string(number(4, 16)));
        EXPECT_EQ(value.at("Wake"), "u32 " + std::to_string(number(5, 10)));
        if (!value.contains("Sleep") && lines[6].find("Sleep") != std::string::npos &&
            value.at("Idle") == "u32 " + std::to_string(number(6, 10)))
          seen.insert("Sleep on screen, Idle as value");
        const std::uint64_t timestamp = number(2, 16);
        EXPECT_EQ(value.at("Timestamp"), leaf(static_cast<std::int64_t>(timestamp)));
        if (value.at("Timestamp") != "i64 " + std::to_string(timestamp))
          seen.insert("timestamp unsigned on screen, signed as value");
        EXPECT_EQ(value.at("Wallclock"), leaf(wallclock(timestamp)));
        if (leaf(std::strtod(behind(lines[3], ":").c_str(), nullptr)) != value.at("Wallclock"))
          seen.insert("wallclock to three decimals on screen");
      });
}

}  // namespace
