// Black box configuration, feature 0xE2.
#include "tests/Support.h"
#include "tests/reports/blackbox/ExpectedCatalogue.h"
#include "tests/reports/blackbox/OptionText.h"

namespace {

using namespace test;

constexpr std::size_t kSize = 241;

Report configuration() {
  return Report(0xE2, kSize);
}

struct Global {
  std::size_t offset;
  const char *label;
  const char *key;
};
const Global kGlobals[] = {
    {1, "Global Trace Config", "GLOBAL_CONFIG_TRACE"}, {2, "Global Debug Config", "GLOBAL_CONFIG_DEBUG"},
    {3, "Global Info Config", "GLOBAL_CONFIG_INFO"},   {4, "Global Warning Config", "GLOBAL_CONFIG_WARNING"},
    {5, "Global Error Config", "GLOBAL_CONFIG_ERROR"}, {6, "Global Critical Config", "GLOBAL_CONFIG_CRITICAL"},
};

/// Where event `event` of module `index` has its byte: the firmware's QOR block is ten bytes long for nine events.
std::size_t offsetOf(std::size_t index, std::size_t event) {
  return kConfigurationOffsets[index] + event + (kModules[index].name == "QOR" && event == 8 ? 1 : 0);
}
/// Where the screen takes it from.
std::size_t shownOffsetOf(std::size_t index, std::size_t event) {
  return kModules[index].events[event] == "OPEN_SHORT_EVENT_SINGLE_OPEN" ? 25 : offsetOf(index, event);
}

struct Layout {
  std::vector<Field> fields;
  Lines fixed;  // the lines that show no byte; "?" for the others
};

Layout layout() {
  Layout all;
  const auto shown = [&](std::size_t at, const std::string &label, bool level) {
    all.fixed.emplace_back("?");
    all.fields.push_back(
        {at, 1, {{all.fixed.size(), [=](const Report &r) { return optionText(r.u8(at), label, level); }}}, {}});
  };
  const auto kept = [&](std::size_t at, const std::string &key) {
    all.fields.push_back(
        {at,
         1,
         {},
         {{key + "/ERROR_LEVEL", [at](const Report &r) { return "string " + levelName(r.u8(at) & 7); }},
          {key + "/OPTIONS_RAW", [at](const Report &r) { return leaf(std::int32_t{r.u8(at)}); }}}});
  };
  for (const Global &global : kGlobals) {
    shown(global.offset, global.label, false);
    kept(global.offset, global.key);
  }
  all.fixed.emplace_back("");
  const auto events = [&](std::size_t index) {
    for (std::size_t i = 0; i < kModules[index].events.size(); ++i) {
      shown(shownOffsetOf(index, i), kModules[index].events[i], true);
      kept(offsetOf(index, i), kModules[index].key(i));
    }
    all.fixed.emplace_back("");
  };
  for (const std::size_t index : kFunctionalOrder) events(index);
  for (const std::size_t index : kBlobOrder) {
    all.fixed.push_back(printed("%40s", kModules[index].name.c_str()));
    events(index);
  }
  return all;
}

TEST(BlackBoxConfiguration, AllZero) {
  const Layout wanted = layout();
  Lines lines = wanted.fixed;
  for (const Field &field : wanted.fields)
    for (const auto &[line, text] : field.shown) lines.at(line - 1) = text(configuration());
  EXPECT_EQ(lines.size(), 272u);
  EXPECT_EQ(std::count(lines.begin(), lines.end(), ""), 23);
  EXPECT_EQ(std::count(wanted.fixed.begin(), wanted.fixed.begin() + 182, "?"), 169);
  EXPECT_EQ(decodeLines(configuration()), lines);

  EXPECT_EQ(lines[0], "                     Global Trace Config:  (no options set)");
  EXPECT_EQ(lines[6], "");
  EXPECT_EQ(lines[7], "                 BLACK_BOX_EVENT_UNKNOWN: TRACE (no options set)");
  EXPECT_EQ(lines[182], std::string(31, ' ') + "BLOB_LAFE");
  EXPECT_EQ(lines[183], "                    BLOB_EVENT_GOOD_BLOB: TRACE (no options set)");
}

TEST(BlackBoxConfiguration, Keys) {
  std::vector<std::string> keys;
  for (const Global &global : kGlobals) keys.emplace_back(global.key);
  for (const Module &module : kModules)
    for (std::size_t i = 0; i < module.events.size(); ++i) keys.push_back(module.key(i));
  EXPECT_EQ(keys.size(), 239u);
  std::mt19937_64 random(1);
  for (const Report &report : {configuration(), configuration().randomise(random)}) {
    const ReportValue value = decodeValue(report);
    EXPECT_EQ(value.size(), 239u);
    EXPECT_THAT(keysOf(value), testing::UnorderedElementsAreArray(keys));
    for (const std::string &key : keys)
      EXPECT_THAT(keysOf(value.at(key)), testing::UnorderedElementsAre("ERROR_LEVEL", "OPTIONS_RAW"));
  }
}

TEST(BlackBoxConfiguration, EveryOffset) {
  expectEveryOffset(0xE2, kSize, layout().fields, false, {0x01, 0x02, 0x05, 0x08, 0x10, 0x20, 0x40, 0x80, 0x6B, 0xFF},
                    300);
}
TEST(BlackBoxConfiguration, NothingElseIsRead) {
  expectNothingElseIsRead(0xE2, kSize);
}
TEST(BlackBoxConfiguration, EveryLength) {
  expectEveryLength(0xE2, kSize);
}

TEST(BlackBoxConfiguration, EveryByteAtOneEvent) {
  for (unsigned option = 0; option <= 0xFF; ++option) {
    const auto byte = static_cast<std::uint8_t>(option);
    EXPECT_EQ(decodeLines(configuration().u8(7, byte))[7], optionText(byte, "BLACK_BOX_EVENT_UNKNOWN", true));
    EXPECT_EQ(decodeLines(configuration().u8(1, byte))[0], optionText(byte, "Global Trace Config", false));
  }
}

std::string lineOf(const Lines &lines, const std::string &label, const std::string &header = "") {
  auto from = lines.begin();
  if (!header.empty()) from = std::find(from, lines.end(), printed("%40s", header.c_str()));
  for (; from != lines.end(); ++from)
    if (from->find(label + ":") != std::string::npos) return behind(*from, ":");
  return "no line";
}

TEST(BlackBoxConfiguration, SingleOpenIsShownFromTheByteOfDoubleOpen) {
  const Report at25 = configuration().u8(25, 0x80);
  EXPECT_EQ(lineOf(decodeLines(at25), "OPEN_SHORT_EVENT_DOUBLE_OPEN"), " TRACE BREAKPOINT ");
  EXPECT_EQ(lineOf(decodeLines(at25), "OPEN_SHORT_EVENT_SINGLE_OPEN"), " TRACE BREAKPOINT ");
  const ReportValue value = decodeValue(at25);
  EXPECT_EQ(value.at("OPEN_SHORT_EVENT_DOUBLE_OPEN").at("OPTIONS_RAW").as<std::int32_t>(), 128);
  EXPECT_EQ(value.at("OPEN_SHORT_EVENT_SINGLE_OPEN").at("OPTIONS_RAW").as<std::int32_t>(), 0);

  const Report at26 = configuration().u8(26, 0xFF);
  EXPECT_EQ(decodeLines(at26), decodeLines(configuration()));
  EXPECT_EQ(decodeValue(at26).at("OPEN_SHORT_EVENT_SINGLE_OPEN").at("OPTIONS_RAW").as<std::int32_t>(), 255);
}

TEST(BlackBoxConfiguration, Offset202IsReadInNeitherForm) {
  EXPECT_EQ(decodeLines(configuration().u8(202, 0xFF)), decodeLines(configuration()));
  EXPECT_EQ(decodeLeaves(configuration().u8(202, 0xFF)), decodeLeaves(configuration()));
  EXPECT_EQ(lineOf(decodeLines(configuration().u8(201, 0x0D)), "QOR_EVENT_VESK_RX_COUNT"), " CRITICAL MASKED ");
  EXPECT_EQ(lineOf(decodeLines(configuration().u8(203, 0x0D)), "QOR_EVENT_TOUCH_ATTACH_TIMEOUT"), " CRITICAL MASKED ");
  EXPECT_EQ(lineOf(decodeLines(configuration().u8(204, 0x0D)), "HIDSPI_SLAVE_EVENT_ACK_SENT"), " CRITICAL MASKED ");
}

TEST(BlackBoxConfiguration, WellKnownOffsets) {
  EXPECT_EQ(lineOf(decodeLines(configuration().u8(234, 0x05)), "BLOB_EVENT_GOOD_BLOB", "BLOB_LSFN"),
            " CRITICAL (no options set)");
  EXPECT_EQ(decodeMap(configuration().u8(234, 0x05)).at("BLOB_LSFN_EVENT_GOOD_BLOB/ERROR_LEVEL"), "string CRITICAL");
  EXPECT_EQ(lineOf(decodeLines(configuration().u8(95, 0x05)), "BLOB_EVENT_DEFAULT", "BLOB_LRTC"),
            " CRITICAL (no options set)");
  EXPECT_EQ(lineOf(decodeLines(configuration().u8(96, 0x05)), "HIDSPI_MASTER_EVENT_ACK_SENT"),
            " CRITICAL (no options set)");
  EXPECT_EQ(decodeMap(configuration().u8(240, 0x05)).at("BLOB_LSFN_EVENT_DEFAULT/OPTIONS_RAW"), "i32 5");
}

TEST(BlackBoxConfiguration, FormsAgree) {
  expectDifferences(
      0xE2, kSize,
      {"level of the globals as value only", "blob labels without the blob's name on screen",
       "OPEN_SHORT_EVENT_SINGLE_OPEN shown from another byte"},
      [](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &seen) {
        std::string blob;
        for (std::size_t i = 0; i < lines.size(); ++i) {
          if (lines[i].empty()) continue;
          const std::string line = lines[i].substr(lines[i].find_first_not_of(' '));
          if (line.find(':') == std::string::npos) {
            blob = line;
            continue;
          }
          std::string key = line.substr(0, line.find(':'));
          if (i < 6) key = kGlobals[i].key;
          if (!value.contains(key + "/OPTIONS_RAW") && !blob.empty()) {
            seen.insert("blob labels without the blob's name on screen");
            key = blob + key.substr(4);
          }
          const auto raw = static_cast<std::uint8_t>(std::stoi(digits(value.at(key + "/OPTIONS_RAW"))));
          ASSERT_EQ(value.at(key + "/ERROR_LEVEL"), "string " + levelName(raw & 7));
          const std::string label = line.substr(0, line.find(':'));
          if (lines[i] == optionText(raw, label, true)) continue;
          if (i < 6 && lines[i] == optionText(raw, label, false))
            seen.insert("level of the globals as value only");
          else
            seen.insert(label + " shown from another byte");
        }
      },
      false, 1500);
}

}  // namespace
