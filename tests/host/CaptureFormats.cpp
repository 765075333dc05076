// The forms in which captures come: containers, byte orders, link types, and what is broken about them.
#include <algorithm>

#include "tests/host/CaptureBuilder.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using vesk::host::ReportType;

// One read of feature report 0xE0, as four writers store it. Another analyser reads the same from them.
const Bytes kUsbmonMmapped = hexBytes(R"(
d4c3b2a102000400000000000000000000000400dc00000000f15365e8030000
4000000040000000010000008188ffff530280070100003c00f1536500000000
e80300008dffffff0700000000000000a101e003000007000000000000000000
000200000000000000f15365dc0500004700000047000000010000008188ffff
4302800701002d0000f1536500000000dc050000000000000700000007000000
000000000000000000000000000000000002000000000000e00d0500214024)");
const Bytes kUsbmon = hexBytes(R"(
d4c3b2a102000400000000000000000000000400bd00000000f15365e8030000
3000000030000000010000008188ffff530280070100003c00f1536500000000
e80300008dffffff0700000000000000a101e0030000070000f15365dc050000
3700000037000000010000008188ffff4302800701002d0000f1536500000000
dc0500000000000007000000070000000000000000000000e00d0500214024)");
const Bytes kUsbpcap = hexBytes(R"(
d4c3b2a102000400000000000000000000000400f900000000f15365e8030000
24000000240000001c001000341201a0ffff000000001b000001000700800208
00000000a101e0030000070000f15365dc05000023000000230000001c001000
341201a0ffff000000000800010100070080020700000003e00d0500214024)");
const Bytes kPcapng = hexBytes(R"(
0a0d0d0a1c0000004d3c2b1a01000000ffffffffffffffff1c00000001000000
14000000dc0000000000040014000000060000006000000000000000240a0600
e8431e184000000040000000010000008188ffff530280070100003c00f15365
00000000e80300008dffffff0700000000000000a101e0030000070000000000
00000000000200000000000060000000060000006800000000000000240a0600
dc451e184700000047000000010000008188ffff4302800701002d0000f15365
00000000dc050000000000000700000007000000000000000000000000000000
000000000002000000000000e00d05002140240068000000)");

