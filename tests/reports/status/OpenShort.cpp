// Open/short test: fault masks (feature 0xE3), data (features 0xE4 and 0xE5).
#include "tests/Support.h"

namespace {

using namespace test;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

using ValueMap = std::map<std::string, std::string>;

/// A mask drawn the slow way: bit by bit, each put in front of what is there already.
std::string drawn(std::uint64_t mask) {
  std::string text;
  for (int i = 1; i <= 48; ++i, mask >>= 1) {
    text.insert(0, mask & 1 ? "X" : ".");
    if (i % 8 == 0) text.insert(0, " ");
  }
  return text;
}

const std::string kNoBits = " ........ ........ ........ ........ ........ ........";
const std::string kAllBits = " XXXXXXXX XXXXXXXX XXXXXXXX XXXXXXXX XXXXXXXX XXXXXXXX";

struct Row {
  std::size_t offset;
  const char *label;
  const char *key;
};
const Row kRows[] = {
    {1, "\tShort TX+ ", "SHORT_TX_POS"}, {9, "\tShort TX- ", "SHORT_TX_NEG"}, {17, "\tShort BOTH", "SHORT_BOTH"},
    {25, "\tOpen  TX+ ", "OPEN_TX_POS"}, {33, "\tOpen  TX- ", "OPEN_TX_NEG"}, {41, "\tOpen  BOTH", "OPEN_BOTH"},
    {49, "\tWeak  O/S ", "WEAK_OS"},
};

TEST(FaultMask, Lines) {
  const auto plugin = HIDReportVeskPlugin::init();
  EXPECT_EQ(plugin->printOSTResult("\tShort TX+ ", std::uint64_t{1} | std::uint64_t{1} << 40 | std::uint64_t{1} << 47),
            "\tShort TX+   X......X ........ ........ ........ ........ .......X");
  EXPECT_EQ(plugin->printOSTResult("", 0), " " + kNoBits);
  EXPECT_EQ(plugin->printOSTResult("x", ~std::uint64_t{0}), "x " + kAllBits);
  EXPECT_EQ(plugin->printOSTResult("x", std::uint64_t{1} << 48), "x " + kNoBits);
  EXPECT_EQ(plugin->printOSTResult(std::string(300, 'l').c_str(), 0), std::string(300, 'l') + " " + kNoBits);
}

TEST(FaultMask, EverySingleBit) {
  const auto plugin = HIDReportVeskPlugin::init();
  for (std::size_t bit = 0; bit < 64; ++bit) {
    std::string wanted = kNoBits;
    if (bit < 48) wanted[53 - bit - bit / 8] = 'X';
    EXPECT_EQ(plugin->printOSTResult("L", std::uint64_t{1} << bit), "L " + wanted) << bit;
    EXPECT_EQ(wanted, drawn(std::uint64_t{1} << bit));
  }
}

TEST(FaultMask, RandomMasks) {
  const auto plugin = HIDReportVeskPlugin::init();
  std::mt19937_64 random(1);
  for (int i = 0; i < 5000; ++i) {
    const std::uint64_t mask = random();
    ASSERT_EQ(plugin->printOSTResult("ADC Saturation ", mask), "ADC Saturation  " + drawn(mask));
  }
}

std::vector<Field> testFields() {
  std::vector<Field> all;
  for (std::size_t i = 0; i < std::size(kRows); ++i) {
    const Row row = kRows[i];
    all.push_back({row.offset,
                   8,
                   {{4 + i, [row](const Report &r) { return row.label + (" " + drawn(r.number(row.offset, 8))); }}},
                   {{row.key, keep<std::uint64_t>(row.offset)}}});
  }
  return all;
}

TEST(OpenShortTest, AllZero) {
  Lines wanted = {"Open/Short Test Results:", "",
                  "\t" + std::string(18, ' ') + "40" + std::string(7, ' ') + "32" + std::string(7, ' ') + "24" +
                      std::string(7, ' ') + "16" + std::string(8, ' ') + "8" + std::string(8, ' ') + "0"};
  for (const Row &row : kRows) wanted.push_back(std::string(row.label) + " " + kNoBits);
  EXPECT_EQ(wanted.size(), 10u);
  EXPECT_EQ(decodeLines(Report(0xE3, 57)), wanted);
  EXPECT_THAT(keysOf(decodeValue(Report(0xE3, 57))),
              UnorderedElementsAre("SHORT_TX_POS", "SHORT_TX_NEG", "SHORT_BOTH", "OPEN_TX_POS", "OPEN_TX_NEG",
                                   "OPEN_BOTH", "WEAK_OS"));
}

/// The last digit of each number of a ruler stands over the lowest bit of its group.
TEST(OpenShortTest, RulersStandOverTheirBits) {
  const Lines results = decodeLines(Report(0xE3, 57).u64(1, 0x010101010101));
  const Lines data = decodeLines(Report(0xE4, 401).u64(1, 0x010101010101));
  for (const auto &[ruler, mask] : {std::pair{results[2], results[3]}, {data[2], data[3]}})
    for (std::size_t i = 0; i < mask.size(); ++i) {
      const bool endsANumber = i < ruler.size() && ruler[i] >= '0' && (i + 1 == ruler.size() || ruler[i + 1] == ' ');
      if (i >= 16) {
        EXPECT_EQ(mask[i] == 'X', endsANumber) << i;
      }
    }
}

TEST(OpenShortTest, EveryOffset) {
  expectEveryOffset(0xE3, 57, testFields());
}
TEST(OpenShortTest, NothingElseIsRead) {
  expectNothingElseIsRead(0xE3, 57);
}
TEST(OpenShortTest, EveryLength) {
  expectEveryLength(0xE3, 57);
}

TEST(OpenShortTest, AllOnesAreWholeAsAValue) {
  Report report(0xE3, 57);
  for (const Row &row : kRows) report.u64(row.offset, ~std::uint64_t{0});
  for (std::size_t i = 0; i < 7; ++i)
    EXPECT_EQ(decodeLines(report)[3 + i], std::string(kRows[i].label) + " " + kAllBits);
  for (const Row &row : kRows) EXPECT_EQ(decodeValue(report).at(row.key).as<std::uint64_t>(), 18446744073709551615u);
}

/// The mask that a drawn line shows.
std::uint64_t undrawn(const std::string &line) {
  std::uint64_t mask = 0;
  for (const char c : line.substr(line.size() - 53)) {
    if (c != ' ') mask = mask << 1 | (c == 'X');
  }
  return mask;
}

TEST(OpenShortTest, FormsAgree) {
  expectDifferences(0xE3, 57, {"bits 48 to 63 as value only"},
                    [](const Lines &lines, const ValueMap &value, std::set<std::string> &seen) {
                      for (std::size_t i = 0; i < 7; ++i) {
                        const std::uint64_t mask = std::strtoull(digits(value.at(kRows[i].key)).c_str(), nullptr, 10);
                        EXPECT_EQ(undrawn(lines[3 + i]), mask & 0xFFFFFFFFFFFF);
                        if (mask >> 48 != 0) seen.insert("bits 48 to 63 as value only");
                      }
                    });
}

std::vector<Field> dataFields(bool decimal) {
  const char *element = decimal ? "%14d " : "%08x ";
  std::vector<Field> all = {
      {1,
       8,
       {{4, [](const Report &r) { return "ADC Saturation  " + drawn(r.number(1, 8)); }}},
       {{"SATURATION_DATA", keep<std::uint64_t>(1)}}},
      {393,
       1,
       {{6, [](const Report &r) { return r.u8(393) % 2 == 1 ? "Brownout: YES" : "Brownout: NO"; }}},
       {{"BROWNOUT", [](const Report &r) { return r.u8(393) % 2 == 1 ? "u8 1" : "u8 0"; }}}},
  };
  addArray<std::uint32_t>(all, 9, 9, "SCAN_DATA_I", element);
  addArray<std::uint32_t>(all, 201, 17, "SCAN_DATA_Q", element);
  return all;
}

Lines zeroData(const std::string &scan, bool decimal) {
  std::string row;
  for (int i = 0; i < 8; ++i) row += decimal ? "             0 " : "00000000 ";
  return {"Open/Short Test " + scan + " Data:",
          "",
          std::string(23, ' ') + "40" + std::string(7, ' ') + "32" + std::string(7, ' ') + "24" + std::string(7, ' ') +
              "16" + std::string(8, ' ') + "8" + std::string(8, ' ') + "0",
          "ADC Saturation  " + kNoBits,
          "",
          "Brownout: NO",
          "",
          "[" + scan + " I]",
          row,
          row,
          row,
          row,
          row,
          row,
          "",
          "[" + scan + " Q]",
          row,
          row,
          row,
          row,
          row,
          row};
}

TEST(OpenShortData, AllZero) {
  for (const bool decimal : {false, true}) {
    EXPECT_EQ(decodeLines(Report(0xE4, 401), decimal), zeroData("D-SCAN", decimal));
    EXPECT_EQ(decodeLines(Report(0xE5, 401), decimal), zeroData("P-SCAN", decimal));
  }
  const ReportValue value = decodeValue(Report(0xE5, 401));
  EXPECT_THAT(keysOf(value), UnorderedElementsAre("SATURATION_DATA", "BROWNOUT", "SCAN_DATA_I", "SCAN_DATA_Q"));
  EXPECT_EQ(value.at("SCAN_DATA_I").size(), 48u);
  EXPECT_EQ(value.at("SCAN_DATA_Q").size(), 48u);
}

TEST(OpenShortData, EveryOffset) {
  for (const unsigned id : {0xE4u, 0xE5u}) expectEveryOffset(id, 401, dataFields(false));
}
TEST(OpenShortData, EveryOffsetInDecimal) {
  for (const unsigned id : {0xE4u, 0xE5u}) expectEveryOffset(id, 401, dataFields(true), true, {0x01, 0x80});
}
TEST(OpenShortData, NothingElseIsRead) {
  for (const unsigned id : {0xE4u, 0xE5u}) expectNothingElseIsRead(id, 401);
}
TEST(OpenShortData, EveryLength) {
  for (const unsigned id : {0xE4u, 0xE5u}) expectEveryLength(id, 401);
}

/// The ID under which the report was asked for names the scan, not the report's first byte.
TEST(OpenShortData, ReportIdNamesTheScan) {
  Decoder decode(true);
  EXPECT_EQ(linesOf(decode(0xE4, Report(0xE5, 401).bytes())), zeroData("D-SCAN", false));
  EXPECT_EQ(linesOf(decode(0xE5, Report(0xE4, 401).bytes())), zeroData("P-SCAN", false));
  const Report report(0xE4, 401);
  decode.plugin().setReport_buf(report.bytes().data());
  for (const std::uint32_t id : {0x00u, 0xE3u, 0x1E4u, 0xFFFFFFE4u}) {
    decode.plugin().setReport_id(id);
    EXPECT_EQ(linesOf(decode.plugin().parseOpenShortData()), zeroData("P-SCAN", false));
  }
  decode.plugin().setReport_id(0xE4);
  EXPECT_EQ(linesOf(decode.plugin().parseOpenShortData()), zeroData("D-SCAN", false));
}

TEST(OpenShortData, Brownout) {
  for (const auto &[byte, yes] : {std::pair{0xFE, false}, {0x01, true}, {0xFF, true}, {0x00, false}}) {
    const Report report = Report(0xE4, 401).u8(393, static_cast<std::uint8_t>(byte));
    EXPECT_EQ(decodeLines(report)[5], yes ? "Brownout: YES" : "Brownout: NO");
    EXPECT_EQ(decodeValue(report).at("BROWNOUT").as<std::uint8_t>(), yes ? 1 : 0);
  }
}

TEST(OpenShortData, SamplesAreUnsigned) {
  const Report report = Report(0xE4, 401).u32(9, 0xFFFFFFFF);
  EXPECT_EQ(decodeValue(report).at("SCAN_DATA_I").at(std::size_t{0}).as<std::uint32_t>(), 4294967295u);
  EXPECT_EQ(decodeLines(report)[8].substr(0, 9), "ffffffff ");
  EXPECT_EQ(decodeLines(report, true)[8].substr(0, 15), "            -1 ");
}

TEST(OpenShortData, FormsAgree) {
  for (const bool decimal : {false, true}) {
    std::set<std::string> allowed = {"saturation bits 48 to 63 as value only", "scan kind on screen only"};
    if (decimal) allowed.insert("samples signed on screen, unsigned as value");
    expectDifferences(
        0xE5, 401, allowed,
        [decimal](const Lines &lines, const ValueMap &value, std::set<std::string> &seen) {
          const std::uint64_t mask = std::strtoull(digits(value.at("SATURATION_DATA")).c_str(), nullptr, 10);
          EXPECT_EQ(undrawn(lines[3]), mask & 0xFFFFFFFFFFFF);
          if (mask >> 48 != 0) seen.insert("saturation bits 48 to 63 as value only");
          EXPECT_EQ(lines[5], value.at("BROWNOUT") == "u8 1" ? "Brownout: YES" : "Brownout: NO");
          bool named = false;
          for (const auto &[path, text] : value) named |= (path + text).find("SCAN") == 0 && text.starts_with("string");
          EXPECT_EQ(value.size(), 98u);
          if (!named && lines[0].find("P-SCAN") != std::string::npos) seen.insert("scan kind on screen only");
          for (const auto &[key, line] : {std::pair{"SCAN_DATA_I", 8u}, {"SCAN_DATA_Q", 16u}})
            for (std::size_t i = 0; i < 48; ++i) {
              const std::size_t width = decimal ? 15 : 9;
              const long long onScreen =
                  std::strtoll(lines[line + i / 8].substr(i % 8 * width, width).c_str(), nullptr, decimal ? 10 : 16);
              const std::string &kept = value.at(key + ("[" + std::to_string(i) + "]"));
              if (kept == "u32 " + std::to_string(onScreen)) continue;
              ASSERT_EQ(kept, leaf(static_cast<std::uint32_t>(onScreen)));
              seen.insert("samples signed on screen, unsigned as value");
            }
        },
        decimal, 1500);
  }
}

}  // namespace
