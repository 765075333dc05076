// Raw binary: one report, many with --split, and what is no input at all.
#include "tests/host/ReadInput.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

ReadResult readSplit(std::string_view content) {
  vesk::host::ReadOptions options;
  options.split = true;
  return readInput(content, "raw", options);
}

// Every report with the length that its ID tells.
const std::vector<std::pair<unsigned, std::size_t>> kLengths = {
    {0x76, 792}, {0x77, 2064}, {0xDC, 25},  {0xDE, 2},   {0xE0, 7},   {0xE1, 1023}, {0xEA, 1023}, {0xE2, 241},
    {0xE3, 57},  {0xE4, 401},  {0xE5, 401}, {0xA2, 193}, {0xEC, 193}, {0xDF, 25},   {0xA9, 49}};

TEST(RawBinaryInput, ReadsOneReport) {
  const std::string image = numbered(0x76, 792);
  EXPECT_EQ(detectedKind(image), "raw");
  const ReadResult result = readInput(image);
  EXPECT_THAT(result.bytes(), ElementsAre(image));
  EXPECT_THAT(result.messages, IsEmpty());
  EXPECT_EQ(result.reports[0].place, "offset 0");
  EXPECT_EQ(result.reports[0].id, 0x76u);
  EXPECT_EQ(result.reports[0].type, ReportType::kInput);
  EXPECT_TRUE(result.reports[0].typeGuessed);
}

TEST(RawBinaryInput, ReadsAReportWithoutAnyZero) {
  const std::string summary = bytesOf("e00d0501214024");
  EXPECT_EQ(detectedKind(summary), "raw");
  EXPECT_THAT(readInput(summary).bytes(), ElementsAre(summary));
}

