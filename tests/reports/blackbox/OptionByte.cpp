// Event option bytes and severity levels: every byte there is.
#include "tests/Support.h"
#include "tests/reports/blackbox/OptionText.h"

namespace {

using namespace test;

class OptionByte : public testing::Test {
 protected:
  std::unique_ptr<HIDReportVeskPlugin> plugin = HIDReportVeskPlugin::init();

  std::string level(unsigned value) {
    const char *name = nullptr;
    plugin->errorLevelToString(static_cast<std::uint8_t>(value), &name);
    return name;
  }
};

TEST_F(OptionByte, Levels) {
  const char *names[] = {"TRACE", "DEBUG", "INFO", "WARNING", "ERROR", "CRITICAL"};
  for (unsigned value = 0; value <= 0xFF; ++value)
    EXPECT_EQ(level(value), value < 6 ? names[value] : "UNKNOWN") << value;
}

TEST_F(OptionByte, LevelNamesAreConstants) {
  const char *first = nullptr, *second = nullptr;
  plugin->errorLevelToString(4, &first);
  HIDReportVeskPlugin::init()->errorLevelToString(4, &second);
  EXPECT_EQ(first, second);
}

TEST_F(OptionByte, EveryByteAsALine) {
  for (unsigned value = 0; value <= 0xFF; ++value) {
    const auto option = static_cast<std::uint8_t>(value);
    for (const char *name :
         {"Global Trace Config", "", "PSE_EVENT_FS_TX_PUP", "HIDSPI_MASTER_EVENT_TRANSFER_INVALID_IFACE_ID",
          "1234567890123456789012345678901234567890", "12345678901234567890123456789012345678901"})
      for (const bool printLevel : {true, false})
        ASSERT_EQ(plugin->blackBoxOptionToString(option, name, printLevel), optionText(option, name, printLevel))
            << value;
  }
}

TEST_F(OptionByte, EveryByteAsADictionary) {
  for (unsigned value = 0; value <= 0xFF; ++value) {
    const ReportValue dictionary = plugin->blackBoxOptionToDict(static_cast<std::uint8_t>(value));
    EXPECT_THAT(keysOf(dictionary), testing::UnorderedElementsAre("ERROR_LEVEL", "OPTIONS_RAW"));
    EXPECT_EQ(dictionary.at("ERROR_LEVEL").as<vesk::Text>(), levelName(value & 7));
    EXPECT_EQ(dictionary.at("OPTIONS_RAW").as<std::int32_t>(), static_cast<std::int32_t>(value));
  }
}

TEST_F(OptionByte, Examples) {
  struct {
    std::uint8_t option;
    const char *name;
    bool printLevel;
    std::string line;
  } const rows[] = {
      {0x00, "Global Trace Config", false, std::string(21, ' ') + "Global Trace Config:  (no options set)"},
      {0x6B, "BLACK_BOX_EVENT_UNKNOWN", true,
       std::string(17, ' ') + "BLACK_BOX_EVENT_UNKNOWN: WARNING MASKED MESSAGE GPIO_1 "},
      {0x06, "X", true, std::string(39, ' ') + "X: UNKNOWN (no options set)"},
      {0x07, "X", true, std::string(39, ' ') + "X: UNKNOWN (no options set)"},
      {0x07, "X", false, std::string(39, ' ') + "X:  (no options set)"},
      {0x30, "X", false, std::string(39, ' ') + "X:  GPIO_2 "},
      {0x10, "X", false, std::string(39, ' ') + "X:  GPIO_0 "},
      {0x20, "X", false, std::string(39, ' ') + "X:  GPIO_1 "},
      {0xFD, "X", true, std::string(39, ' ') + "X: CRITICAL MASKED MESSAGE GPIO_2 BREAKPOINT "},
      {0x80, "X", true, std::string(39, ' ') + "X: TRACE BREAKPOINT "},
      {0x40, "HIDSPI_MASTER_EVENT_TRANSFER_INVALID_IFACE_ID", true,
       "HIDSPI_MASTER_EVENT_TRANSFER_INVALID_IFACE_ID: TRACE MESSAGE "},
  };
  for (const auto &row : rows)
    EXPECT_EQ(plugin->blackBoxOptionToString(row.option, row.name, row.printLevel), row.line);
  EXPECT_EQ(plugin->blackBoxOptionToDict(0x0A).at("ERROR_LEVEL").as<vesk::Text>(), "INFO");
  EXPECT_EQ(plugin->blackBoxOptionToDict(0x0A).at("OPTIONS_RAW").as<std::int32_t>(), 10);
  EXPECT_EQ(plugin->blackBoxOptionToDict(0xFF).at("ERROR_LEVEL").as<vesk::Text>(), "UNKNOWN");
  EXPECT_EQ(plugin->blackBoxOptionToDict(0xFF).at("OPTIONS_RAW").as<std::int32_t>(), 255);
}

TEST_F(OptionByte, LongNamesArePrintedWhole) {
  const std::string name(500, 'n');
  EXPECT_EQ(plugin->blackBoxOptionToString(0, name.c_str(), true), name + ": TRACE (no options set)");
  EXPECT_EQ(plugin->blackBoxOptionToString(0xFF, name.c_str(), false), name + ":  MASKED MESSAGE GPIO_2 BREAKPOINT ");
}

TEST_F(OptionByte, TheObjectsStateIsNotLookedAt) {
  plugin->setUseStrings(true);
  plugin->setDisplayDecimal(true);
  EXPECT_EQ(plugin->blackBoxOptionToString(0x6B, "X", true), optionText(0x6B, "X", true));
  EXPECT_EQ(plugin->blackBoxOptionToDict(0x0A).size(), 2u);
}

}  // namespace
