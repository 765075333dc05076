// Black box summary, feature 0xE0.
#include "tests/Support.h"
#include "tests/reports/blackbox/ExpectedCatalogue.h"
#include "tests/reports/blackbox/OptionText.h"

namespace {

using namespace test;
using testing::ElementsAre;

Report summary() {
  return Report(0xE0, 7);
}

/// The line on which each module stands, by module index.
std::size_t lineOf(std::size_t module) {
  return 5 + static_cast<std::size_t>(std::find(kSummaryOrder.begin(), kSummaryOrder.end(), module) -
                                      kSummaryOrder.begin());
}

std::vector<Field> fields() {
  std::vector<Field> all = {
      {1,
       1,
       {{2, [](const Report &r) { return "Severity Level: " + levelName(r.u8(1) & 7); }}},
       {{"SEVERITY_LEVEL", keep<std::uint8_t>(1)}}},
      {2, 2, {{3, show("Module Count:   %i", 2, 2)}}, {{"MODULE_COUNT", keep<std::uint16_t>(2)}}},
  };
  for (std::size_t module = 0; module < 22; ++module) {
    const std::size_t at = 4 + module / 8;
    const auto bit = [=](const Report &r) { return r.u8(at) >> module % 8 & 1; };
    all.push_back({at,
                   1,
                   {{lineOf(module),
                     [=](const Report &r) { return printed("%20s: %i", kModules[module].name.c_str(), bit(r)); }}},
                   {{kModules[module].name, [=](const Report &r) { return bit(r) ? "u8 1" : "u8 0"; }}}});
  }
  return all;
}

TEST(BlackBoxSummary, AllZero) {
  EXPECT_THAT(decodeLines(summary()),
              ElementsAre("--Black Box Summary--", "Severity Level: TRACE", "Module Count:   0", "",  //
                          "           BLACK_BOX: 0", "                 PSE: 0", "     OPEN_SHORT_TEST: 0",
                          "         SCAN_LOGGER: 0", "            SVC_SMGR: 0", "           BLOB_LAFE: 0",
                          "           BLOB_LFCL: 0", "           BLOB_LPMp: 0", "           BLOB_LSPR: 0",
                          "           BLOB_LSSp: 0", "           BLOB_LSSC: 0", "           BLOB_LSRx: 0",
                          "           BLOB_LSPM: 0", "           BLOB_LRTC: 0", "       HIDSPI_MASTER: 0",
                          "        HIDSPI_SLAVE: 0", "                ALGS: 0", "                 SYS: 0",
                          "                 QOR: 0", "                 OTP: 0", "                PMGR: 0",
                          "           BLOB_LSFN: 0"));
  EXPECT_THAT(
      keysOf(decodeValue(summary())),
      testing::UnorderedElementsAre("SEVERITY_LEVEL", "MODULE_COUNT", "BLACK_BOX", "PSE", "OPEN_SHORT_TEST",
                                    "SCAN_LOGGER", "SVC_SMGR", "BLOB_LAFE", "BLOB_LFCL", "BLOB_LPMp", "BLOB_LSPR",
                                    "BLOB_LSSp", "BLOB_LSSC", "BLOB_LSRx", "BLOB_LSPM", "BLOB_LSFN", "BLOB_LRTC",
                                    "HIDSPI_MASTER", "HIDSPI_SLAVE", "ALGS", "SYS", "QOR", "OTP", "PMGR"));
  EXPECT_EQ(decodeValue(summary()).size(), 24u);
}

TEST(BlackBoxSummary, EveryOffset) {
  expectEveryOffset(0xE0, 7, fields(), false, {1, 2, 4, 8, 16, 32, 64, 128, 0x6D, 0xFF}, 2000);
}
TEST(BlackBoxSummary, NothingElseIsRead) {
  expectNothingElseIsRead(0xE0, 7);
}
TEST(BlackBoxSummary, EveryLength) {
  expectEveryLength(0xE0, 7);
}

TEST(BlackBoxSummary, Example) {
  const Report report = summary().text(1, std::string_view("\x0D\x05\x00\x21\x40\x24", 6));
  const Lines lines = decodeLines(report);
  ASSERT_EQ(lines.size(), 26u);
  EXPECT_EQ(lines[1], "Severity Level: CRITICAL");
  EXPECT_EQ(lines[2], "Module Count:   5");
  std::vector<std::string> set;
  for (const std::string &line : lines)
    if (line.ends_with(": 1")) set.push_back(line.substr(0, line.size() - 3));
  EXPECT_THAT(set, ElementsAre("           BLACK_BOX", "           BLOB_LAFE", "       HIDSPI_MASTER",
                               "        HIDSPI_SLAVE", "           BLOB_LSFN"));
  const ReportValue value = decodeValue(report);
  EXPECT_EQ(value.at("SEVERITY_LEVEL").as<std::uint8_t>(), 13);
  EXPECT_EQ(value.at("MODULE_COUNT").as<std::uint16_t>(), 5);
  for (const Module &module : kModules)
    EXPECT_EQ(value.at(module.name).as<std::uint8_t>(), module.name == "BLACK_BOX" || module.name == "BLOB_LAFE" ||
                                                            module.name == "HIDSPI_MASTER" ||
                                                            module.name == "HIDSPI_SLAVE" || module.name == "BLOB_LSFN")
        << module.name;
}

TEST(BlackBoxSummary, EverySeverity) {
  for (unsigned level = 0; level <= 0xFF; ++level) {
    const Report report = summary().u8(1, static_cast<std::uint8_t>(level));
    EXPECT_EQ(decodeLines(report)[1], "Severity Level: " + levelName(level % 8));
    EXPECT_EQ(decodeValue(report).at("SEVERITY_LEVEL").as<std::uint8_t>(), level);
  }
  EXPECT_EQ(decodeLines(summary().u8(1, 0xF8))[1], "Severity Level: TRACE");
  EXPECT_EQ(decodeLines(summary().u8(1, 6))[1], "Severity Level: UNKNOWN");
  EXPECT_EQ(decodeLines(summary().u8(1, 7))[1], "Severity Level: UNKNOWN");
}

TEST(BlackBoxSummary, TopBitsOfTheMaskNameNoModule) {
  EXPECT_EQ(decodeLines(summary().u8(6, 0xC0)), decodeLines(summary()));
  EXPECT_EQ(decodeLeaves(summary().u8(6, 0xC0)), decodeLeaves(summary()));
}

TEST(BlackBoxSummary, ModuleCountBoundsNothing) {
  for (const std::uint16_t count : {std::uint16_t{0}, std::uint16_t{1}, std::uint16_t{0xFFFF}}) {
    EXPECT_EQ(decodeLines(summary().u16(2, count)).size(), 26u);
    EXPECT_EQ(decodeLines(summary().u16(2, count))[2], "Module Count:   " + std::to_string(count));
    EXPECT_EQ(decodeValue(summary().u16(2, count)).size(), 24u);
  }
}

TEST(BlackBoxSummary, FormsAgree) {
  expectDifferences(
      0xE0, 7, {"severity masked on screen, whole as value"},
      [](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &seen) {
        const unsigned long severity = std::strtoul(digits(value.at("SEVERITY_LEVEL")).c_str(), nullptr, 10);
        EXPECT_EQ(behind(lines[1], ": "), levelName(severity & 7));
        if (behind(lines[1], ": ") != levelName(static_cast<unsigned>(severity)))
          seen.insert("severity masked on screen, whole as value");
        EXPECT_EQ(value.at("MODULE_COUNT"), "u16 " + behind(lines[2], "   "));
        for (std::size_t i = 4; i < 26; ++i) {
          const std::string name = lines[i].substr(lines[i].find_first_not_of(' '));
          EXPECT_EQ(value.at(name.substr(0, name.find(':'))), "u8 " + behind(name, ": "));
        }
      });
}

}  // namespace
