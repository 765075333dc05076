// Power mode statistics, feature 0xA9.
#include "tests/Support.h"

namespace {

using namespace test;
using testing::ElementsAre;

struct Mode {
  std::size_t timeAt, countAt;
  const char *timeLine, *countLine;
  const char *timeKey, *countKey;
};
const Mode kModes[] = {
    {1, 5, "INIT                : %12u ms", "INIT                : %u", "INIT time ms", "INIT times entered"},
    {9, 13, "ACTIVE              : %12u ms", "ACTIVE              : %u", "ACTIVE time ms", "ACTIVE times entered"},
    {17, 21, "TIMEOUT             : %12u ms", "TIMEOUT             : %u", "TIMEOUT time ms", "TIMEOUT times entered"},
    {25, 29, "READY               : %12u ms", "READY               : %u", "READY time ms", "READY times entered"},
    {33, 37, "LIGHT_SLEEP_EXITING : %12u ms", "LIGHT_SLEEP_EXITING : %u", "LIGHT_SLEEP_EXITING time ms",
     "LIGHT_SLEEP_EXITING times entered"},
    {41, 45, "LIGHT_SLEEP         : %12u ms", "LIGHT_SLEEP         : %u", "LIGHT_SLEEP time ms",
     "LIGHT_SLEEP times entered"},
};

std::vector<Field> fields() {
  std::vector<Field> all;
  for (std::size_t m = 0; m < 6; ++m) {
    const Mode &mode = kModes[m];
    all.push_back({mode.timeAt,
                   4,
                   {{2 + m, show(mode.timeLine, mode.timeAt, 4)}},
                   {{mode.timeKey, keep<std::uint32_t>(mode.timeAt)}}});
    all.push_back({mode.countAt,
                   4,
                   {{10 + m, show(mode.countLine, mode.countAt, 4)}},
                   {{mode.countKey, keep<std::uint32_t>(mode.countAt)}}});
  }
  return all;
}

TEST(PowerModes, AllZero) {
  EXPECT_THAT(decodeLines(Report(0xA9, 49)),
              ElementsAre("Power Mode Statistics - Total Time:",               //
                          "INIT                :            0 ms",             //
                          "ACTIVE              :            0 ms",             //
                          "TIMEOUT             :            0 ms",             //
                          "READY               :            0 ms",             //
                          "LIGHT_SLEEP_EXITING :            0 ms",             //
                          "LIGHT_SLEEP         :            0 ms",             //
                          "",                                                  //
                          "Power Mode Statistics - Number of Times Entered:",  //
                          "INIT                : 0",                           //
                          "ACTIVE              : 0",                           //
                          "TIMEOUT             : 0",                           //
                          "READY               : 0",                           //
                          "LIGHT_SLEEP_EXITING : 0",                           //
                          "LIGHT_SLEEP         : 0"));
  std::vector<std::string> keys;
  for (const Mode &mode : kModes) keys.insert(keys.end(), {mode.timeKey, mode.countKey});
  EXPECT_THAT(keysOf(decodeValue(Report(0xA9, 49))), testing::UnorderedElementsAreArray(keys));
}

TEST(PowerModes, EveryOffset) {
  expectEveryOffset(0xA9, 49, fields());
}
TEST(PowerModes, NothingElseIsRead) {
  expectNothingElseIsRead(0xA9, 49);
}
TEST(PowerModes, EveryLength) {
  expectEveryLength(0xA9, 49);
}

TEST(PowerModes, NumbersAreUnsigned) {
  const Lines lines = decodeLines(Report(0xA9, 49).u32(1, 4294967295).u32(5, 4294967295).u32(29, 7));
  EXPECT_EQ(lines[1], "INIT                :   4294967295 ms");
  EXPECT_EQ(lines[9], "INIT                : 4294967295");
  EXPECT_EQ(lines[12], "READY               : 7");
}

TEST(PowerModes, TimesAndCountsAreInterleaved) {
  Report report(0xA9, 49);
  for (const Mode &mode : kModes) report.u32(mode.timeAt, 1).u32(mode.countAt, 2);
  const ReportValue value = decodeValue(report);
  EXPECT_EQ(value.size(), 12u);
  for (const Mode &mode : kModes) {
    EXPECT_EQ(value.at(mode.timeKey).as<std::uint32_t>(), 1u);
    EXPECT_EQ(value.at(mode.countKey).as<std::uint32_t>(), 2u);
  }
}

TEST(PowerModes, FormsAgree) {
  expectDifferences(0xA9, 49, {},
                    [](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &) {
                      for (std::size_t m = 0; m < 6; ++m) {
                        const std::string name = lines[1 + m].substr(0, lines[1 + m].find(' '));
                        const auto number = [](const std::string &line) {
                          return "u32 " + std::to_string(std::strtoul(behind(line, ": ").c_str(), nullptr, 10));
                        };
                        EXPECT_EQ(value.at(name + " time ms"), number(lines[1 + m]));
                        EXPECT_EQ(value.at(name + " times entered"), number(lines[9 + m]));
                      }
                    });
}

}  // namespace