void expectTheSummary(const Outcome &outcome) {
  ASSERT_EQ(outcome.reports.size(), 1u);
  const HandedOver &report = outcome.reports[0];
  EXPECT_EQ(report.bytes, kSummary);
  EXPECT_EQ(report.id, 0xE0u);
  EXPECT_EQ(report.type, ReportType::kFeature);
  EXPECT_FALSE(report.typeGuessed);
  EXPECT_EQ(report.packet, 2u);
  EXPECT_EQ(report.index, 0u);
  EXPECT_EQ(report.timeNs, 500'000);
  EXPECT_EQ(report.device, "1.7");
  EXPECT_THAT(outcome.codes(), IsEmpty());
  EXPECT_EQ(outcome.summary(), "packets 2, reports 1, answers to requests 1");
}

TEST(CaptureFormats, ReadsWhatFourWritersStore) {
  for (const Bytes &file : {kUsbmonMmapped, kUsbmon, kUsbpcap, kPcapng}) {
    EXPECT_TRUE(vesk::host::isCapture(file));
    expectTheSummary(readBytes(file));
  }
}

// The captures of these tests are made by the builder; so that it is not wrong in the reader's own way, it is held to
// the four files above.
TEST(CaptureFormats, TheBuilderWritesTheSame) {
  Event submit = getReport(3, 0xE0, 7), complete = answer(kSummary);
  complete.microseconds = 1500;
  EXPECT_EQ(capture({submit, complete}, {220}), kUsbmonMmapped);
  EXPECT_EQ(capture({submit, complete}, {189}), kUsbmon);
  submit.id = complete.id = 0xFFFFA00112340010;
  EXPECT_EQ(capture({submit, complete}, {249}), kUsbpcap);
  submit.id = complete.id = 0xFFFF888100000001;
  const Bytes pcapng = sectionBlock(false) + interfaceBlock(220, false, false) +
                       packetBlock(0, 1700000000001000, record(submit, 220, false), false) +
                       packetBlock(0, 1700000000001500, record(complete, 220, false), false);
  EXPECT_EQ(pcapng, kPcapng);
}

TEST(CaptureFormats, EveryLinkTypeByteOrderResolutionAndContainer) {
  for (unsigned linkType : {189u, 220u, 249u})
    for (bool bigEndian : {false, true})
      for (bool nanoseconds : {false, true})
        for (bool pcapng : {false, true}) {
          SCOPED_TRACE(std::to_string(linkType) + (bigEndian ? " big" : " little") + (nanoseconds ? " ns" : " us") +
                       (pcapng ? " pcapng" : " pcap"));
          const Form form{linkType, bigEndian, nanoseconds, pcapng};
          expectTheSummary(readBytes(capture({getReport(3, 0xE0, 7), answer(kSummary)}, form)));
        }
}

TEST(CaptureFormats, TimesAreExactToTheNanosecond) {
  const Form form{220, false, true, true};
  Bytes file = form.head();
  file += form.packet(record(getReport(3, 0xE0, 7), 220, false), kStartNs);
  file += form.packet(record(answer(kSummary), 220, false), kStartNs + 3'000'000'007);
  ASSERT_EQ(readBytes(file).reports.size(), 1u);
  EXPECT_EQ(readBytes(file).reports[0].timeNs, 3'000'000'007);
}

TEST(CaptureFormats, TimesInPowersOfTwo) {
  Bytes file = sectionBlock(false);
  file += block(1, Writer(false).u16(220).u16(0).u32(0).u16(9).u16(1).u8(0x80 | 10).pad(4).u32(0).done(), false);
  file += packetBlock(0, 1024, record(getReport(3, 0xE0, 7), 220, false), false);
  file += packetBlock(0, 1024 + 512, record(answer(kSummary), 220, false), false);
  const Outcome outcome = readBytes(file);
  ASSERT_EQ(outcome.reports.size(), 1u);
  EXPECT_EQ(outcome.reports[0].timeNs, 500'000'000);
}

TEST(CaptureFormats, InterfacesOfDifferentLinkTypesAndSnapLengths) {
  Bytes file = sectionBlock(false) + interfaceBlock(1, false, false) + interfaceBlock(220, false, false, 4096) +
               interfaceBlock(249, false, true, 65535);
  file += packetBlock(0, 1000, Bytes(60, 'n'), false);
  file += packetBlock(1, 1000, record(getReport(3, 0xE0, 7), 220, false), false);
  file += packetBlock(2, 1'500'000, record(getReport(3, 0xDE, 2), 249, false), false);
  file += packetBlock(1, 2000, record(answer(kSummary), 220, false), false);
  file += packetBlock(2, 3'000'000, record(answer(hexBytes("DE02")), 249, false), false);
  const Outcome outcome = readBytes(file);
  EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary, hexBytes("DE02")));
  EXPECT_EQ(outcome.reports[0].packet, 4u);
  EXPECT_EQ(outcome.reports[1].packet, 5u);
  EXPECT_EQ(outcome.reports[0].timeNs, 1'000'000);
  EXPECT_EQ(outcome.reports[1].timeNs, 2'000'000);
  ASSERT_THAT(outcome.codes(), ElementsAre("other-link-type"));
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("1 packet"));
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("Ethernet"));
}

TEST(CaptureFormats, MoreInterfacesThanAreRead) {
  Bytes file = sectionBlock(false);
  for (int k = 0; k < 65; ++k) file += interfaceBlock(220, false, false);
  for (const unsigned interface : {64u, 63u}) {
    file += packetBlock(interface, 1000, record(getReport(3, 0xE0, 7), 220, false), false);
    file += packetBlock(interface, 2000, record(answer(kSummary), 220, false), false);
  }
  const Outcome outcome = readBytes(file);
  ASSERT_EQ(outcome.reports.size(), 1u);
  EXPECT_EQ(outcome.reports[0].packet, 4u);
  ASSERT_THAT(outcome.codes(), ElementsAre("capture-damaged"));
  EXPECT_EQ(outcome.messages[0].text, "more than 64 USB interfaces in one section; this one is not read");
}

