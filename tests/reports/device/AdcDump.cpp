// ADC dump: packet (input 0x77), configuration (feature 0xDC), state (feature 0xDE).
#include "tests/Support.h"

namespace {

using namespace test;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

using ValueMap = std::map<std::string, std::string>;

Report packet() {
  return Report(0x77, 2064);
}
Report config() {
  return Report(0xDC, 25);
}
Report state(std::uint8_t value) {
  return Report(0xDE, 2).u8(1, value);
}

std::string magicValue(const Report &r) {
  return leaf(std::int32_t{r.u8(1) << 2 | r.u8(2) << 1 | r.u8(3)});
}

std::vector<Field> packetFields() {
  std::vector<Field> all = {
      {1,
       3,
       {{2, [](const Report &r) { return printed("[Magic Value     = 0x%02x%02x%02x]", r.u8(1), r.u8(2), r.u8(3)); }}},
       {{"MAGIC_VALUE", magicValue}}},
      {4, 4, {{1, show("[ADC Packet #    = %u]", 4, 4)}}, {{"PACKET_ID", keep<std::uint32_t>(4)}}},
      {8, 4, {{3, show("[Payload Size    = %u]", 8, 4)}}, {{"PAYLOAD_SIZE", keep<std::uint32_t>(8)}}},
      {12, 4, {{4, show("[Total Dump Size = %u]", 12, 4)}}, {{"TOTAL_DUMP_SIZE", keep<std::uint32_t>(12)}}},
  };
  addArray<std::uint32_t>(all, 16, 7, "PAYLOAD_DATA", "%08x ", 512);
  return all;
}

TEST(AdcDumpPacket, AllZero) {
  Lines wanted = {
      "[ADC Packet #    = 0]", "[Magic Value     = 0x000000]", "[Payload Size    = 0]", "[Total Dump Size = 0]", "",
      "[Packet Payload Data]"};
  wanted.insert(wanted.end(), 64, "00000000 00000000 00000000 00000000 00000000 00000000 00000000 00000000 ");
  EXPECT_EQ(wanted.size(), 70u);
  EXPECT_EQ(decodeLines(packet()), wanted);
  const ReportValue value = decodeValue(packet());
  EXPECT_THAT(keysOf(value),
              UnorderedElementsAre("PACKET_ID", "MAGIC_VALUE", "PAYLOAD_SIZE", "TOTAL_DUMP_SIZE", "PAYLOAD_DATA"));
  EXPECT_EQ(value.at("PAYLOAD_DATA").size(), 512u);
}

TEST(AdcDumpPacket, EveryOffset) {
  expectEveryOffset(0x77, 2064, packetFields(), false, {0x01, 0xE5}, 50);
}
TEST(AdcDumpPacket, DecimalChangesNothing) {
  expectEveryOffset(0x77, 2064, packetFields(), true, {0xFF}, 50);
}
TEST(AdcDumpPacket, NothingElseIsRead) {
  expectNothingElseIsRead(0x77, 2064);
}
TEST(AdcDumpPacket, EveryLength) {
  expectEveryLength(0x77, 2064);
}

TEST(AdcDumpPacket, MagicBytesOverlapAsAValue) {
  struct {
    std::uint8_t a, b, c;
    const char *line;
    std::int32_t value;
  } const rows[] = {{0x12, 0x34, 0x56, "[Magic Value     = 0x123456]", 126},
                    {0xFF, 0xFF, 0xFF, "[Magic Value     = 0xffffff]", 1023},
                    {0xFF, 0x00, 0x00, "[Magic Value     = 0xff0000]", 1020},
                    {0x00, 0xFF, 0x00, "[Magic Value     = 0x00ff00]", 510},
                    {0x00, 0x00, 0xFF, "[Magic Value     = 0x0000ff]", 255}};
  for (const auto &row : rows) {
    const Report report = packet().u8(1, row.a).u8(2, row.b).u8(3, row.c);
    EXPECT_EQ(decodeLines(report)[1], row.line);
    EXPECT_EQ(decodeValue(report).at("MAGIC_VALUE").as<std::int32_t>(), row.value);
  }
}

TEST(AdcDumpPacket, PayloadSizeBoundsNothing) {
  for (const std::uint32_t size : {0u, 4u, 2048u, 0xFFFFFFFFu}) {
    const Report report = packet().u32(8, size).u32(2060, 0xABCDEF01);
    EXPECT_EQ(decodeLines(report).size(), 70u);
    EXPECT_EQ(decodeLines(report).back().substr(63), "abcdef01 ");
    EXPECT_EQ(decodeValue(report).at("PAYLOAD_DATA").at(std::size_t{511}).as<std::uint32_t>(), 0xABCDEF01u);
  }
}

TEST(AdcDumpPacket, FormsAgree) {
  expectDifferences(
      0x77, 2064, {"magic bytes side by side on screen, overlapped as value"},
      [](const Lines &lines, const ValueMap &value, std::set<std::string> &seen) {
        const auto number = [&](std::size_t line, int base) {
          return std::strtoul(behind(lines[line], "= ").c_str(), nullptr, base);
        };
        EXPECT_EQ(value.at("PACKET_ID"), "u32 " + std::to_string(number(0, 10)));
        EXPECT_EQ(value.at("PAYLOAD_SIZE"), "u32 " + std::to_string(number(2, 10)));
        EXPECT_EQ(value.at("TOTAL_DUMP_SIZE"), "u32 " + std::to_string(number(3, 10)));
        if (value.at("MAGIC_VALUE") != "i32 " + std::to_string(number(1, 16)))
          seen.insert("magic bytes side by side on screen, overlapped as value");
        for (std::size_t i = 0; i < 512; ++i) {
          const std::string text = lines[6 + i / 8].substr(i % 8 * 9, 8);
          ASSERT_EQ(value.at("PAYLOAD_DATA[" + std::to_string(i) + "]"),
                    leaf(static_cast<std::uint32_t>(std::strtoul(text.c_str(), nullptr, 16))));
        }
      },
      false, 1000);
}

std::vector<Field> configFields() {
  const auto mask = [](const Report &r) { return printed("Channel Enable Mask = %04x%08x", r.u32(9), r.u32(5)); };
  const auto trigger = [](const Report &r) { return std::string(r.u32(21) == 0 ? "RX_EN" : "STIM_TIMER"); };
  return {
      {1, 4, {{3, show("Start Address       = 0x%08x", 1, 4)}}, {{"START_ADDRESS", keep<std::uint32_t>(1)}}},
      {5, 8, {{4, mask}}, {{"CHANNEL_ENABLE_MASK", keep<std::uint64_t>(5)}}},
      {13, 4, {{5, show("Sample Count        = %u", 13, 4)}}, {{"SAMPLE_COUNT", keep<std::uint32_t>(13)}}},
      {17, 4, {{6, show("Stim Timer Compare  = %u", 17, 4)}}, {{"STIM_TIMER_COMPARE", keep<std::uint32_t>(17)}}},
      {21,
       4,
       {{7, [=](const Report &r) { return "Trigger Source      = " + trigger(r); }}},
       {{"TRIGGER_SOURCE", [=](const Report &r) { return "string " + trigger(r); }}}},
  };
}

TEST(AdcDumpConfig, AllZero) {
  EXPECT_THAT(decodeLines(config()), ElementsAre("--ADC Dump Configuration--", "", "Start Address       = 0x00000000",
                                                 "Channel Enable Mask = 000000000000", "Sample Count        = 0",
                                                 "Stim Timer Compare  = 0", "Trigger Source      = RX_EN"));
  EXPECT_THAT(keysOf(decodeValue(config())),
              UnorderedElementsAre("START_ADDRESS", "CHANNEL_ENABLE_MASK", "SAMPLE_COUNT", "STIM_TIMER_COMPARE",
                                   "TRIGGER_SOURCE"));
}

TEST(AdcDumpConfig, EveryOffset) {
  expectEveryOffset(0xDC, 25, configFields());
}
TEST(AdcDumpConfig, EveryOffsetInDecimal) {
  expectEveryOffset(0xDC, 25, configFields(), true);
}
TEST(AdcDumpConfig, NothingElseIsRead) {
  expectNothingElseIsRead(0xDC, 25);
}
TEST(AdcDumpConfig, EveryLength) {
  expectEveryLength(0xDC, 25);
}

TEST(AdcDumpConfig, MaskShowsItsHighWordFirst) {
  const Report report = config().u32(5, 1).u32(9, 10);
  EXPECT_EQ(decodeLines(report)[3], "Channel Enable Mask = 000a00000001");
  EXPECT_EQ(decodeValue(report).at("CHANNEL_ENABLE_MASK").as<std::uint64_t>(), 42949672961u);
  EXPECT_EQ(decodeLines(config().u32(9, 0x12345))[3], "Channel Enable Mask = 1234500000000");
  EXPECT_EQ(decodeLines(config().u64(5, ~std::uint64_t{0}))[3], "Channel Enable Mask = ffffffffffffffff");
}

TEST(AdcDumpConfig, AnyTriggerButZeroIsTheTimer) {
  for (const std::uint32_t trigger : {1u, 2u, 0x100u, 0x10000u, 0x80000000u, 0xFFFFFFFFu}) {
    EXPECT_EQ(decodeLines(config().u32(21, trigger))[6], "Trigger Source      = STIM_TIMER");
    EXPECT_EQ(decodeValue(config().u32(21, trigger)).at("TRIGGER_SOURCE").as<vesk::Text>(), "STIM_TIMER");
  }
}

TEST(AdcDumpConfig, FormsAgree) {
  expectDifferences(0xDC, 25, {}, [](const Lines &lines, const ValueMap &value, std::set<std::string> &) {
    const auto number = [&](std::size_t line, int base) {
      return std::strtoull(behind(lines[line], "= ").c_str(), nullptr, base);
    };
    EXPECT_EQ(value.at("START_ADDRESS"), "u32 " + std::to_string(number(2, 16)));
    EXPECT_EQ(value.at("CHANNEL_ENABLE_MASK"), "u64 " + std::to_string(number(3, 16)));
    EXPECT_EQ(value.at("SAMPLE_COUNT"), "u32 " + std::to_string(number(4, 10)));
    EXPECT_EQ(value.at("STIM_TIMER_COMPARE"), "u32 " + std::to_string(number(5, 10)));
    EXPECT_EQ(value.at("TRIGGER_SOURCE"), "string " + behind(lines[6], "= "));
  });
}

TEST(AdcDumpState, EveryByte) {
  for (unsigned value = 0; value <= 0xFF; ++value) {
    const std::string name = value == 0 ? "STANDBY" : value == 1 ? "SINGLE" : value == 2 ? "CONTINUOUS" : "INVALID";
    const Report report = state(static_cast<std::uint8_t>(value));
    EXPECT_THAT(decodeLines(report), ElementsAre("ADC Dump State: " + name));
    EXPECT_EQ(decodeValue(report).as<vesk::Text>(), name);  // a bare string, no dictionary
  }
}

TEST(AdcDumpState, NothingElseIsRead) {
  expectNothingElseIsRead(0xDE, 2);
}
TEST(AdcDumpState, EveryLength) {
  expectEveryLength(0xDE, 2);
}

}  // namespace
