// The object: its tables and fields, both entry points, and what an unsupported report or a raising decoder leaves
// behind.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>
#include <stdexcept>

#include "tests/CaptureStdout.h"
#include "tests/Support.h"

namespace {

using test::captureStdout;
using test::Report;
using testing::ElementsAre;
using testing::Pair;

static_assert(!std::is_copy_constructible_v<HIDReportVeskPlugin> && !std::is_copy_assignable_v<HIDReportVeskPlugin>);
static_assert(HIDReportVeskPlugin::kInputReport == 0 && HIDReportVeskPlugin::kOutputReport == 1 &&
              HIDReportVeskPlugin::kFeatureReport == 2);

struct Row {
  std::uint32_t id;
  const char *decoder;
  const char *name;
};

const Row kFeatures[] = {
    {208, "parseVersion", "ersion"},
    {210, "parseVersionExtended", "ersionExtended"},
    {220, "parseAdcDumpConfig", "dcDumpConfig"},
    {222, "parseAdcDumpState", "dcDumpState"},
    {224, "parseBlackBoxSummary", "lackBoxSummary"},
    {225, "parseBlackBoxFullReport", "lackBoxFullReport"},
    {234, "parseBlackBoxFullReport", "lackBoxFullReport"},
    {226, "parseBlackBoxConfig", "lackBoxConfig"},
    {227, "parseOpenShortTest", "penShortTest"},
    {228, "parseOpenShortData", "penShortData"},
    {229, "parseOpenShortData", "penShortData"},
    {162, "parserVeskAlgBaselineRequest", "VeskAlgBaselineRequest"},
    {236, "parserNoisyPixelThresholdsRequest", "NoisyPixelThresholdsRequest"},
    {223, "parseWatchDogReport", "atchDogReport"},
    {169, "parsePowerModeStats", "owerModeStats"},
};

bool isFeature(std::uint32_t id) {
  return std::any_of(std::begin(kFeatures), std::end(kFeatures), [id](const Row &row) { return row.id == id; });
}

class Dispatch : public testing::Test {
 protected:
  std::unique_ptr<HIDReportVeskPlugin> plugin = HIDReportVeskPlugin::init();
  PaddedReport padded;