TEST(CaptureFormats, InterfacesWithoutEndAreDamage) {
  Bytes file = sectionBlock(false);
  const Bytes ethernet = interfaceBlock(1, false, false);
  for (int k = 0; k < 65'537; ++k) file += ethernet;
  file += interfaceBlock(220, false, false) + packetBlock(65'537, 1000, record(answer(kSummary), 220, false), false);
  const Outcome outcome = readBytes(file);
  EXPECT_THAT(outcome.reports, IsEmpty());
  ASSERT_FALSE(outcome.messages.empty());
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("more than 65536 interfaces in one section"));
}

TEST(CaptureFormats, SectionsOfBothByteOrdersJoined) {
  const std::vector<Event> events = {getReport(3, 0xE0, 7), answer(kSummary)};
  const Bytes file = capture(events, {220, false, false, true}) + capture(events, {189, true, true, true});
  const Outcome outcome = readBytes(file);
  EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary, kSummary));
  EXPECT_EQ(outcome.reports[1].packet, 4u);
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureFormats, SimpleObsoleteAndUnknownBlocks) {
  const Bytes submit = record(getReport(3, 0xE0, 7), 220, false), complete = record(answer(kSummary), 220, false);
  Bytes file = sectionBlock(false) + interfaceBlock(220, false, false);
  file += block(4, Bytes(8, 'x'), false) + block(0x80000123, Bytes(40, 'x'), false);
  file += block(3, Writer(false).u32(submit.size()).bytes(submit).done(), false);
  Writer packet(false);
  packet.u16(0).u16(0).u32(0).u32(5).u32(complete.size()).u32(complete.size()).bytes(complete);
  file += block(5, Bytes(12, '\0'), false) + block(2, packet.done(), false);
  const Outcome outcome = readBytes(file);
  EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary));
  EXPECT_EQ(outcome.reports[0].packet, 2u);
  EXPECT_EQ(outcome.reports[0].timeNs, 0);  // the first packet has no time
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureFormats, JournalEntriesAreNumbered) {
  const Bytes submit = record(getReport(3, 0xE0, 7), 220, false), complete = record(answer(kSummary), 220, false);
  const Outcome outcome =
      readBytes(sectionBlock(false) + interfaceBlock(220, false, false) + packetBlock(0, 0, submit, false) +
                block(9, Bytes(8, 'x'), false) + packetBlock(0, 0, complete, false));
  ASSERT_THAT(outcome.bytes(), ElementsAre(kSummary));
  EXPECT_EQ(outcome.reports[0].packet, 3u);
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureFormats, APacketWithoutATimeHasNone) {
  const Bytes submit = record(getReport(3, 0xE0, 7), 220, false), complete = record(answer(kSummary), 220, false);
  Bytes file = sectionBlock(false) + interfaceBlock(220, false, false) + packetBlock(0, 1000, submit, false);
  file += block(3, Writer(false).u32(complete.size()).bytes(complete).done(), false);
  const Outcome outcome = readBytes(file);
  ASSERT_EQ(outcome.reports.size(), 1u);
  EXPECT_EQ(outcome.reports[0].timeNs, -1);
}

TEST(CaptureFormats, OtherLinkTypesAreRefusedByName) {
  const auto refusal = [](unsigned linkType, bool pcapng) {
    const Form form{linkType, false, false, pcapng};
    const Outcome outcome = readBytes(form.head() + form.packet(Bytes(60, 'x'), kStartNs));
    EXPECT_THAT(outcome.reports, IsEmpty());
    EXPECT_THAT(outcome.codes(), ElementsAre("unsupported-capture"));
    EXPECT_EQ(outcome.messages.at(0).kind->exitCode, 3);
    EXPECT_THAT(outcome.messages.at(0).text, HasSubstr("usbmon"));
    return outcome.messages.at(0).text;
  };
  for (bool pcapng : {false, true}) {
    EXPECT_THAT(refusal(186, pcapng), HasSubstr("FreeBSD"));
    EXPECT_THAT(refusal(288, pcapng), HasSubstr("USB 2.0 bus packets"));
    EXPECT_THAT(refusal(293, pcapng), HasSubstr("low-speed"));
    EXPECT_THAT(refusal(294, pcapng), HasSubstr("full-speed"));
    EXPECT_THAT(refusal(295, pcapng), HasSubstr("high-speed"));
    EXPECT_THAT(refusal(1, pcapng), HasSubstr("no USB traffic but Ethernet (link type 1)"));
    EXPECT_THAT(refusal(4711, pcapng), HasSubstr("no USB traffic but packets of link type 4711"));
  }
}

