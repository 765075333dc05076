// Sensor image, input 0x76.
#include "tests/Support.h"

namespace {

using namespace test;
using testing::UnorderedElementsAre;

constexpr std::size_t kSize = 792;

Report image() {
  return Report(0x76, kSize);
}

std::vector<Field> fields(bool decimal) {
  const char *element = decimal ? "%14d " : "%08x ";
  std::vector<Field> all = {
      {1, 1, {{6, show("[Cookie = 0x%02x]", 1, 1)}}, {{"COOKIE", keep<std::uint8_t>(1)}}},
      {2, 2, {{7, show("[Flags = 0x%04x]", 2, 2)}}, {{"FLAGS", keep<std::uint16_t>(2)}}},
      {4, 4, {{1, show("[Frame # = %u]", 4, 4)}}, {{"FRAME_NUMBER", keep<std::uint32_t>(4)}}},
      {8, 4, {{2, show("[Frame Params = 0x%08x]", 8, 4)}}, {{"FRAME_PARAMS", keep<std::uint32_t>(8)}}},
      {12, 4, {{3, show("[Timestamp = %u ms]", 12, 4)}}, {{"TIMESTAMP_MS", keep<std::uint32_t>(12)}}},
      {784, 4, {{5, show("[TMON Params = 0x%08x]", 784, 4)}}, {{"TMON_PARAMS", keep<std::uint32_t>(784)}}},
      {788,
       4,
       {{4, [](const Report &r) { return printed("[TMON = %f degC]", double{r.f32(788)}); }}},
       {{"TMON_DEG_C", keep<float>(788)}}},
  };
  addArray<std::int32_t>(all, 16, 10, "D_SCAN_I", element);
  addArray<std::int32_t>(all, 208, 18, "D_SCAN_Q", element);
  addArray<std::int32_t>(all, 400, 26, "P_SCAN_I", element);
  addArray<std::int32_t>(all, 592, 34, "P_SCAN_Q", element);
  return all;
}

TEST(SensorImage, AllZero) {
  for (const bool decimal : {false, true}) {
    std::string row;
    for (int i = 0; i < 8; ++i) row += decimal ? "             0 " : "00000000 ";
    Lines wanted = {"[Frame # = 0]",
                    "[Frame Params = 0x00000000]",
                    "[Timestamp = 0 ms]",
                    "[TMON = 0.000000 degC]",
                    "[TMON Params = 0x00000000]",
                    "[Cookie = 0x00]",
                    "[Flags = 0x0000]",
                    ""};
    for (const char *heading : {"[D-SCAN I]", "[D-SCAN Q]", "[P-SCAN I]", "[P-SCAN Q]"}) {
      wanted.emplace_back(heading);
      wanted.insert(wanted.end(), 6, row);
      wanted.emplace_back("");
    }
    EXPECT_EQ(wanted.size(), 40u);
    EXPECT_EQ(decodeLines(image(), decimal), wanted);
  }
}

TEST(SensorImage, Keys) {
  const ReportValue value = decodeValue(image());
  EXPECT_THAT(keysOf(value),
              UnorderedElementsAre("FRAME_NUMBER", "FRAME_PARAMS", "TIMESTAMP_MS", "TMON_DEG_C", "TMON_PARAMS",
                                   "COOKIE", "FLAGS", "D_SCAN_I", "D_SCAN_Q", "P_SCAN_I", "P_SCAN_Q"));
  EXPECT_EQ(value.size(), 11u);
  for (const char *key : {"D_SCAN_I", "D_SCAN_Q", "P_SCAN_I", "P_SCAN_Q"}) EXPECT_EQ(value.at(key).size(), 48u);
}

TEST(SensorImage, EveryOffset) {
  expectEveryOffset(0x76, kSize, fields(false));
}
TEST(SensorImage, EveryOffsetInDecimal) {
  expectEveryOffset(0x76, kSize, fields(true), true, {0x01, 0x80});
}
TEST(SensorImage, NothingElseIsRead) {
  expectNothingElseIsRead(0x76, kSize);
}
TEST(SensorImage, EveryLength) {
  expectEveryLength(0x76, kSize);
}

TEST(SensorImage, LengthMustBeExact) {
  for (const bool strings : {true, false}) {
    Decoder decode(strings);
    PaddedReport padded(image().bytes());
    for (const std::int64_t length :
         {std::int64_t{791}, std::int64_t{793}, std::int64_t{0}, std::int64_t{-792}, (std::int64_t{1} << 32) + 792})
      EXPECT_TRUE(
          std::holds_alternative<std::monostate>(decode.plugin().reportToObject(padded.data(), 0x76, 0, length)));
    EXPECT_FALSE(std::holds_alternative<std::monostate>(decode.plugin().reportToObject(padded.data(), 0x76, 0, 792)));
  }
}

TEST(SensorImage, MinusOneInBothDisplays) {
  const Report report = image().u32(16, 0xFFFFFFFF);
  EXPECT_EQ(decodeLines(report)[9].substr(0, 18), "ffffffff 00000000 ");
  EXPECT_EQ(decodeLines(report, true)[9].substr(0, 30), "            -1              0 ");
  EXPECT_EQ(decodeValue(report).at("D_SCAN_I").at(std::size_t{0}).as<std::int32_t>(), -1);
}

TEST(SensorImage, HeaderExamples) {
  const Report report = image().f32(788, 36.5f).u8(1, 0x05).u8(2, 0x02).u8(3, 0x01);
  const Lines lines = decodeLines(report);
  EXPECT_EQ(lines[3], "[TMON = 36.500000 degC]");
  EXPECT_EQ(lines[5], "[Cookie = 0x05]");
  EXPECT_EQ(lines[6], "[Flags = 0x0102]");
  EXPECT_EQ(decodeValue(report).at("TMON_DEG_C").as<float>(), 36.5f);
}

TEST(SensorImage, TemperatureThatIsNoNumber) {
  const auto line = [](std::uint32_t bits) { return decodeLines(image().u32(788, bits))[3]; };
  EXPECT_EQ(line(0x7F800000), "[TMON = inf degC]");
  EXPECT_EQ(line(0xFF800000), "[TMON = -inf degC]");
  EXPECT_EQ(line(0x7FC00000), "[TMON = nan degC]");
  EXPECT_EQ(line(0xFFC00000), "[TMON = -nan degC]");
  EXPECT_EQ(line(0x80000000), "[TMON = -0.000000 degC]");
  EXPECT_EQ(decodeMap(image().u32(788, 0x7F800001)).at("TMON_DEG_C"), "float 7f800001");
}

TEST(SensorImage, FormsAgree) {
  for (const bool decimal : {false, true})
    expectDifferences(
        0x76, kSize, {"temperature to six decimals on screen"},
        [decimal](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &seen) {
          const auto number = [](const std::string &line, int base) {
            return std::strtoul(behind(line, "= ").c_str(), nullptr, base);
          };
          const auto same = [&](const char *key, const char *type, unsigned long onScreen) {
            EXPECT_EQ(value.at(key), type + std::to_string(onScreen));
          };
          same("FRAME_NUMBER", "u32 ", number(lines[0], 10));
          same("FRAME_PARAMS", "u32 ", number(lines[1], 16));
          same("TIMESTAMP_MS", "u32 ", number(lines[2], 10));
          same("TMON_PARAMS", "u32 ", number(lines[4], 16));
          same("COOKIE", "u8 ", number(lines[5], 16));
          same("FLAGS", "u16 ", number(lines[6], 16));
          if (leaf(std::strtof(behind(lines[3], "= ").c_str(), nullptr)) != value.at("TMON_DEG_C"))
            seen.insert("temperature to six decimals on screen");
          std::size_t line = 9;
          for (const char *key : {"D_SCAN_I", "D_SCAN_Q", "P_SCAN_I", "P_SCAN_Q"}) {
            for (std::size_t i = 0; i < 48; ++i) {
              const std::size_t width = decimal ? 15 : 9;
              const std::string text = lines[line + i / 8].substr(i % 8 * width, width);
              const auto sample = static_cast<std::int32_t>(std::strtoll(text.c_str(), nullptr, decimal ? 10 : 16));
              ASSERT_EQ(value.at(key + ("[" + std::to_string(i) + "]")), leaf(sample));
            }
            line += 8;
          }
        },
        decimal, 1000);
}

}  // namespace
