// usbmon text: requests and answers, and the 32 bytes that it shows.
#include "tests/host/ReadInput.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

const std::string kAsk = "ffff888100000001 1001000 S Ci:1:007:0 s a1 01 03e0 0000 0007 7 <\n";
const std::string kAnswer = "ffff888100000001 1001500 C Ci:1:007:0 0 7 = e00d0500 214024\n";
const std::string kSummary = bytesOf("e00d0500214024");

TEST(UsbmonTextInput, PairsRequestAndAnswer) {
  const std::string text = kAsk + kAnswer + "ffff888100000002 1002000 S Ii:1:007:1 -115:8 2064 <\n";
  EXPECT_EQ(detectedKind(text), "usbmon-text");
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.messages, IsEmpty());
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary));
  const Found &report = result.reports[0];
  EXPECT_EQ(report.id, 0xE0u);
  EXPECT_EQ(report.type, ReportType::kFeature);
  EXPECT_FALSE(report.typeGuessed);
  EXPECT_EQ(report.place, "2");
  EXPECT_EQ(report.timeNs, 500'000);
  EXPECT_EQ(report.device, "1.7");
}

TEST(UsbmonTextInput, TakesTheTypeFromTheRequest) {
  const ReadResult result =
      readInput("aa 5 S Ci:2:010:0 s a1 01 0176 0000 0318 4 <\naa 6 C Ci:2:010:0 0 4 = 76010203\n");
  EXPECT_EQ(result.reports.at(0).type, ReportType::kInput);
  EXPECT_EQ(result.reports.at(0).device, "2.10");
  EXPECT_THAT(readInput("aa 5 S Ci:2:010:0 s a1 01 0476 0000 0318 4 <\naa 6 C Ci:2:010:0 0 4 = 76010203\n").said(),
              ElementsAre("bad-input 2"));
  EXPECT_THAT(readInput("aa 5 S Ci:2:010:0 s a1 01 0076 0000 0318 4 <\naa 6 C Ci:2:010:0 0 4 = 76010203\n").said(),
              ElementsAre("bad-input 2"));
}

TEST(UsbmonTextInput, ReadsTheFormWithoutABus) {
  const ReadResult result = readInput("aa 5 S Ci:007:00 s a1 01 03de 0000 0002 2 <\naa 6 C Ci:007:00 0 2 = de01\n");
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("de01")));
  EXPECT_EQ(result.reports[0].device, "7");
}

TEST(UsbmonTextInput, LinesThatAreNoEventsGiveNothingAndHideNothing) {
  for (const std::string line :
       {"aa 4294967296 C Ci:1:007:0 0 2 = de01", "aa 5 C Xi:1:007:0 0 2 = de01", "aa 5 C Cx:1:007:0 0 2 = de01",
        "aa 5 C C:1:007:0 0 2 = de01", "aa 5 C Ci:1:x:0 0 2 = de01", "aa 5 C Ci:1:007:x 0 2 = de01",
        "aa 5 Q Ci:1:007:0 0 2 = de01", "xx 5 C Ci:1:007:0 0 2 = de01"}) {
    const ReadResult result = readInput(kAsk + line + "\n" + kAnswer, "usbmon-text");
    EXPECT_THAT(result.bytes(), ElementsAre(kSummary)) << line;
    EXPECT_FALSE(result.messages.empty()) << line;
  }
}

TEST(UsbmonTextInput, RequestsWithImpossibleNumbersAreNone) {
  for (const std::string setup : {"1a1 01 03de", "a1 101 03de", "a1 01 103de", "a1 01 xx"}) {
    const ReadResult result =
        readInput("aa 5 S Ci:1:007:0 s " + setup + " 0000 0002 2 <\naa 6 C Ci:1:007:0 0 2 = de01\n", "usbmon-text");
    ASSERT_EQ(result.reports.size(), 1u) << setup;
    EXPECT_TRUE(result.reports[0].typeGuessed) << setup << ": an answer without a request that it knows";
  }
}