TEST(CaptureFormats, CutAtEveryByte) {
  const std::vector<Event> events = {getReport(3, 0xE0, 7), answer(kSummary), getReport(3, 0xDE, 2),
                                     answer(hexBytes("DE01"))};
  for (bool pcapng : {false, true}) {
    const Form form{220, false, false, pcapng};
    std::vector<std::size_t> borders = {form.head().size()};
    for (std::size_t count = 1; count <= events.size(); ++count)
      borders.push_back(capture({events.begin(), events.begin() + static_cast<long>(count)}, form).size());
    const Bytes file = capture(events, form);
    const std::size_t sectionSize = pcapng ? sectionBlock(false).size() : form.head().size();
    for (std::size_t size = 4; size < file.size(); ++size) {
      SCOPED_TRACE(std::to_string(size) + (pcapng ? " bytes of pcapng" : " bytes of pcap"));
      const Outcome outcome = readBytes(file.substr(0, size));
      std::size_t whole = 0;
      while (whole < events.size() && borders[whole + 1] <= size) ++whole;
      EXPECT_EQ(outcome.reports.size(), whole / 2);
      const bool atBorder = size == sectionSize || std::count(borders.begin(), borders.end(), size) != 0;
      const auto codes = outcome.codes();
      EXPECT_EQ(std::count(codes.begin(), codes.end(), "capture-cut"), atBorder ? 0 : 1);
      EXPECT_EQ(std::count(codes.begin(), codes.end(), "no-reports"), whole < 2 ? 1 : 0);
      if (!atBorder) {
        EXPECT_THAT(outcome.messages[0].text, HasSubstr("behind packet " + std::to_string(whole) + ":"));
        EXPECT_EQ(outcome.messages[0].kind->exitCode, 4);
      }
    }
  }
}

TEST(CaptureFormats, LengthsThatLie) {
  const Form pcap{220};
  const Bytes before = capture({getReport(3, 0xE0, 7), answer(kSummary)}, pcap);
  // Four gigabytes are announced.
  const Outcome huge =
      readBytes(before + Writer(false).u32(0).u32(0).u32(0xFFFFFFFF).u32(0xFFFFFFFF).done() + Bytes(100, 'x'));
  EXPECT_EQ(huge.reports.size(), 1u);
  ASSERT_THAT(huge.codes(), ElementsAre("capture-cut"));
  EXPECT_THAT(huge.messages[0].text, HasSubstr("of a record of 4294967311 bytes only 116 are there"));

  // More than is given to libpcap, and all of it there: passed over, and the next packet is read.
  const Bytes large = pcap.packet(Bytes(std::size_t{1} << 20, 'x'), kStartNs);
  const Outcome tooLarge = readBytes(before + large + before.substr(24));
  EXPECT_EQ(tooLarge.reports.size(), 2u);
  EXPECT_EQ(tooLarge.reports.back().packet, 5u);
  EXPECT_THAT(tooLarge.codes(), ElementsAre("packet-too-large"));
  EXPECT_EQ(tooLarge.messages[0].place.number, 3u);
}

TEST(CaptureFormats, ARecordThatLibpcapRefusesDoesNotHideTheNext) {
  const Form pcap{220};
  const Bytes before = capture({getReport(3, 0xE0, 7), answer(kSummary)}, pcap);
  const Outcome outcome = readBytes(before + pcap.packet(Bytes(300'000, 'x'), kStartNs) + before.substr(24));
  EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary, kSummary));
  ASSERT_THAT(outcome.codes(), ElementsAre("packet-damaged"));
  EXPECT_EQ(outcome.messages[0].place.number, 3u);
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("300000"));
}

TEST(CaptureFormats, ACutRecordOfAnotherLinkTypeIsTold) {
  const Form form{1};
  const Bytes file = form.head() + form.packet(Bytes(60, 'x'), kStartNs) + form.packet(Bytes(60, 'x'), kStartNs);
  const Outcome outcome = readBytes(file.substr(0, file.size() - 1));
  EXPECT_THAT(outcome.codes(), ElementsAre("capture-cut", "unsupported-capture"));
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("behind packet 1:"));
}