  ReportResult object(std::string_view bytes, std::uint32_t id, std::int32_t type) {
    padded.assign(bytes);
    return plugin->reportToObject(padded.data(), id, type, padded.length());
  }
  bool print(std::string_view bytes, std::uint32_t id, std::int32_t type, std::string &printed,
             std::exception_ptr *raised = nullptr) {
    padded.assign(bytes);
    bool result = false;
    printed = captureStdout([&] { result = plugin->parseReport(padded.data(), id, type, padded.length()); }, raised);
    return result;
  }
  void expectFields(const char *buf, std::uint32_t id, std::uint32_t type, std::int64_t length) {
    EXPECT_EQ(plugin->report_buf(), buf);
    EXPECT_EQ(plugin->report_id(), id);
    EXPECT_EQ(plugin->report_type(), type);
    EXPECT_EQ(plugin->report_len(), length);
  }
};

bool isNothing(const ReportResult &result) {
  return std::holds_alternative<std::monostate>(result);
}
bool isLines(const ReportResult &result) {
  return std::holds_alternative<DisplayLines>(result);
}
bool isValue(const ReportResult &result) {
  return std::holds_alternative<ReportValue>(result);
}

TEST_F(Dispatch, NewObject) {
  ASSERT_TRUE(plugin);
  EXPECT_FALSE(plugin->displayDecimal());
  EXPECT_FALSE(plugin->useStrings());
  expectFields(nullptr, 0, 0, 0);
}

TEST_F(Dispatch, Tables) {
  HIDReportVeskPlugin::ReportTable decoders, names;
  for (const Row &row : kFeatures) {
    decoders[row.id] = row.decoder;
    names[row.id] = row.name;
  }
  EXPECT_EQ(decoders.size(), 15u);
  EXPECT_EQ(plugin->reportIds(), decoders);
  EXPECT_EQ(plugin->reportIdNames(), names);
  EXPECT_THAT(plugin->inputReportIds(), ElementsAre(Pair(118, "parseVeskImage"), Pair(119, "parseAdcDumpPacket")));
  EXPECT_FALSE(plugin->reportIdNames().contains(0x76));
  EXPECT_FALSE(plugin->reportIdNames().contains(0x77));
}

TEST_F(Dispatch, Accessors) {
  plugin->setDisplayDecimal(true);
  EXPECT_TRUE(plugin->displayDecimal());
  EXPECT_FALSE(plugin->useStrings());
  plugin->setUseStrings(true);
  plugin->setDisplayDecimal(false);
  EXPECT_TRUE(plugin->useStrings());
  EXPECT_FALSE(plugin->displayDecimal());
  const char bytes[] = "x";
  plugin->setReport_buf(bytes);
  plugin->setReport_id(0xFFFFFFFF);
  plugin->setReport_type(0xFFFFFFFE);
  plugin->setReport_len(std::numeric_limits<std::int64_t>::min());
  expectFields(bytes, 0xFFFFFFFF, 0xFFFFFFFE, std::numeric_limits<std::int64_t>::min());
}

TEST_F(Dispatch, EveryIdOfEveryTable) {
  for (unsigned id = 0; id <= 0xFF; ++id) {
    const std::size_t size = id == 0x76 ? 792 : id == 0x77 ? 2064 : 1023;
    const std::string bytes = Report(id, size).text(1, id == 0xD2 ? "1\n2\n3\n4\n5\n6" : "1").bytes();
    EXPECT_EQ(isValue(object(bytes, id, 2)), isFeature(id)) << id;
    EXPECT_EQ(isValue(object(bytes, id, 0)), id == 0x76 || id == 0x77) << id;
    for (const std::int32_t type : {1, 3}) EXPECT_TRUE(isNothing(object(bytes, id, type))) << id;
  }
}

TEST_F(Dispatch, UnknownTypesAndIdsYieldNothingAndAreStored) {
  constexpr std::int32_t kMinimum = std::numeric_limits<std::int32_t>::min();
  constexpr std::int32_t kMaximum = std::numeric_limits<std::int32_t>::max();
  const std::pair<std::uint32_t, std::int32_t> calls[] = {
      {0xD0, 1},       {0xD0, 3},        {0xD0, -1},       {0xD0, -2},      {0xD0, 258}, {0xD0, 256},
      {0xD0, 65538},   {0xD0, kMinimum}, {0xD0, kMaximum}, {0xD0, 0},       {0x76, 2},   {0x77, 2},
      {0x76, 1},       {0x76, 3},        {0x00, 2},        {0xFF, 2},       {0x00, 0},   {0x1D0, 2},
      {0xFFFFFFD0, 2}, {0x176, 0},       {0xD1, 2},        {0x100000D0u, 2}};
  const std::string bytes = Report(0xD0, 792).text(1, "1").bytes();
  for (const auto &[id, type] : calls) {
    plugin->setUseStrings(false);
    padded.assign(bytes);
    EXPECT_TRUE(isNothing(plugin->reportToObject(padded.data(), id, type, 792 + std::int64_t{id})))
        << id << " " << type;
    expectFields(padded.data(), id, static_cast<std::uint32_t>(type), 792 + std::int64_t{id});
    EXPECT_TRUE(isNothing(plugin->runParser(padded.data(), id, type, -1)));
    expectFields(padded.data(), id, static_cast<std::uint32_t>(type), -1);
    EXPECT_FALSE(plugin->useStrings());
    std::string printed;
    EXPECT_FALSE(print(bytes, id, type, printed));
    EXPECT_EQ(printed, "");
    expectFields(padded.data(), id, static_cast<std::uint32_t>(type), 792);
    EXPECT_TRUE(plugin->useStrings());  // set before anything is looked up
  }
}

TEST_F(Dispatch, UnsupportedReportMayBeAbsent) {
  EXPECT_TRUE(isNothing(plugin->reportToObject(nullptr, 0xD0, 1, 0)));
  EXPECT_TRUE(isNothing(plugin->reportToObject(nullptr, 0x76, 0, 791)));  // the length is looked at first
}

TEST_F(Dispatch, ParseReportPrintsBetweenEmptyLinesAndStaysInStringMode) {
  const std::string bytes(
      "\xD0"
      "1.2.3\0",
      7);
  EXPECT_TRUE(isValue(object(bytes, 0xD0, 2)));
  std::string printed;
  EXPECT_TRUE(print(bytes, 0xD0, 2, printed));
  EXPECT_EQ(printed, "\n1.2.3\n\n");
  EXPECT_TRUE(plugin->useStrings());

  EXPECT_TRUE(isLines(object(bytes, 0xD0, 2)));
  EXPECT_TRUE(isLines(plugin->runParser(padded.data(), 0xD0, 2, 7)));
  EXPECT_EQ(captureStdout([&] {
              const char *bad[] = {"-x"};
              EXPECT_FALSE(plugin->parseArgs(1, bad));
            }).empty(),
            false);
  EXPECT_TRUE(isLines(object(bytes, 0xD0, 2)));  // a rejected option changes nothing
  EXPECT_TRUE(plugin->parseArgs(0, nullptr));
  EXPECT_TRUE(isValue(object(bytes, 0xD0, 2)));
}

TEST_F(Dispatch, ReportToObjectPrintsNothing) {
  for (const bool strings : {false, true}) {
    plugin->setUseStrings(strings);
    EXPECT_EQ(captureStdout([&] {
                object(std::string("\xD0"
                                   "1",
                                   3),
                       0xD0, 2);
              }),
              "");
    EXPECT_EQ(plugin->useStrings(), strings);
  }
}

TEST_F(Dispatch, InputReportOfTheWrongLengthPrintsNothing) {
  std::string printed;
  EXPECT_FALSE(print(Report(0x76, 791).bytes(), 0x76, 0, printed));
  EXPECT_EQ(printed, "");
  EXPECT_FALSE(print(Report(0x77, 2065).bytes(), 0x77, 0, printed));
  EXPECT_EQ(printed, "");
  EXPECT_TRUE(print(Report(0x76, 792).bytes(), 0x76, 0, printed));
  EXPECT_EQ(std::count(printed.begin(), printed.end(), '\n'), 42);
}

TEST_F(Dispatch, DecoderThatRaisesPrintsNothingAndLeavesAUsableObject) {
  std::string printed;
  std::exception_ptr raised;
  print(std::string("\xD0"
                    "1\xFF\0",
                    4),
        0xD0, 2, printed, &raised);
  ASSERT_TRUE(raised);
  EXPECT_THROW(std::rethrow_exception(raised), std::invalid_argument);
  EXPECT_EQ(printed, "");
  EXPECT_TRUE(plugin->useStrings());
  expectFields(padded.data(), 0xD0, 2, 4);
  EXPECT_TRUE(print(std::string("\xD0"
                                "ok\0",
                                4),
                    0xD0, 2, printed));
  EXPECT_EQ(printed, "\nok\n\n");
}

TEST_F(Dispatch, DecoderThatRaisesInObjectMode) {
  EXPECT_THROW(object(std::string("\xD2"
                                  "1\n2\n3\n4\n5\0",
                                  11),
                      0xD2, 2),
               std::out_of_range);
  EXPECT_FALSE(plugin->useStrings());
  expectFields(padded.data(), 0xD2, 2, 11);
  EXPECT_TRUE(isValue(object(std::string("\xD0"
                                         "ok\0",
                                         4),
                             0xD0, 2)));
}

TEST_F(Dispatch, PairsOfIdsShareADecoder) {
  for (const auto &[first, second, size] : {std::tuple{0xE1u, 0xEAu, 1023u}, {0xE4u, 0xE5u, 401u}}) {
    std::mt19937_64 random(first);
    const std::string body = Report(first, size).randomise(random).bytes();
    for (const bool strings : {false, true}) {
      plugin->setUseStrings(strings);
      ReportResult a = object(body, first, 2), b = object(body, second, 2);
      if (!strings) {
        EXPECT_TRUE(std::get<ReportValue>(a) == std::get<ReportValue>(b));
        continue;
      }
      test::Lines lines = test::linesOf(b);
      if (second == 0xE5)  // the titles are all that differs
        for (std::string &line : lines)
          if (const auto at = line.find("P-SCAN"); at != std::string::npos) line[at] = 'D';
      EXPECT_EQ(test::linesOf(a), lines);
    }
  }
}

TEST_F(Dispatch, TablesCanBeSet) {
  plugin->setReportIds({{1, "parseAdcDumpState"}});
  plugin->setInputReportIds({{2, "parseWatchDogReport"}, {0x1234, "parseAdcDumpState"}});
  const std::string bytes("\x01\x02", 2);
  EXPECT_EQ(std::get<ReportValue>(object(bytes, 1, 2)).as<vesk::Text>(), "CONTINUOUS");
  EXPECT_EQ(std::get<ReportValue>(object(bytes, 0x1234, 0)).as<vesk::Text>(), "CONTINUOUS");
  EXPECT_EQ(std::get<ReportValue>(object(bytes, 2, 0)).size(), 6u);
  EXPECT_TRUE(isNothing(object(bytes, 0xD0, 2)));
  EXPECT_TRUE(isNothing(object(bytes, 0x76, 0)));
  EXPECT_EQ(plugin->reportIdNames().size(), 15u);  // made once, by init
  EXPECT_EQ(HIDReportVeskPlugin::init()->reportIds().size(), 15u);
}

TEST_F(Dispatch, TableThatNamesAnUnknownDecoderRaises) {
  for (const char *name : {"parseNothing", "", "parseversion", "parseVersion ", "init"}) {
    plugin->setReportIds({{0xD0, name}});
    EXPECT_THROW(object("\xD0", 0xD0, 2), std::invalid_argument) << name;
    expectFields(padded.data(), 0xD0, 2, 1);
    std::string printed;
    std::exception_ptr raised;
    print("\xD0", 0xD0, 2, printed, &raised);
    EXPECT_TRUE(raised);
    EXPECT_EQ(printed, "");
    plugin->setUseStrings(false);
  }
}

TEST_F(Dispatch, UnknownDecoderIsNamedByWhatIsRaised) {
  plugin->setReportIds({{0xD0, "parseNothing"}});
  EXPECT_THAT([&] { object("\xD0", 0xD0, 2); },
              testing::ThrowsMessage<std::invalid_argument>("HIDReportVeskPlugin: no decoder is named parseNothing"));
}

TEST_F(Dispatch, ResultOutlivesTheReport) {
  ReportResult value = object(std::string("\xD0"
                                          "version\0",
                                          9),
                              0xD0, 2);
  plugin->setUseStrings(true);
  ReportResult lines = object(std::string("\xD0"
                                          "version\0",
                                          9),
                              0xD0, 2);
  padded.assign(std::string(1023, '\xFF'));
  plugin.reset();
  EXPECT_EQ(std::get<ReportValue>(value).as<vesk::Text>(), "version");
  EXPECT_THAT(test::linesOf(lines), ElementsAre("version"));
}

}  // namespace
