// HID recordings: those of each writer, several devices, our own lines, and what is wrong in them.
#include "tests/host/ReadInput.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

const std::string kImage = numbered(0x76, 792), kPacket = numbered(0x77, 2064);

TEST(HidRecordingInput, ReadsThePythonWriter) {
  const std::string text =
      "# Example Vendor Device\n"
      "# 0x06, 0x00, 0xff,              // Usage Page (Vendor Defined Page 1)  0\n"
      "# 0x09, 0x01,                    // Usage (Vendor Usage 1)              3\n"
      "R: 41 06 00 ff 09 01 a1 01 85 76 09 02 15 00 26 ff 00 75 08 96 17 03 81 02 85 77 09 03 96 0f 08 81 02 85 e0 09 "
      "04 95 06 b1 02 c0\n"
      "N: Example Vendor Device\n"
      "I: 3 1234 5678\n"
      "# ReportID: 118 / Vendor Usage 2:    0 ,    7 ,   14\n"
      "E: 000000.000000 792 " +
      digitsOf(kImage) +
      "\n"
      "# ReportID: 119 / 0xff000003:    0 ,    3\n"
      "E: 000002.500135 2064 " +
      digitsOf(kPacket) + "\n";
  EXPECT_EQ(detectedKind(text), "hid-recording");
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.messages, IsEmpty());
  EXPECT_THAT(result.bytes(), ElementsAre(kImage, kPacket));
  EXPECT_EQ(result.reports[0].place, "8");
  EXPECT_EQ(result.reports[0].type, ReportType::kInput);
  EXPECT_FALSE(result.reports[0].typeGuessed);
  EXPECT_EQ(result.reports[0].device, "0");
  EXPECT_EQ(result.reports[0].vendorProduct, 0x12345678u);
  EXPECT_EQ(result.reports[0].timeNs, 0);
  EXPECT_EQ(result.reports[1].timeNs, 2'500'135'000);
  EXPECT_EQ(result.reports[1].index, 1u);
}

TEST(HidRecordingInput, ReadsTheCWriter) {
  const std::string text =
      "D: 0\nR: 4 06 00 ff c0\nN: Example\nP: usb-0000:00:14.0-1/input0\nI: 3 046d c24e\n"
      "D: 0\nE: 0.000000 3 76 02 03\nE: 12.000007 3 76 04 05\n";
  EXPECT_EQ(detectedKind(text), "hid-recording");
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.messages, IsEmpty());
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("760203"), bytesOf("760405")));
  EXPECT_EQ(result.reports[1].timeNs, 12'000'007'000);
  EXPECT_EQ(result.reports[1].vendorProduct, 0x046DC24Eu);
}

TEST(HidRecordingInput, ReadsTheRustWriter) {
  const std::string text =
      "# Example\n# 0x06, 0x00, 0xff,  // Usage Page\nR: 4 06 00 ff c0\nN: Example\nI: 3 46d c52b\n"
      "# Current time: 12:34:56\nB: 000000.000000 3 76 00 00 \nE: 000000.000000 3 76 02 03 \n";
  EXPECT_EQ(detectedKind(text), "hid-recording");
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("760203")));
  EXPECT_EQ(result.reports[0].vendorProduct, 0x046DC52Bu);
  EXPECT_THAT(result.said(), ElementsAre("before-filter 7"));
  EXPECT_EQ(result.messages[0].exitCode, 0);
}