TEST(CaptureFormats, BlocksThatLie) {
  const Bytes before = capture({getReport(3, 0xE0, 7), answer(kSummary)}, {220, false, false, true});
  const auto outcomeOf = [&](const Bytes &block) {
    const Outcome outcome = readBytes(before + block + before);
    EXPECT_EQ(outcome.reports.size(), 1u);
    EXPECT_THAT(outcome.codes(), ElementsAre("capture-damaged"));
    EXPECT_EQ(outcome.messages[0].place.number, before.size());
    EXPECT_EQ(outcome.messages[0].kind->exitCode, 4);
    return outcome.messages[0].text;
  };
  EXPECT_THAT(outcomeOf(Writer(false).u32(6).u32(0).u32(0).done()), HasSubstr("a length of 0 bytes"));
  EXPECT_THAT(outcomeOf(Writer(false).u32(6).u32(33).bytes(Bytes(25, 'x')).done()), HasSubstr("a length of 33 bytes"));
  EXPECT_THAT(outcomeOf(Writer(false).u32(6).u32(32).bytes(Bytes(20, 'x')).u32(36).done()), HasSubstr("32 and 36"));
  EXPECT_THAT(outcomeOf(block(0x0A0D0D0A, Bytes(16, 'x'), false)), HasSubstr("byte order"));
  EXPECT_THAT(outcomeOf(block(1, Bytes(100'000, 'x'), false)), HasSubstr("described in 100012 bytes"));
  EXPECT_THAT(outcomeOf(block(1, Bytes(4, '\0'), false)), HasSubstr("described in 16 bytes"));
}

TEST(CaptureFormats, OnePacketThatLiesDoesNotHideTheNext) {
  const Bytes submit = record(getReport(3, 0xE0, 7), 220, false), complete = record(answer(kSummary), 220, false);
  const Bytes head = sectionBlock(false) + interfaceBlock(220, false, false);
  Writer lying(false);  // announces more data than the block holds
  lying.u32(0).u32(0).u32(0).u32(100'000).u32(100'000).bytes(submit);
  const Bytes bad[] = {block(6, lying.done(), false),
                       packetBlock(5, 0, submit, false),
                       block(6, Bytes(4, '\0'), false),
                       block(6, {}, false),
                       block(2, {}, false),
                       packetBlock(0, 0, submit.substr(0, 40), false),
                       packetBlock(0, 0, {}, false)};
  for (const Bytes &block : bad) {
    const Outcome outcome =
        readBytes(head + block + packetBlock(0, 0, submit, false) + packetBlock(0, 0, complete, false));
    EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary));
    ASSERT_THAT(outcome.codes(), ElementsAre("packet-damaged"));
    EXPECT_EQ(outcome.messages[0].place.number, 1u);
    EXPECT_EQ(outcome.messages[0].kind->exitCode, 4);
  }
}

TEST(CaptureFormats, AnInterfaceThatCannotBeReadIsTold) {
  Bytes file =
      sectionBlock(false) + block(1, Writer(false).u16(220).u16(0).u32(0).u16(9).u16(1).u8(200).pad(4).done(), false);
  file += interfaceBlock(220, false, false);
  file += packetBlock(0, 0, Bytes(64, '\0'), false);
  file += packetBlock(1, 0, record(getReport(3, 0xE0, 7), 220, false), false);
  file += packetBlock(1, 0, record(answer(kSummary), 220, false), false);
  const Outcome outcome = readBytes(file);
  EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary));
  EXPECT_THAT(outcome.codes(), ElementsAre("capture-damaged"));
}

TEST(CaptureFormats, DamagedAnywhereItEndsWithAMessageAndNeverWithACrash) {
  const std::vector<Event> events = {getReport(3, 0xE0, 7), answer(kSummary), inputData(pattern(0x76, 64)),
                                     inputData(pattern(0x76, 792))};
  for (unsigned linkType : {189u, 220u, 249u})
    for (bool pcapng : {false, true}) {
      const Bytes file = capture(events, {linkType, false, false, pcapng});
      for (std::size_t at = 4; at < std::min<std::size_t>(file.size(), 500); ++at)
        for (int value : {0x00, 0x7F, 0x80, 0xFF}) {
          Bytes damaged = file;
          damaged[at] = static_cast<char>(value);
          const Outcome outcome = readBytes(damaged);
          EXPECT_FALSE(outcome.messages.empty());
        }
    }
}

TEST(CaptureFormats, AnEmptyCaptureHoldsNoReport) {
  for (bool pcapng : {false, true})
    EXPECT_THAT(readBytes(Form{220, false, false, pcapng}.head()).codes(), ElementsAre("no-reports"));
  EXPECT_THAT(readBytes(sectionBlock(true)).codes(), ElementsAre("no-reports"));
}

TEST(CaptureFormats, NothingElseIsTakenForACapture) {
  for (std::string_view head : {"", "\xd4\xc3\xb2", "\x1f\x8b\x08", "# D: 0", "E0 0D", "\x76\x00\x00\x00"})
    EXPECT_FALSE(vesk::host::isCapture(head));
  for (bool bigEndian : {false, true})
    for (bool nanoseconds : {false, true}) EXPECT_TRUE(vesk::host::isCapture(Form{220, bigEndian, nanoseconds}.head()));
  EXPECT_TRUE(vesk::host::isCapture(sectionBlock(true)));
}

}  // namespace
}  // namespace test
