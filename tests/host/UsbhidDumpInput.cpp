// usbhid-dump's output: chunks, and the reports that they make.
#include "tests/host/ReadInput.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

/// A chunk as the program prints it.
std::string chunk(std::string_view bytes, const std::string &time = "1290272185.210022",
                  const std::string &address = "002:003:000", const char *entity = "STREAM          ") {
  std::string text = address + ":" + entity + "   " + time + "\n";
  for (std::size_t at = 0; at < bytes.size(); at += 16) text += " " + digitsOf(bytes.substr(at, 16), "%02X") + "\n";
  return text + "\n";
}

std::string chunks(std::string_view bytes, std::size_t size, const std::string &address = "002:003:000") {
  std::string text;
  for (std::size_t at = 0; at < bytes.size(); at += size)
    text += chunk(bytes.substr(at, size), "1290272185.210022", address);
  return text;
}

const std::string kImage = numbered(0x76, 792), kPacket = numbered(0x77, 2064);

TEST(UsbhidDumpInput, ReadsChunksAndTimes) {
  const std::string text =
      "002:003:000:DESCRIPTOR         1290272184.081322\n"
      " 05 01 09 02 A1 01 09 01 A1 00 05 09 19 01 29 03\n"
      " 15 00 25 01\n"
      "\n" +
      chunk(kImage, "1290272185.210022") + chunk(kPacket, "1290272187.210523");
  EXPECT_EQ(detectedKind(text), "usbhid-dump");
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.messages, IsEmpty());
  EXPECT_THAT(result.bytes(), ElementsAre(kImage, kPacket));
  EXPECT_EQ(result.reports[0].place, "5");
  EXPECT_EQ(result.reports[0].type, ReportType::kInput);
  EXPECT_FALSE(result.reports[0].typeGuessed);
  EXPECT_EQ(result.reports[0].device, "2.3");
  EXPECT_EQ(result.reports[0].timeNs, 0);
  EXPECT_EQ(result.reports[1].timeNs, 2'000'501'000);
}

TEST(UsbhidDumpInput, LinesThatAreAlmostHeadersAreNone) {
  for (const std::string header :
       {"002:003 000:STREAM             1290272185.210022", "002:003:000 STREAM             1290272185.210022",
        "00x:003:000:STREAM             1290272185.210022", "002:00x:000:STREAM             1290272185.210022",
        "002:003:00x:STREAM             1290272185.210022", "002:003:000:STREAMS            1290272185.210022",
        "002:003:000:STREAM             1290272185", "002:003:000:STREAM             1290272185.210022 x"}) {
    const ReadResult result = readInput(header + "\n DE 01\n\n" + chunk(kImage), "usbhid-dump");
    EXPECT_THAT(result.bytes(), ElementsAre(kImage)) << header;
    EXPECT_FALSE(result.messages.empty()) << header;
  }
}

TEST(UsbhidDumpInput, LeavesOutInterfacesBeyondTheMostThatItKeepsApart) {
  std::string text;
  for (int bus = 1; bus <= 257; ++bus) {
    char address[16];
    std::snprintf(address, sizeof address, "%03d:%03d:000", bus / 100 + 1, bus % 100 + 1);
    text += chunk(kImage, "1290272185.210022", address);
  }
  text += chunk(kPacket, "1290272186.210022", "001:002:000");
  const ReadResult result = readInput(text);
  EXPECT_EQ(result.reports.size(), 257u) << "256 images, and a packet of the first one";
  EXPECT_EQ(result.reports.back().bytes, kPacket);
  ASSERT_EQ(result.messages.size(), 1u);
  EXPECT_EQ(result.messages[0].code, "too-many-devices");
}

TEST(UsbhidDumpInput, PutsReportsTogetherForEveryPacketSize) {
  for (const std::size_t size : {8u, 16u, 32u, 64u, 512u, 1024u, 4096u}) {
    SCOPED_TRACE(size);
    const ReadResult result = readInput(chunks(kImage, size) + chunks(kPacket, size) + chunks(kImage, size));
    EXPECT_THAT(result.bytes(), ElementsAre(kImage, kPacket, kImage));
    EXPECT_THAT(result.messages, IsEmpty());
  }
}

TEST(UsbhidDumpInput, KeepsInterfacesApart) {
  std::string text;
  for (std::size_t at = 0; at < kImage.size(); at += 64) {
    text += chunk(std::string_view(kImage).substr(at, 64), "1.000000", "001:007:000");
    text += chunk(std::string_view(kImage).substr(at, 64), "1.000000", "001:007:001");
  }
  const ReadResult result = readInput(text);
  EXPECT_THAT(result.bytes(), ElementsAre(kImage, kImage));
  EXPECT_EQ(result.reports[0].device, "1.7");
}