TEST(RawBinaryInput, TellsReportsThatLookLikeMany) {
  const std::string two = numbered(0xE0, 7) + numbered(0xDE, 2);
  const ReadResult result = readInput(two);
  EXPECT_THAT(result.bytes(), ElementsAre(two));
  EXPECT_THAT(result.said(), ElementsAre("raw-many-reports offset 0"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("2 reports"));
  EXPECT_EQ(result.messages[0].exitCode, 0);
  EXPECT_THAT(readInput(numbered(0xE0, 8)).messages, IsEmpty());
}

TEST(RawBinaryInput, RefusesWhatIsLongerThanAnyReport) {
  const ReadResult result = readInput(std::string(65537, '\0'));
  EXPECT_THAT(result.reports, IsEmpty());
  EXPECT_THAT(result.said(), ElementsAre("raw-too-long offset 0"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("--split"));
  EXPECT_EQ(readInput(std::string(65536, '\0')).reports.size(), 1u);
}

TEST(RawBinaryInput, SplitsEveryReportByItsId) {
  std::string all;
  std::vector<std::string> expected;
  for (const auto &[id, length] : kLengths) {
    expected.push_back(numbered(id, length));
    all += expected.back();
  }
  const ReadResult result = readSplit(all);
  EXPECT_EQ(result.bytes(), expected);
  EXPECT_THAT(result.messages, IsEmpty());
  EXPECT_EQ(result.reports[1].place, "offset 792");
  EXPECT_EQ(result.reports[2].place, "offset 2856");
  EXPECT_EQ(result.reports[2].index, 2u);
}

TEST(RawBinaryInput, SplitsTextsBehindTheirZeros) {
  const std::string text = std::string("\xd0") + "one" + std::string(1, '\0');
  const std::string padded = std::string("\xd2") + "two" + std::string(60, '\0');
  const std::string state = bytesOf("de01");
  EXPECT_THAT(readSplit(text + padded + state).bytes(), ElementsAre(text, padded, state));
  EXPECT_THAT(readSplit(state + "\xd0three").bytes(), ElementsAre(state, "\xd0three"));
}

TEST(RawBinaryInput, HandsOverALastReportThatIsCut) {
  EXPECT_THAT(readSplit(numbered(0xDE, 2) + numbered(0xE1, 500)).bytes(),
              ElementsAre(numbered(0xDE, 2), numbered(0xE1, 500)));
}

TEST(RawBinaryInput, StopsAtAnUnknownId) {
  const ReadResult result = readSplit(numbered(0xE0, 7) + bytesOf("55 01 02"));
  EXPECT_THAT(result.bytes(), ElementsAre(numbered(0xE0, 7)));
  EXPECT_THAT(result.said(), ElementsAre("raw-no-report-id offset 7"));
  EXPECT_EQ(result.messages[0].reportId, 0x55u);
  EXPECT_EQ(result.messages[0].exitCode, 4);
  EXPECT_THAT(result.messages[0].text, HasSubstr("3 bytes were not read"));
  EXPECT_THAT(readSplit(numbered(0xE0, 7) + "\x55").messages.at(0).text, HasSubstr("; 1 byte was not read"));
}

TEST(RawBinaryInput, BoundsATextWithoutAnEnd) {
  const ReadResult result = readSplit("\xd0" + std::string(200000, 'A'));
  EXPECT_THAT(result.reports, IsEmpty());
  EXPECT_THAT(result.said(), ElementsAre("raw-too-long offset 0"));
}

TEST(RawBinaryInput, SplitsALongInputInSmallMemory) {
  std::string many;
  for (int i = 0; i < 3000; ++i) many += numbered(0x77, 2064);
  EXPECT_EQ(readSplit(many).reports.size(), 3000u);
}

TEST(RawBinaryInput, SaysThatATextIsNoInput) {
  for (const char *text : {"To whom it may concern\n", "{\"a\": true}\n", "v",
                           "\xef\xbb\xbfGr\xc3\xbc\xc3\x9f"
                           "e\n"}) {
    SCOPED_TRACE(text);
    EXPECT_EQ(detectedKind(text), "raw");
    const ReadResult result = readInput(text);
    EXPECT_THAT(result.reports, IsEmpty());
    EXPECT_THAT(result.said(), ElementsAre("unknown-input"));
    EXPECT_EQ(result.messages[0].exitCode, 3);
    EXPECT_THAT(result.messages[0].text, HasSubstr("hex text"));
  }
}

TEST(RawBinaryInput, SaysThatTextInUtf16IsNotRead) {
  for (const std::string_view text : {std::string_view("\xFF\xFE"
                                                       "E\0000\0",
                                                       6),
                                      std::string_view("\xFE\xFF\0E\0000", 6)}) {
    const ReadResult result = readInput(text);
    EXPECT_THAT(result.reports, IsEmpty());
    EXPECT_THAT(result.said(), ElementsAre("unknown-input"));
    EXPECT_THAT(result.messages[0].text, HasSubstr("UTF-16"));
    EXPECT_THAT(readInput(text, "raw").bytes(), ElementsAre(text));
  }
}

TEST(RawBinaryInput, TakesATextForAReportWhereTheUserSaysSo) {
  EXPECT_THAT(readInput("voice", "raw").bytes(), ElementsAre("voice"));
}

TEST(RawBinaryInput, NothingIsNoReport) {
  EXPECT_THAT(readInput("", "raw").said(), ElementsAre("no-reports"));
  EXPECT_THAT(readSplit("").said(), ElementsAre("no-reports"));
}

TEST(RawBinaryInput, EveryCutOfASplitInputLosesNothing) {
  std::string all;
  for (const auto &[id, length] : kLengths)
    if (length < 100) all += numbered(id, length);
  for (std::size_t size = 1; size <= all.size(); ++size) {
    std::string together;
    for (const std::string &bytes : readSplit(all.substr(0, size)).bytes()) together += bytes;
    EXPECT_EQ(together, all.substr(0, size));
  }
}

}  // namespace
}  // namespace test
