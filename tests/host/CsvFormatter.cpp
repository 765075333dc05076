// CSV: samples as rows, and the refusal of trees.
#include "host/output/CsvFormatter.h"

#include <bit>

#include "tests/host/Formatting.h"

namespace {

using test::format;
using test::given;
using test::Given;
using test::put;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr std::string_view kHeader =
    "file,index,time,device,report,number,channel,d_scan_i,d_scan_q,p_scan_i,p_scan_q,payload,i,q,value";

std::vector<std::string> linesOf(const std::string &text) {
  std::vector<std::string> lines;
  for (std::size_t begin = 0; begin < text.size();) {
    const std::size_t end = text.find('\n', begin);
    lines.push_back(text.substr(begin, end - begin));
    begin = end + 1;
  }
  return lines;
}

std::string zeros(unsigned id, std::size_t size) {
  std::string bytes(size, '\0');
  bytes[0] = static_cast<char>(id);
  return bytes;
}

TEST(Csv, sensorImageHasOneRowAChannel) {
  std::string bytes = zeros(0x76, 792);
  put(bytes, 4, 4000000000, 4);             // frame number
  put(bytes, 16 + 4 * 3, 0xFFFFFFFF, 4);    // D-SCAN I, channel 3
  put(bytes, 208 + 4 * 3, 17, 4);           // D-SCAN Q
  put(bytes, 400 + 4 * 47, 0x80000000, 4);  // P-SCAN I, channel 47
  put(bytes, 592 + 4 * 47, 0x7FFFFFFF, 4);  // P-SCAN Q
  Given report = given(bytes, 2);
  report.report.timeNs = 1'500'000'000;
  report.report.device = "1.7";
  const auto lines = linesOf(format("csv", {report}).text);
  ASSERT_EQ(lines.size(), 49u);
  EXPECT_EQ(lines[0], kHeader);
  EXPECT_EQ(lines[1], "f,2,1.5,1.7,sensor-image,4000000000,0,0,0,0,0,,,,");
  EXPECT_EQ(lines[4], "f,2,1.5,1.7,sensor-image,4000000000,3,-1,17,0,0,,,,");
  EXPECT_EQ(lines[48], "f,2,1.5,1.7,sensor-image,4000000000,47,0,0,-2147483648,2147483647,,,,");
}

TEST(Csv, dumpPacketHasOneRowAWord) {
  std::string bytes = zeros(0x77, 2064);
  put(bytes, 4, 9, 4);
  put(bytes, 16 + 4 * 511, 0xDEADBEEF, 4);
  const auto lines = linesOf(format("csv", {given(bytes)}).text);
  ASSERT_EQ(lines.size(), 513u);
  EXPECT_EQ(lines[1], "f,0,,,adc-dump-packet,9,0,,,,,0,,,");
  EXPECT_EQ(lines[512], "f,0,,,adc-dump-packet,9,511,,,,,3735928559,,,");
}

TEST(Csv, openShortDataAndParametersHaveTheirColumns) {
  std::string p = zeros(0xE5, 401);
  put(p, 9, 0xFFFFFFFF, 4);
  put(p, 201, 5, 4);
  std::string baseline = zeros(0xA2, 193), thresholds = zeros(0xEC, 193);
  put(baseline, 1, std::bit_cast<std::uint32_t>(0.1f), 4);
  put(baseline, 5, 0x7FC00000, 4);
  put(thresholds, 189, std::bit_cast<std::uint32_t>(-1.0f / 0.0f), 4);
  const auto lines =
      linesOf(format("csv", {given(zeros(0xE4, 401)), given(p), given(baseline), given(thresholds)}).text);
  ASSERT_EQ(lines.size(), 1u + 4 * 48);
  EXPECT_EQ(lines[1], "f,0,,,open-short-data-d,,0,,,,,,0,0,");
  EXPECT_EQ(lines[49], "f,0,,,open-short-data-p,,0,,,,,,4294967295,5,");
  EXPECT_EQ(lines[97], "f,0,,,algorithm-baseline,,0,,,,,,,,0.1");
  EXPECT_EQ(lines[98], "f,0,,,algorithm-baseline,,1,,,,,,,,nan");
  EXPECT_EQ(lines[192], "f,0,,,noisy-pixel-thresholds,,47,,,,,,,,-inf");
}

TEST(Csv, everyRowHasAsManyCellsAsTheHeader) {
  for (const auto &[id, size] :
       {std::pair{0x76u, 792u}, {0x77u, 2064u}, {0xE4u, 401u}, {0xE5u, 401u}, {0xA2u, 193u}, {0xECu, 193u}})
    for (const std::string &line : linesOf(format("csv", {given(zeros(id, size))}).text))
      ASSERT_EQ(std::count(line.begin(), line.end(), ','), std::count(kHeader.begin(), kHeader.end(), ',')) << line;
}

TEST(Csv, treesAreRefusedByName) {
  const auto formatted = format("csv", {given(test::fromHex("E0 0D 05 00 21 40 24"))});
  EXPECT_EQ(formatted.text, std::string(kHeader) + "\n");
  EXPECT_THAT(formatted.codes, ElementsAre("no-csv"));
}

TEST(Csv, whatWasNotDecodedHasNoRowAndNoSecondMessage) {
  const auto formatted = format("csv", {given(zeros(0x76, 791))});
  EXPECT_EQ(formatted.text, std::string(kHeader) + "\n");
  EXPECT_THAT(formatted.codes, IsEmpty());
}

TEST(Csv, namesAreQuotedWhereTheyMust) {
  Given report = given(zeros(0xA2, 193));
  report.report.file = "a,\"b\"\n\xFF";
  EXPECT_THAT(format("csv", {report}).text,
              testing::HasSubstr("\n\"a,\"\"b\"\"\n\xEF\xBF\xBD\",0,,,algorithm-baseline,"));
}

}  // namespace