TEST(HidRecordingInput, ReadsOurFeatureReports) {
  const ReadResult result =
      readInput("I: 3 1234 5678\nF: 000003.000412 7 e0 0d 05 00 21 40 24\nE: 000003.000413 2 76 01\n");
  EXPECT_THAT(result.messages, IsEmpty());
  ASSERT_EQ(result.reports.size(), 2u);
  EXPECT_EQ(result.reports[0].bytes, bytesOf("e00d0500214024"));
  EXPECT_EQ(result.reports[0].type, ReportType::kFeature);
  EXPECT_FALSE(result.reports[0].typeGuessed);
  EXPECT_EQ(result.reports[0].timeNs, 3'000'412'000);
  EXPECT_EQ(result.reports[1].type, ReportType::kInput);
}

TEST(HidRecordingInput, KeepsDevicesApart) {
  const ReadResult result = readInput(
      "D: 0\nR: 4 05 01 09 02\nN: First\nI: 3 046d c24e\nD: 1\nR: 4 06 00 ff c0\nN: Second\nI: 18 1234 5678\n"
      "D: 0\nE: 000000.000000 3 01 02 03\nD: 1\nF: 000000.004120 7 e0 0d 05 00 21 40 24\nE: 000000.004121 1 76\n");
  EXPECT_THAT(result.messages, IsEmpty());
  ASSERT_EQ(result.reports.size(), 3u);
  EXPECT_EQ(result.reports[0].device, "0");
  EXPECT_EQ(result.reports[0].vendorProduct, 0x046DC24Eu);
  EXPECT_EQ(result.reports[1].device, "1");
  EXPECT_EQ(result.reports[1].vendorProduct, 0x12345678u);
  EXPECT_EQ(result.reports[2].device, "1");
  EXPECT_EQ(result.reports[2].timeNs, 4'121'000);
}

TEST(HidRecordingInput, LinesBeforeAnyDeviceBelongToTheFirst) {
  const ReadResult result = readInput("N: x\nE: 0.5 1 76\nD: 7\nE: 0.6 1 76\n");
  ASSERT_EQ(result.reports.size(), 2u);
  EXPECT_EQ(result.reports[0].device, "0");
  EXPECT_EQ(result.reports[0].vendorProduct, std::nullopt);
  EXPECT_EQ(result.reports[0].timeNs, 500'000'000);
  EXPECT_EQ(result.reports[1].device, "7");
}

TEST(HidRecordingInput, TakesTimesThatGoBack) {
  const ReadResult result = readInput("N: x\nE: 086399.999999 1 76\nE: 000000.000003 1 76\n");
  ASSERT_EQ(result.reports.size(), 2u);
  EXPECT_EQ(result.reports[0].timeNs, 86'399'999'999'000);
  EXPECT_EQ(result.reports[1].timeNs, 3'000);
  EXPECT_THAT(result.said(), ElementsAre("time-backwards 3"));
}

TEST(HidRecordingInput, TakesAReportWithoutAPossibleTime) {
  const ReadResult result = readInput("N: x\nE: 18446744073709551615.000000 1 76\nE: -1.5 1 76\n");
  ASSERT_EQ(result.reports.size(), 2u);
  EXPECT_EQ(result.reports[0].timeNs, std::nullopt);
  EXPECT_THAT(result.said(), ElementsAre("bad-time 2", "bad-time 3"));
}

TEST(HidRecordingInput, RefusesLengthsThatLie) {
  const ReadResult result =
      readInput("N: x\nE: 0.0 4 76 01 02\nE: 0.0 2 76 01 02\nE: 0.0 4294967296 76\nE: 0.0 1 76\n");
  EXPECT_THAT(result.bytes(), ElementsAre("v"));
  EXPECT_THAT(result.said(), ElementsAre("length-mismatch 2", "length-mismatch 3", "length-mismatch 4"));
  EXPECT_EQ(result.messages[0].text, "the line says 4 bytes and has 3; not decoded");
  EXPECT_EQ(result.messages[0].exitCode, 4);
}

TEST(HidRecordingInput, NamesSlips) {
  const ReadResult result = readInput(
      "N: x\nE: 0.0 2 76 0g\nE: 0.0 2 76 012\nE: 0.0\nE: 0 1 76\nE:\nE: 0.0 0\nI: 3 12345 1\nI: usb\nD: one\nD: "
      "99999999999999999999\nE: 0.0 1 7\n");
  EXPECT_THAT(result.reports, IsEmpty());
  EXPECT_THAT(result.said(),
              ElementsAre("bad-input 2", "bad-input 3", "bad-input 4", "bad-input 5", "bad-input 6", "bad-input 7",
                          "bad-input 8", "bad-input 9", "bad-input 10", "bad-input 11", "bad-input 12"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("\"0g\""));
  EXPECT_THAT(result.messages[2].text, HasSubstr("the length were expected"));
}

TEST(HidRecordingInput, NumbersThatAreTooLargeAreSlips) {
  const std::string report = "E: 000000.000000 2 de 01\n";
  for (const std::string line : {"D: 65536", "I: 10000 1234 5678", "I: 3 10000 5678", "I: 3 1234 10000", "I: 3 1234"}) {
    const ReadResult result = readInput("D: 0\n" + line + "\n" + report, "hid-recording");
    EXPECT_THAT(result.said(), ElementsAre("bad-input 2")) << line;
    ASSERT_EQ(result.reports.size(), 1u) << line;
    EXPECT_EQ(result.reports[0].device, "0") << line;
    EXPECT_EQ(result.reports[0].vendorProduct, std::nullopt) << line;
  }
}

TEST(HidRecordingInput, PassesOverUnknownLinesAndSaysSo) {
  const ReadResult result = readInput("N: x\n\nX: 1 2 3\nhello\n  \t\nE: 0.0 1 76\r\n");
  EXPECT_THAT(result.bytes(), ElementsAre("v"));
  EXPECT_THAT(result.said(), ElementsAre("unknown-line 3", "unknown-line 4"));
  EXPECT_EQ(result.messages[0].exitCode, 0);
}

TEST(HidRecordingInput, IsKnownBehindALongDescriptorInComments) {
  std::string text = "# Example\n";
  while (text.size() < 10000) text += "# 0x09, 0x01,                    // Usage (Vendor Usage 1)              3\n";
  text += "R: 1 c0\nN: x\nI: 3 1 2\nE: 0.0 1 76\n";
  EXPECT_EQ(detectedKind(text), "hid-recording");
  EXPECT_THAT(readInput(text).bytes(), ElementsAre("v"));
}

TEST(HidRecordingInput, OtherTextsAreNoRecordings) {
  EXPECT_NE(detectedKind("# comment\ne0 0d 05\n"), "hid-recording");
  EXPECT_NE(detectedKind("Re: your letter\n"), "hid-recording");
  EXPECT_NE(detectedKind("E0: 0d\n"), "hid-recording");
  EXPECT_NE(detectedKind("X: 0d\n"), "hid-recording");
  EXPECT_NE(detectedKind("# 0x05, 0x0d\n"), "hid-recording");
  EXPECT_EQ(detectedKind("\n  \nE: 0.0 1 76\n"), "hid-recording");
}

TEST(HidRecordingInput, BoundsTheDevices) {
  std::string text = "N: x\n";
  for (int i = 0; i < 300; ++i) text += "D: " + std::to_string(i) + "\n";
  const ReadResult result = readInput(text + "E: 0.0 1 76\n");
  EXPECT_EQ(result.said().size(), 44u);
  EXPECT_EQ(result.said()[0], "too-many-devices 258");
  EXPECT_EQ(result.reports.at(0).device, "255");
  // One of those that are kept apart may come again.
  EXPECT_EQ(readInput(text + "D: 7\nE: 0.0 1 76\n").reports.at(0).device, "7");
}

TEST(HidRecordingInput, BoundsAReport) {
  const ReadResult result = readInput("N: x\nE: 0.0 65537 " + digitsOf(std::string(65537, 'v')) + "\n");
  EXPECT_THAT(result.said(), ElementsAre("bad-input 2"));
}

TEST(HidRecordingInput, ARecordingWithoutReportsIsSaidToBe) {
  EXPECT_THAT(readInput("R: 1 c0\nN: x\nI: 3 1 2\n").said(), ElementsAre("no-reports"));
}

TEST(HidRecordingInput, EveryCutGivesTheWholeReportsAndAMessage) {
  const std::string text = "D: 0\nI: 3 046d c24e\nE: 0.000000 3 76 02 03\nF: 12.000007 7 e0 0d 05 00 21 40 24\n";
  for (std::size_t size = 0; size < text.size(); ++size) {
    const ReadResult result = readInput(text.substr(0, size), "hid-recording");
    EXPECT_LE(result.reports.size(), 2u);
    EXPECT_TRUE(!result.reports.empty() || !result.messages.empty()) << size;
    for (const Found &report : result.reports)
      EXPECT_TRUE(report.bytes == bytesOf("760203") || report.bytes == bytesOf("e00d0500214024")) << size;
  }
}

}  // namespace
}  // namespace test