TEST(UsbmonTextInput, NamesTheLimitOf32Bytes) {
  const ReadResult result = readInput(
      "aa 5 S Ci:1:007:0 s a1 01 03e1 0000 03ff 1023 <\n"
      "aa 6 C Ci:1:007:0 0 1023 = e1000102 03040506 0708090a 0b0c0d0e 0f101112 13141516 1718191a 1b1c1d1e\n"
      "bb 7 C Ii:1:007:1 0:8 792 = 76000102 03040506 0708090a 0b0c0d0e 0f101112 13141516 1718191a 1b1c1d1e\n");
  EXPECT_THAT(result.reports, IsEmpty());
  EXPECT_THAT(result.said(), ElementsAre("cut-data 2", "cut-data 3"));
  EXPECT_EQ(result.messages[0].reportId, 0xE1u);
  EXPECT_EQ(result.messages[1].reportId, 0x76u);
  EXPECT_EQ(result.messages[0].exitCode, 4);
  EXPECT_THAT(result.messages[0].text, HasSubstr("32 of 1023 bytes"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("use a pcap"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("usbmon1"));
}

TEST(UsbmonTextInput, ReadsAsMuchAsItShows) {
  const ReadResult result = readInput(
      "aa 5 S Ci:1:007:0 s a1 01 03df 0000 0019 25 <\n"
      "aa 6 C Ci:1:007:0 0 25 = df010203 04050607 08090a0b 0c0d0e0f 10111213 14151617 18\n");
  EXPECT_THAT(result.bytes(), ElementsAre(numbered(0xDF, 25)));
}

TEST(UsbmonTextInput, TellsWhatFailed) {
  const ReadResult result = readInput(kAsk + "ffff888100000001 1001500 C Ci:1:007:0 -32 0\n" + kAsk +
                                      "ffff888100000001 1001500 C Ci:1:007:0 0 0\n" + kAsk +
                                      "ffff888100000001 1001500 E Ci:1:007:0 -19 0\n" + kAsk);
  // A submission that fails is no answer, whatever its status says.
  EXPECT_THAT(readInput(kAsk + "ffff888100000001 1001500 E Ci:1:007:0 0 0\n").said(),
              ElementsAre("failed-read 2", "no-reports"));
  EXPECT_THAT(result.said(),
              ElementsAre("failed-read 2", "empty-read 4", "failed-read 6", "unanswered-read 7", "no-reports"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("-32"));
  EXPECT_EQ(result.messages[0].reportId, 0xE0u);
}

TEST(UsbmonTextInput, TagsAreUsedAgain) {
  const ReadResult result = readInput(kAsk +
                                      "ffff888100000001 1001100 S Ci:1:007:0 s a1 01 03de 0000 0002 2 <\n"
                                      "ffff888100000001 1001200 C Ci:1:007:0 0 2 = de01\n");
  EXPECT_THAT(result.bytes(), ElementsAre(bytesOf("de01")));
  EXPECT_THAT(result.said(), ElementsAre("unanswered-read 1"));
}

TEST(UsbmonTextInput, GuessesTheTypeOfAnAnswerWithoutItsRequest) {
  const ReadResult result = readInput(kAnswer);
  EXPECT_EQ(result.reports.at(0).type, ReportType::kFeature);
  EXPECT_TRUE(result.reports.at(0).typeGuessed);
  EXPECT_THAT(readInput("aa 1 C Ci:1:007:0 0 18 = 12011002 00000040 34127856 00010102 0301\n" + kAnswer).said(),
              ElementsAre("usbmon-summary"));
}

TEST(UsbmonTextInput, WarnsOfAnotherIdThanAsked) {
  const ReadResult result = readInput(kAsk + "ffff888100000001 1001500 C Ci:1:007:0 0 2 = de01\n");
  EXPECT_EQ(result.reports.at(0).id, 0xE0u);
  EXPECT_EQ(result.reports.at(0).bytes, bytesOf("de01"));
  EXPECT_THAT(result.said(), ElementsAre("wrong-report-id 2"));
}

TEST(UsbmonTextInput, LearnsVendorAndProduct) {
  const ReadResult result = readInput(
      "aa 1 S Ci:1:007:0 s 80 06 0100 0000 0012 18 <\n"
      "aa 2 C Ci:1:007:0 0 18 = 12011002 00000040 34127856 00010102 0301\n" +
      kAsk + kAnswer);
  EXPECT_EQ(result.reports.at(0).vendorProduct, 0x12345678u);
  EXPECT_EQ(result.reports.at(0).timeNs, 1'001'499'000);
}

TEST(UsbmonTextInput, LearnsFromWholeDeviceDescriptorsAlone) {
  for (const std::string exchange :
       {"aa 1 S Ci:1:007:0 s 80 06 0200 0000 0012 18 <\n"
        "aa 2 C Ci:1:007:0 0 18 = 12021002 00000040 34127856 00010102 0301\n",
        "aa 1 S Ci:1:007:0 s 80 06 0100 0000 0008 8 <\naa 2 C Ci:1:007:0 0 8 = 12011002 00000040\n"})
    EXPECT_EQ(readInput(exchange + kAsk + kAnswer).reports.at(0).vendorProduct, std::nullopt) << exchange;
}

TEST(UsbmonTextInput, LearnsOfNoMoreDevicesThanABusHas) {
  std::string text;
  for (int device = 100; device < 1200; ++device) {
    const std::string address = "Ci:1:" + std::to_string(device) + ":0 ";
    text += "aa 1 S " + address + "s 80 06 0100 0000 0012 18 <\n";
    text += "aa 2 C " + address + "0 18 = 12011002 00000040 34127856 00010102 0301\n";
    text += "aa 3 C " + address + "0 2 = de01\n";
  }
  const ReadResult result = readInput(text);
  ASSERT_EQ(result.reports.size(), 1100u);
  EXPECT_EQ(result.reports[1023].vendorProduct, 0x12345678u);
  EXPECT_EQ(result.reports[1024].vendorProduct, std::nullopt);
}

TEST(UsbmonTextInput, UnwrapsItsClock) {
  const ReadResult result = readInput(
      "aa 4294967000 S Ci:1:007:0 s a1 01 03de 0000 0002 2 <\naa 704 C Ci:1:007:0 0 2 = de01\n"
      "aa 700 S Ci:1:007:0 s a1 01 03de 0000 0002 2 <\naa 702 C Ci:1:007:0 0 2 = de01\n");
  ASSERT_EQ(result.reports.size(), 2u);
  EXPECT_EQ(result.reports[0].timeNs, 1'000'000);
  EXPECT_EQ(result.reports[1].timeNs, 998'000);
}

TEST(UsbmonTextInput, PassesOverEmptyLinesAndComments) {
  const ReadResult result = readInput("\n# bus 1\n" + kAsk + " \t\n" + kAnswer);
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary));
  EXPECT_THAT(result.messages, IsEmpty());
}

TEST(UsbmonTextInput, AnswersThatAreNoReportsAreMissedByNobody) {
  const std::string descriptor = "aa 1 S Ci:1:007:0 s 80 06 0100 0000 0012 18 <\n";
  EXPECT_THAT(readInput(descriptor + descriptor + kAsk + kAnswer).messages, IsEmpty());
  EXPECT_THAT(readInput(kAsk + kAnswer + "aa 9 C Co:1:007:0 0 2 >\naa 9 C Ci:1:007:0 0 0\n").messages, IsEmpty());
}

TEST(UsbmonTextInput, DataWithoutARequestAreReportsOnlyWhereTheyCanBe) {
  for (const std::string line : {"aa 1 C Bi:1:009:1 0 2 = de01", "aa 1 C Ci:1:007:0 0 2 = e00d",
                                 "aa 1 C Ii:1:007:1 0:8 2 = de01", "aa 1 C Ii:1:007:1 0:8 2"}) {
    const ReadResult result = readInput(kAsk + kAnswer + line + "\n");
    EXPECT_THAT(result.bytes(), ElementsAre(kSummary)) << line;
    ASSERT_THAT(result.said(), ElementsAre("usbmon-summary")) << line;
    EXPECT_THAT(result.messages[0].text, testing::StartsWith("1 transfers hold no report")) << line;
  }
}

TEST(UsbmonTextInput, TellsInputReportsThatComeInPieces) {
  const std::string piece =
      "aa 9 C Ii:1:007:1 0:8 64 = 76000700 05000000 00000000 00000000 00000000 00000000 00000000 00000000\n";
  const ReadResult result = readInput(kAsk + kAnswer + piece);
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary));
  EXPECT_THAT(result.said(), ElementsAre("incomplete-report 3", "usbmon-summary"));
  EXPECT_EQ(result.messages[0].reportId, 0x76u);
  EXPECT_THAT(result.messages[0].text, HasSubstr("64 of 792 bytes"));
  // Small ones are the controller's where something else has shown that the device is.
  const std::string small = "aa 9 C Ii:1:007:1 0:8 8 = 76000700 05000000\n";
  EXPECT_THAT(readInput(kAsk + kAnswer + small).said(), ElementsAre("incomplete-report 3", "usbmon-summary"));
  EXPECT_THAT(readInput(small).said(), ElementsAre("usbmon-summary", "no-reports"));
}

TEST(UsbmonTextInput, RemembersNoMoreDevicesThanABusHas) {
  std::string text;
  for (int device = 100; device < 1200; ++device) {
    const std::string address = "Ci:1:" + std::to_string(device) + ":0 ";
    text += "aa 1 S " + address + "s a1 01 03de 0000 0002 2 <\naa 2 C " + address + "0 2 = de01\n";
  }
  const auto small = [](const char *device) {
    return "aa 9 C Ii:1:" + std::string(device) + ":1 0:8 8 = 76000700 05000000\n";
  };
  EXPECT_THAT(readInput(text + small("100")).said(), ElementsAre("incomplete-report 2201", "usbmon-summary"));
  EXPECT_THAT(readInput(text + small("1199")).said(), ElementsAre("usbmon-summary"));
  // An answer to what is no report of ours shows nothing.
  EXPECT_THAT(
      readInput("aa 1 S Ci:1:007:0 s a1 01 0301 0000 0002 2 <\naa 2 C Ci:1:007:0 0 2 = 0102\n" + small("007")).said(),
      ElementsAre("usbmon-summary"));
}

TEST(UsbmonTextInput, TheUsersTypeIsNoGuess) {
  vesk::host::ReadOptions options;
  options.forcedType = ReportType::kInput;
  const ReadResult result = readInput(kAnswer, {}, options);
  EXPECT_EQ(result.reports.at(0).type, ReportType::kInput);
  EXPECT_FALSE(result.reports.at(0).typeGuessed);
}

TEST(UsbmonTextInput, CountsOtherTraffic) {
  const ReadResult result = readInput(
      "aa 1 C Ii:1:009:1 0:8 4 = 00ff0000\nbb 2 S Co:1:007:0 s 21 09 03de 0000 0002 2 = de01\n" + kAsk + kAnswer);
  EXPECT_EQ(result.reports.size(), 1u);
  EXPECT_THAT(result.said(), ElementsAre("usbmon-summary"));
  EXPECT_EQ(result.messages[0].exitCode, 0);
}

TEST(UsbmonTextInput, NamesSlips) {
  const ReadResult result = readInput(kAsk + "ffff888100000001 1001500 C Ci:1:007:0 0 7 = e00d0500 21402\n" + kAsk +
                                      "ffff888100000001 1001500 C Ci:1:007:0 0 6 = e00d0500 214024\n" + kAsk +
                                      "ffff888100000001 1001500 C Ci:1:007:0 0\nnothing like it\n" + kAsk + kAnswer);
  EXPECT_THAT(result.bytes(), ElementsAre(kSummary));
  EXPECT_THAT(result.said(), ElementsAre("bad-input 2", "bad-input 4", "bad-input 6", "unknown-line 7"));
  EXPECT_THAT(readInput(kAsk + "ffff888100000001 1001500 C Ci:1:007:0 0 7 = e00d0500 21402g\n").said(),
              ElementsAre("bad-input 2"));
}

TEST(UsbmonTextInput, BoundsTheRequestsThatWait) {
  std::string text;
  for (int i = 0; i < 5000; ++i) text += std::to_string(i) + " 5 S Ci:1:007:0 s a1 01 03e0 0000 0007 7 <\n";
  const ReadResult result = readInput(text + kAsk + kAnswer);
  EXPECT_EQ(result.reports.size(), 1u);
  EXPECT_EQ(result.messages.size(), 5000u);
}

TEST(UsbmonTextInput, EveryCutEndsWithAMessageOrTheReport) {
  const std::string text = kAsk + kAnswer;
  for (std::size_t size = 0; size < text.size(); ++size) {
    const ReadResult result = readInput(text.substr(0, size), "usbmon-text");
    EXPECT_TRUE(!result.reports.empty() || !result.messages.empty()) << size;
    for (const Found &report : result.reports) EXPECT_EQ(report.bytes, kSummary);
  }
}

}  // namespace
}  // namespace test
