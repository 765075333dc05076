// Black box full report, features 0xE1 and 0xEA.
#include "tests/Support.h"
#include "tests/reports/blackbox/ExpectedCatalogue.h"

namespace {

using namespace test;

constexpr std::size_t kSize = 1023;

Report full(unsigned id = 0xE1) {
  return Report(id, kSize);
}

const char *counterFormat() {
  return "%40s: %i";
}

Field::Text counter(const std::string &label, std::size_t at, std::size_t width) {
  return [=](const Report &r) {
    return printed(counterFormat(), label.c_str(), static_cast<unsigned>(r.number(at, width)));
  };
}
Field::Text moduleId(const Module &module, std::size_t at) {
  return [name = module.name, blob = module.isBlob(), at](const Report &r) {
    const auto id = static_cast<unsigned>(r.number(at, 2));
    return blob ? printed("%30s Module ID: 0x%04X", name.c_str(), id)
                : printed("%40s: 0x%04X", (name + " Module ID").c_str(), id);
  };
}

struct Layout {
  std::vector<Field> fields;
  std::vector<std::size_t> emptyLines = {2, 4};
  std::size_t lines = 4;
};

/// Every field of the report, and the lines that stay empty.
Layout layout() {
  Layout all;
  all.fields = {{1, 2, {{3, counter("Module Count", 1, 2)}}, {{"MODULE_COUNT", keep<std::uint16_t>(1)}}}};
  std::vector<std::size_t> order = kFunctionalOrder;
  order.insert(order.end(), kBlobOrder.begin(), kBlobOrder.end());
  for (const std::size_t index : order) {
    const Module &module = kModules[index];
    const std::size_t at = kFullReportOffsets[index];
    const std::string path = module.name + "/";
    all.fields.push_back(
        {at, 2, {{++all.lines, moduleId(module, at)}}, {{path + module.name + "_MODULE_ID", keep<std::uint16_t>(at)}}});
    Field events = {
        at + 2, 2, {{++all.lines, counter((module.isBlob() ? "BLOB" : module.name) + " # Events", at + 2, 2)}}, {}};
    if (module.name != "PMGR") events.kept[path + module.name + "_NUM_EVENTS"] = keep<std::uint16_t>(at + 2);
    all.fields.push_back(events);
    for (std::size_t i = 0; i < module.events.size(); ++i) {
      const std::size_t counterAt = at + 4 + 4 * i;
      all.fields.push_back({counterAt,
                            4,
                            {{++all.lines, counter(module.events[i], counterAt, 4)}},
                            {{path + module.key(i), keep<std::uint32_t>(counterAt)}}});
    }
    all.emptyLines.push_back(++all.lines);
  }
  return all;
}

TEST(BlackBoxFullReport, AllZero) {
  const Layout wanted = layout();
  ASSERT_EQ(wanted.lines, 303u);
  Lines lines(303, "?");
  lines[0] = "---Black Box Full Report---";
  for (const std::size_t line : wanted.emptyLines) lines.at(line - 1) = "";
  for (const Field &field : wanted.fields)
    for (const auto &[line, text] : field.shown) lines.at(line - 1) = text(full());
  for (const unsigned id : {0xE1u, 0xEAu}) EXPECT_EQ(decodeLines(full(id)), lines);

  EXPECT_EQ(lines[2], "                            Module Count: 0");
  EXPECT_EQ(lines[4], "                     BLACK_BOX Module ID: 0x0000");
  EXPECT_EQ(lines[199], "                          PMGR Module ID: 0x0000");
  EXPECT_EQ(lines[200], "                           PMGR # Events: 0");
  EXPECT_EQ(lines[201], "             PMGR_EVENT_WAKE_SRC_UNKNOWN: 0");
  EXPECT_EQ(lines[202], "");
  EXPECT_EQ(lines[203], "                     BLOB_LAFE Module ID: 0x0000");
  EXPECT_EQ(lines[204], "                           BLOB # Events: 0");
  EXPECT_EQ(lines[302], "");
}

TEST(BlackBoxFullReport, Keys) {
  const ReportValue value = decodeValue(full());
  std::vector<std::string> outer = {"MODULE_COUNT"};
  for (const std::size_t index : kFunctionalOrder) outer.push_back(kModules[index].name);
  EXPECT_EQ(value.size(), 23u);
  std::vector<std::string> first = keysOf(value);
  first.resize(13);  // those thirteen first, the blobs behind them
  EXPECT_THAT(first, testing::UnorderedElementsAreArray(outer));
  for (const std::size_t index : kBlobOrder) outer.push_back(kModules[index].name);
  EXPECT_THAT(keysOf(value), testing::UnorderedElementsAreArray(outer));
  const std::vector<std::string> last = keysOf(value);
  for (std::size_t i = 0; i < 10; ++i) EXPECT_EQ(last.at(13 + i), kModules[kBlobOrder[i]].name);

  for (const Module &module : kModules) {
    std::vector<std::string> inner = {module.name + "_MODULE_ID", module.name + "_NUM_EVENTS"};
    for (std::size_t i = 0; i < module.events.size(); ++i) inner.push_back(module.key(i));
    if (module.name == "PMGR") inner.erase(inner.begin() + 1);
    EXPECT_THAT(keysOf(value.at(module.name)), testing::UnorderedElementsAreArray(inner)) << module.name;
  }
  EXPECT_THAT(keysOf(value.at("PMGR")), testing::UnorderedElementsAre("PMGR_MODULE_ID", "PMGR_EVENT_WAKE_SRC_UNKNOWN"));
  EXPECT_EQ(value.at("BLOB_LPMp").size(), 9u);
}

TEST(BlackBoxFullReport, EveryOffset) {
  expectEveryOffset(0xE1, kSize, layout().fields, false, {0x01, 0x80, 0x6D});
}
TEST(BlackBoxFullReport, EveryOffsetOfTheOtherId) {
  expectEveryOffset(0xEA, kSize, layout().fields, true, {0xFF});
}
TEST(BlackBoxFullReport, NothingElseIsRead) {
  expectNothingElseIsRead(0xE1, kSize);
}
TEST(BlackBoxFullReport, EveryLength) {
  expectEveryLength(0xEA, kSize);
}

TEST(BlackBoxFullReport, WellKnownOffsets) {
  struct {
    std::size_t at;
    const char *path;
  } const rows[] = {{7, "BLACK_BOX/BLACK_BOX_EVENT_UNKNOWN"},
                    {23, "BLACK_BOX/BLACK_BOX_EVENT_THROW_EXTERNAL"},
                    {31, "PSE/PSE_EVENT_AFE_LDO_FAULT"},
                    {67, "PSE/PSE_EVENT_FS_IDAC_PUP"},
                    {75, "OPEN_SHORT_TEST/OPEN_SHORT_EVENT_UNKNOWN"},
                    {95, "OPEN_SHORT_TEST/OPEN_SHORT_EVENT_WEAK_OS"},
                    {103, "SCAN_LOGGER/SCAN_LOGGER_EVENT_FAILED_IMAGE_ALLOC"},
                    {123, "SVC_SMGR/SVC_SMGR_EVENT_FRAME_TRIG_NOT_READY"},
                    {131, "BLOB_LAFE/BLOB_LAFE_EVENT_GOOD_BLOB"},
                    {411, "BLOB_LRTC/BLOB_LRTC_EVENT_DEFAULT"},
                    {483, "HIDSPI_MASTER/HIDSPI_MASTER_EVENT_TORVALE_MISSING"},
                    {583, "ALGS/ALGS_EVENT_PIXEL_NOISE_CNT_CH_0"},
                    {803, "ALGS/ALGS_EVENT_C2G_UNABLE_TO_DETECT"},
                    {815, "SYS/SYS_EVENT_MISSED_HSPI_CS_EDGE"},
                    {855, "QOR/QOR_EVENT_TOUCH_ATTACH_TIMEOUT"},
                    {963, "HIDSPI_SLAVE/HIDSPI_SLAVE_EVENT_BUS_DETACH"},
                    {979, "OTP/OTP_EVENT_TRIM_MISSING"},
                    {987, "PMGR/PMGR_EVENT_WAKE_SRC_UNKNOWN"},
                    {1019, "BLOB_LSFN/BLOB_LSFN_EVENT_DEFAULT"}};
  for (const auto &row : rows) {
    EXPECT_EQ(decodeMap(full().u32(row.at, 0xFFFFFFFF)).at(row.path), "u32 4294967295");
    int minusOnes = 0;
    for (const std::string &line : decodeLines(full().u32(row.at, 0xFFFFFFFF))) minusOnes += line.ends_with(": -1");
    EXPECT_EQ(minusOnes, 1) << row.path;
  }
}

TEST(BlackBoxFullReport, Examples) {
  const Report last = full().u8(991, 0x34).u8(992, 0x12);
  EXPECT_EQ(decodeLines(last)[293], "                     BLOB_LSFN Module ID: 0x1234");
  EXPECT_EQ(decodeValue(last).at("BLOB_LSFN").at("BLOB_LSFN_MODULE_ID").as<std::uint16_t>(), 4660);

  const Lines lines = decodeLines(full().u16(859, 5).u16(861, 26));
  const auto slave = std::find(lines.begin(), lines.end(), "                  HIDSPI_SLAVE Module ID: 0x0005");
  ASSERT_NE(slave, lines.end());
  EXPECT_EQ(slave[1], "                   HIDSPI_SLAVE # Events: 26");
  EXPECT_EQ(slave[-2], "     HIDSPI_MASTER_EVENT_TORVALE_MISSING: 0");
  EXPECT_EQ(decodeLines(full().u16(3, 0xBEEF))[4], "                     BLACK_BOX Module ID: 0xBEEF");
}

TEST(BlackBoxFullReport, CountsInTheReportBoundNothing) {
  for (const std::uint16_t count : {std::uint16_t{0}, std::uint16_t{1000}, std::uint16_t{0xFFFF}}) {
    Report report = full().u16(1, count);
    for (const std::size_t at : kFullReportOffsets) report.u16(at + 2, count);
    EXPECT_EQ(decodeLines(report).size(), 303u);
    EXPECT_EQ(decodeLeaves(report).size(), 1 + 163 + 70 + 2 * 22 - 1);
  }
}

TEST(BlackBoxFullReport, FormsAgree) {
  expectDifferences(
      0xE1, kSize,
      {"counters signed on screen, unsigned as value", "PMGR_NUM_EVENTS on screen only",
       "blob labels without the blob's name on screen"},
      [](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &seen) {
        EXPECT_EQ(value.at("MODULE_COUNT"), "u16 " + behind(lines[2], ": "));
        std::string module, blobless;
        for (std::size_t i = 4; i < lines.size(); ++i) {
          if (lines[i].empty()) continue;
          const std::string line = lines[i].substr(lines[i].find_first_not_of(' '));
          std::string label = line.substr(0, line.find(": "));
          const std::string text = behind(line, ": ");
          if (label.ends_with(" Module ID")) {
            module = label.substr(0, label.size() - 10);
            ASSERT_EQ(value.at(module + "/" + module + "_MODULE_ID"),
                      leaf(static_cast<std::uint16_t>(std::strtoul(text.c_str(), nullptr, 16))));
            continue;
          }
          if (module.starts_with("BLOB_") && !value.contains(module + "/" + label)) {
            seen.insert("blob labels without the blob's name on screen");
            label = module + label.substr(4);
          }
          if (label.ends_with(" # Events")) {
            const auto kept = value.find(module + "/" + module + "_NUM_EVENTS");
            if (kept == value.end())
              seen.insert(module + "_NUM_EVENTS on screen only");
            else
              ASSERT_EQ(kept->second, "u16 " + text);
            continue;
          }
          const std::string &kept = value.at(module + "/" + label);
          if (kept == "u32 " + text) continue;
          ASSERT_EQ(kept, leaf(static_cast<std::uint32_t>(std::strtol(text.c_str(), nullptr, 10))));
          seen.insert("counters signed on screen, unsigned as value");
        }
      },
      false, 1000);
}

}  // namespace