TEST(UsbhidDumpInput, TellsAReportOfWhichAChunkIsMissing) {
  const std::string whole = chunks(kImage, 64), oneChunk = chunk(std::string(64, '\x01'));
  std::string lost = whole;
  lost.erase(oneChunk.size(), oneChunk.size());  // the second chunk
  const ReadResult result = readInput(lost + whole);
  EXPECT_THAT(result.bytes(), ElementsAre(kImage));
  EXPECT_THAT(result.said(), ElementsAre("incomplete-report 1", "other-transfers"));  // the last chunk is left over
  EXPECT_EQ(result.messages[0].reportId, 0x76u);
  EXPECT_EQ(result.messages[0].exitCode, 4);
  EXPECT_THAT(result.messages[0].text, HasSubstr("792 expected"));
}

TEST(UsbhidDumpInput, BeginsAgainWhereTheLastChunkIsMissing) {
  const ReadResult result = readInput(chunks(kImage.substr(0, 768), 64) + chunks(kImage, 64));
  EXPECT_THAT(result.bytes(), ElementsAre(kImage));
  EXPECT_THAT(result.said(), ElementsAre("incomplete-report 1"));
}

TEST(UsbhidDumpInput, TellsAReportThatTheEndCuts) {
  const ReadResult result = readInput(chunks(kPacket.substr(0, 640), 64));
  EXPECT_THAT(result.reports, IsEmpty());
  EXPECT_THAT(result.said(), ElementsAre("incomplete-report 1"));
  EXPECT_THAT(result.messages[0].text, HasSubstr("640 bytes came, 2064 expected"));
}

TEST(UsbhidDumpInput, CountsWhatOtherDevicesSend) {
  const ReadResult result =
      readInput(chunk(bytesOf("00ff0000"), "1.000000", "002:009:000") + chunk(kImage) + chunk(""));
  EXPECT_THAT(result.bytes(), ElementsAre(kImage));
  EXPECT_THAT(result.said(), ElementsAre("other-transfers"));
  EXPECT_EQ(result.messages[0].exitCode, 0);
  EXPECT_THAT(readInput(chunk(bytesOf("00ff0000"))).said(), ElementsAre("other-transfers", "no-reports"));
  // Feature reports come in no interrupt transfer, so these bytes only look like one.
  EXPECT_THAT(readInput(chunk(bytesOf("e00d0500214024"))).said(), ElementsAre("other-transfers", "no-reports"));
}

TEST(UsbhidDumpInput, PassesOverWhatTheProgramSays) {
  const ReadResult result = readInput("Starting dumping interrupt transfer stream\nwith 1 minute timeout.\n\n" +
                                      chunk(kImage) + "002:003:000:Interrupt transfer timed out\n");
  EXPECT_THAT(result.bytes(), ElementsAre(kImage));
  EXPECT_THAT(result.said(), ElementsAre("unknown-line 1", "unknown-line 2", ::testing::StartsWith("unknown-line")));
}

TEST(UsbhidDumpInput, DropsADamagedChunk) {
  std::string damaged = chunk(kImage);
  damaged[damaged.find(" 01 ") + 2] = 'x';
  const ReadResult result = readInput(damaged + chunk(kPacket));
  EXPECT_THAT(result.bytes(), ElementsAre(kPacket));
  EXPECT_THAT(result.said()[0], "bad-input 2");
}

TEST(UsbhidDumpInput, BoundsAChunk) {
  const ReadResult result = readInput(chunk(numbered(0x76, 70000)));
  EXPECT_THAT(result.reports, IsEmpty());
  EXPECT_THAT(result.said()[0], ::testing::StartsWith("bad-input"));
}

TEST(UsbhidDumpInput, EveryCutEndsWithAMessageOrTheReport) {
  const std::string text = chunk(bytesOf("0501"), "1.000000", "002:003:000", "DESCRIPTOR      ") + chunks(kImage, 512);
  for (std::size_t size = 0; size <= text.size(); ++size) {
    const ReadResult result = readInput(text.substr(0, size), "usbhid-dump");
    EXPECT_TRUE(!result.reports.empty() || !result.messages.empty()) << size;
    for (const Found &report : result.reports) EXPECT_EQ(report.bytes, kImage);
  }
}

}  // namespace
}  // namespace test
