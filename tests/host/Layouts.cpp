// The table of fields against the decoders: a marker at every byte must show where the table says, and nowhere else.
#include "host/report/Layouts.h"

#include <algorithm>
#include <set>

#include "host/output/JsonValue.h"
#include "tests/Support.h"

namespace {

using namespace vesk::host;
using testing::HasSubstr;

const Field *fieldAt(const std::vector<Field> &fields, std::uint32_t offset, std::optional<unsigned> bit = {}) {
  for (const Field &field : fields)
    if (field.offset == offset && field.bit == bit) return &field;
  return nullptr;
}

/// The leaves, elements of arrays among them, that differ, as JSON Pointers.
std::set<std::string> changedKeys(const test::Leaves &before, const test::Leaves &after) {
  std::set<std::string> changed;
  for (std::size_t i = 0; i < before.size(); ++i) {
    if (before[i] == after[i]) continue;
    std::string pointer = before[i].first.empty() ? "" : "/" + before[i].first;
    if (const std::size_t bracket = pointer.find('['); bracket != std::string::npos) {
      pointer[bracket] = '/';
      pointer.pop_back();
    }
    changed.insert(pointer);
  }
  return changed;
}

/// Where the table says that byte `at` shows in the value.
std::set<std::string> expectedKeys(const std::vector<Field> &fields, std::uint32_t at, unsigned mask) {
  std::set<std::string> keys;
  for (const Field &field : fields) {
    if (at < field.offset || at >= field.offset + field.width() || field.key == kNotShown) continue;
    if (field.bit && (mask >> *field.bit & 1) == 0) continue;
    const bool isArray = field.count > 1 && field.type != FieldType::kBytes;
    if (isArray)
      keys.insert(field.key + "/" + std::to_string((at - field.offset) / elementWidth(field.type)));
    else if (field.type == FieldType::kOption)
      keys.insert({field.key + "/ERROR_LEVEL", field.key + "/OPTIONS_RAW"});
    else
      keys.insert(field.key);
  }
  return keys;
}

/// For each line that differs, what labels it: itself, or over the rows of an array the heading.
std::vector<std::string> changedLines(const test::Lines &before, const test::Lines &after) {
  std::vector<std::string> changed;
  std::string heading;
  for (std::size_t i = 0; i < before.size(); ++i) {
    const bool isRow = before[i].starts_with("00000000 ") || before[i].starts_with(" 0.000 ");
    if (!isRow && !before[i].empty()) heading = before[i];
    if (before[i] != after[i]) changed.push_back(isRow ? heading : after[i]);
  }
  return changed;
}

// The decoders that the markers cannot be put to one by one, because a text is as long as it is.
bool isText(const KnownReport &report) {
  return report.length == KnownReport::Length::kText;
}

TEST(Layouts, everyByteShowsInTheValueWhereTheTableSays) {
  for (const KnownReport &report : knownReports()) {
    if (isText(report)) continue;
    const std::vector<Field> fields = layoutOf(report);
    const test::Report zero(report.id, report.layoutSize);
    const test::Leaves before = test::decodeLeaves(zero);
    for (std::uint32_t at = 1; at < report.layoutSize; ++at) {
      test::Report marked = zero;
      marked.u8(at, 0xFF);
      ASSERT_EQ(changedKeys(before, test::decodeLeaves(marked)), expectedKeys(fields, at, 0xFF))
          << report.name << ", byte " << at;
    }
  }
}

TEST(Layouts, everyBitOfTheSummaryShowsWhereTheTableSays) {
  const KnownReport &report = *findReport(0xE0u);
  const std::vector<Field> fields = layoutOf(report);
  const test::Leaves before = test::decodeLeaves(test::Report(0xE0, 7));
  const test::Lines zeroLines = test::decodeLines(test::Report(0xE0, 7));
  for (std::uint32_t at = 4; at < 7; ++at)
    for (unsigned bit = 0; bit < 8; ++bit) {
      test::Report marked(0xE0, 7);
      marked.u8(at, static_cast<std::uint8_t>(1u << bit));
      ASSERT_EQ(changedKeys(before, test::decodeLeaves(marked)), expectedKeys(fields, at, 1u << bit)) << at << bit;
      const std::vector<std::string> changed = changedLines(zeroLines, test::decodeLines(marked));
      const Field *field = fieldAt(fields, at, bit);
      ASSERT_NE(field, nullptr);
      if (field->label == kNotShown)
        ASSERT_TRUE(changed.empty());
      else
        ASSERT_THAT(changed, testing::ElementsAre(HasSubstr(field->label + ": 1")));
    }
}

TEST(Layouts, everyByteShowsOnScreenUnderTheLabelOfTheTable) {
  for (const KnownReport &report : knownReports()) {
    if (isText(report) || report.id == 0xE0) continue;
    const std::vector<Field> fields = layoutOf(report);
    const test::Report zero(report.id, report.layoutSize);
    const test::Lines before = test::decodeLines(zero);
    for (const Field &field : fields) {
      test::Report marked = zero;
      // A mask's upper positions are not drawn, and of a number's bytes the lowest is enough to change its line.
      marked.u8(field.offset, 0x7F);
      if (field.type == FieldType::kF32) marked.u32(field.offset, 0x3FC00000);  // 1.5
      const std::vector<std::string> changed = changedLines(before, test::decodeLines(marked));
      // The wallclock has not the digits for a few microseconds.
      if (field.label == "Feed Wallclock") continue;
      if (field.label == kNotShown)
        ASSERT_TRUE(changed.empty()) << report.name << ", byte " << field.offset;
      else
        ASSERT_THAT(changed, testing::Contains(HasSubstr(field.label))) << report.name << ", byte " << field.offset;
    }
  }
}

TEST(Layouts, fieldsFollowOneAnotherWithoutGaps) {
  for (const KnownReport &report : knownReports()) {
    std::uint32_t next = 1;
    for (const Field &field : layoutOf(report)) {
      if (field.offset < next) {  // computed from the bytes of the field before it, or another bit of the same byte
        EXPECT_EQ(field.offset + field.width(), next) << report.name << " " << field.label;
        continue;
      }
      EXPECT_EQ(field.offset, next) << report.name << " " << field.label;
      next = field.offset + field.width();
    }
    EXPECT_EQ(next, report.layoutSize) << report.name;
  }
}

TEST(Layouts, sizesAreThoseOfTheController) {
  const std::map<unsigned, unsigned> sizes = {{0x76, 792},  {0x77, 2064}, {0xA2, 193}, {0xA9, 49},  {0xD0, 2},
                                              {0xD2, 2},    {0xDC, 25},   {0xDE, 2},   {0xDF, 25},  {0xE0, 7},
                                              {0xE1, 1023}, {0xE2, 241},  {0xE3, 57},  {0xE4, 401}, {0xE5, 401},
                                              {0xEA, 1023}, {0xEC, 193}};
  std::map<unsigned, unsigned> known;
  for (const KnownReport &report : knownReports()) known[report.id] = report.layoutSize;
  EXPECT_EQ(known, sizes);
}

TEST(Layouts, theBlackBoxIsAskedForItsNames) {
  const std::vector<Field> summary = layoutOf(*findReport("black-box-summary"));
  EXPECT_EQ(fieldAt(summary, 6, 2)->key, "/HIDSPI_SLAVE");
  EXPECT_EQ(fieldAt(summary, 6, 5)->key, "/BLOB_LSFN");
  EXPECT_EQ(fieldAt(summary, 6, 6)->key, kNotShown);

  const std::vector<Field> full = layoutOf(*findReport("black-box-report"));
  EXPECT_EQ(full.size(), 1u + 2 * 22 + 163 + 70);
  const Field *noise = fieldAt(full, 583);
  ASSERT_NE(noise, nullptr);
  EXPECT_EQ(noise->key, "/ALGS/ALGS_EVENT_PIXEL_NOISE_CNT_CH_0");
  EXPECT_EQ(noise->type, FieldType::kU32);
  EXPECT_EQ(fieldAt(full, 991)->label, "BLOB_LSFN Module ID");
  EXPECT_EQ(fieldAt(full, 991)->type, FieldType::kU16);
  EXPECT_EQ(fieldAt(full, 985)->label, "PMGR # Events");
  EXPECT_EQ(fieldAt(full, 985)->key, kNotShown);
  EXPECT_THAT(fieldAt(full, 985)->note, HasSubstr("on screen only"));

  const std::vector<Field> config = layoutOf(*findReport("black-box-config"));
  EXPECT_EQ(config.size(), 240u);
  EXPECT_EQ(fieldAt(config, 1)->key, "/GLOBAL_CONFIG_TRACE");
  EXPECT_EQ(fieldAt(config, 26)->key, "/OPEN_SHORT_EVENT_SINGLE_OPEN");
  EXPECT_EQ(fieldAt(config, 26)->label, kNotShown);
  EXPECT_THAT(fieldAt(config, 26)->note, HasSubstr("in the value only"));
  EXPECT_EQ(fieldAt(config, 202)->type, FieldType::kUnused);
  EXPECT_EQ(fieldAt(config, 203)->key, "/QOR_EVENT_TOUCH_ATTACH_TIMEOUT");
  EXPECT_EQ(fieldAt(config, 234)->label, "BLOB_EVENT_GOOD_BLOB");
}

TEST(KnownReports, areFoundByIdAndName) {
  for (const KnownReport &report : knownReports()) {
    EXPECT_EQ(findReport(std::uint32_t{report.id}), &report);
    EXPECT_EQ(findReport(report.name), &report);
    EXPECT_EQ(findReport(std::to_string(report.id)), &report);
    EXPECT_EQ(findReport(test::printed("0x%02x", unsigned{report.id})), &report);
    EXPECT_EQ(findReport(test::printed("0X%02X", unsigned{report.id})), &report);
  }
  for (const std::string_view nothing : {"", "0x", "E0", "0xE0 ", "256", "-32", "0x1E0", "4294967520", "summary"})
    EXPECT_EQ(findReport(nothing), nullptr) << nothing;
  EXPECT_EQ(findReport(0x1E0u), nullptr);
}

}  // namespace
