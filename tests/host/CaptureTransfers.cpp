// From the packets of a capture to reports: pairing, whose traffic it is, and reports in pieces.
#include "host/input/UsbPending.h"
#include "tests/host/CaptureBuilder.h"

namespace test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using vesk::host::ReportType;

constexpr std::uint64_t kFirst = 0xFFFF888100000001, kSecond = 0xFFFF888100000040;
const Bytes kState = hexBytes("DE02");
const Bytes kImage = pattern(0x76, 792), kPacket = pattern(0x77, 2064);

Outcome readEvents(const std::vector<Event> &events, const Form &form = {}) {
  return readBytes(capture(events, form));
}

Event failed(std::int32_t status) {
  Event event = answer({});
  event.status = status;
  return event;
}

Event setReport(unsigned id, Bytes data) {
  Event event;
  event.endpoint = 0x00;
  event.setup = setupBytes(0x21, 0x09, 0x300 | id, 0, static_cast<unsigned>(data.size()));
  event.data = std::move(data);
  return event;
}

Event descriptorRequest(unsigned type, unsigned length) {
  Event event;
  event.setup = setupBytes(0x80, 0x06, type << 8, 0, length);
  return event;
}

Bytes deviceDescriptor(unsigned vendor, unsigned product) {
  return Writer(false)
      .u8(18)
      .u8(1)
      .u16(0x200)
      .u8(0)
      .u8(0)
      .u8(0)
      .u8(64)
      .u16(vendor)
      .u16(product)
      .u16(0x100)
      .u8(1)
      .u8(2)
      .u8(3)
      .u8(1)
      .done();
}

/// One configuration whose interfaces are of these classes, each with the IN endpoint 0x81 and up.
Bytes configuration(const std::vector<unsigned> &classes, unsigned packetSize) {
  Writer body(false);
  unsigned number = 0;
  for (unsigned interfaceClass : classes) {
    body.u8(9).u8(4).u8(number).u8(0).u8(1).u8(interfaceClass).u8(0).u8(0).u8(0);
    if (interfaceClass == 3) body.u8(9).u8(0x21).u16(0x111).u8(0).u8(1).u8(0x22).u16(400);
    body.u8(7).u8(5).u8(0x81 + number).u8(3).u16(packetSize).u8(1);
    ++number;
  }
  return Writer(false)
      .u8(9)
      .u8(2)
      .u16(9 + body.done().size())
      .u8(classes.size())
      .u8(1)
      .u8(0)
      .u8(0x80)
      .u8(50)
      .bytes(body.done())
      .done();
}

std::vector<Event> probed(const std::vector<unsigned> &classes, unsigned packetSize, unsigned vendor = 0x1234) {
  return {descriptorRequest(1, 18), answer(deviceDescriptor(vendor, 0xABCD)), descriptorRequest(2, 512),
          answer(configuration(classes, packetSize))};
}

std::vector<Event> operator+(std::vector<Event> first, const std::vector<Event> &second) {
  first.insert(first.end(), second.begin(), second.end());
  return first;
}

/// A report as a reader gets it that asks for `size` bytes at a time.
std::vector<Event> pieces(const Bytes &report, std::size_t size, std::uint8_t endpoint = 0x81) {
  std::vector<Event> events;
  for (std::size_t at = 0; at < report.size(); at += size)
    events.push_back(inputData(report.substr(at, size), endpoint));
  return events;
}

TEST(CaptureTransfers, TheTypeIsTheRequests) {
  for (unsigned linkType : {189u, 220u, 249u}) {
    const Outcome outcome = readEvents({getReport(1, 0x76, 792), answer(kImage), getReport(3, 0xDE, 2), answer(kState),
                                        getReport(2, 0xE0, 7), answer(kSummary)},
                                       {linkType});
    ASSERT_EQ(outcome.reports.size(), 3u);
    EXPECT_EQ(outcome.reports[0].type, ReportType::kInput);
    EXPECT_EQ(outcome.reports[1].type, ReportType::kFeature);
    EXPECT_EQ(outcome.reports[2].type, ReportType::kOutput);
    EXPECT_THAT(outcome.bytes(), ElementsAre(kImage, kState, kSummary));
    EXPECT_THAT(outcome.codes(), IsEmpty());
  }
}

TEST(CaptureTransfers, ATypeThatDoesNotExistIsGuessed) {
  const Outcome outcome = readEvents({getReport(0, 0x76, 792), answer(kImage)});
  ASSERT_EQ(outcome.reports.size(), 1u);
  EXPECT_EQ(outcome.reports[0].type, ReportType::kInput);
  EXPECT_TRUE(outcome.reports[0].typeGuessed);
}

TEST(CaptureTransfers, AnswersFindTheirRequestByBusAndId) {
  Event otherBusAsks = getReport(3, 0xDE, 2, kFirst), otherBusAnswers = answer(kState, kFirst);
  otherBusAsks.bus = otherBusAnswers.bus = 2;
  const Outcome outcome = readEvents({getReport(3, 0xE0, 7, kFirst), otherBusAsks, getReport(3, 0xDC, 25, kSecond),
                                      answer(pattern(0xDC, 25), kSecond), otherBusAnswers, answer(kSummary, kFirst)});
  EXPECT_THAT(outcome.bytes(), ElementsAre(pattern(0xDC, 25), kState, kSummary));
  EXPECT_EQ(outcome.reports[1].device, "2.7");
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureTransfers, IdsAreUsedAgain) {
  const Outcome outcome = readEvents({getReport(3, 0xE0, 7), answer(kSummary), getReport(3, 0xDE, 2), answer(kState)});
  EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary, kState));
  EXPECT_EQ(outcome.reports[1].id, 0xDEu);
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureTransfers, AnIdThatIsUsedAgainBeforeItsAnswerLostIt) {
  const Outcome outcome = readEvents({getReport(3, 0xE0, 7), getReport(3, 0xDE, 2), answer(kState)});
  EXPECT_THAT(outcome.bytes(), ElementsAre(kState));
  ASSERT_THAT(outcome.codes(), ElementsAre("unanswered-read"));
  EXPECT_EQ(outcome.messages[0].place.number, 1u);
  EXPECT_EQ(outcome.messages[0].reportId, 0xE0u);
  EXPECT_THAT(outcome.summary(), HasSubstr("reads without an answer 1"));
}

TEST(CaptureTransfers, AnAnswerThatIsNotInTheCapture) {
  const Outcome outcome = readEvents({getReport(3, 0xE0, 7, kFirst), getReport(3, 0xDE, 2, kSecond)});
  EXPECT_THAT(outcome.codes(), ElementsAre("unanswered-read", "unanswered-read", "no-reports"));
  EXPECT_EQ(outcome.messages[0].reportId, 0xE0u);
  EXPECT_EQ(outcome.messages[1].place.number, 2u);
}

TEST(CaptureTransfers, ARequestThatIsNotInTheCapture) {
  const Outcome outcome = readEvents({answer(kSummary), answer(kImage)});
  ASSERT_EQ(outcome.reports.size(), 2u);
  EXPECT_EQ(outcome.reports[0].type, ReportType::kFeature);
  EXPECT_EQ(outcome.reports[1].type, ReportType::kInput);
  EXPECT_TRUE(outcome.reports[0].typeGuessed);
  EXPECT_TRUE(outcome.reports[1].typeGuessed);
  EXPECT_THAT(outcome.codes(), IsEmpty());
  EXPECT_THAT(outcome.summary(), HasSubstr("of these without the request, so that the ID chose the type 2"));
}

TEST(CaptureTransfers, WithoutARequestDescriptorsAreNotTakenForReports) {
  // String descriptors whose length is one of our IDs.
  for (unsigned id : {0x76u, 0xE0u}) {
    Bytes string = Writer(false).u8(id).u8(3).bytes(Bytes(id - 2, 'a')).done();
    EXPECT_THAT(readEvents({answer(string)}).reports, IsEmpty());
  }
  EXPECT_THAT(readEvents({answer(deviceDescriptor(1, 2)), answer(hexBytes("0102"))}).reports, IsEmpty());
}

TEST(CaptureTransfers, WithoutARequestOnlyWholeAnswersOfAKnownIdAreTaken) {
  Event refused = answer(kSummary), written = answer(kSummary), cut = answer(pattern(0xE3, 10));
  refused.status = -32;
  written.endpoint = 0x00;
  cut.transferred = 57;
  for (const Event &event : {refused, written, answer({}), answer(hexBytes("01")), answer(hexBytes("0203"))}) {
    const Outcome outcome = readEvents({event});
    EXPECT_THAT(outcome.codes(), ElementsAre("no-reports"));
    EXPECT_THAT(outcome.summary(), HasSubstr("packets of other traffic 1"));
  }
  const Outcome outcome = readEvents({cut});
  ASSERT_THAT(outcome.codes(), ElementsAre("cut-data", "no-reports"));
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("10 of the 57 bytes"));
}

TEST(CaptureTransfers, OnlyReadsOfKnownReportsAreMissed) {
  // Without their answers: a descriptor, a report of another device, a written report.
  EXPECT_THAT(readEvents({descriptorRequest(1, 18)}).codes(), ElementsAre("no-reports"));
  EXPECT_THAT(readEvents({getReport(3, 0x01, 8)}).codes(), ElementsAre("no-reports"));
  EXPECT_THAT(readEvents({setReport(0xE0, kSummary)}).codes(), ElementsAre("no-reports"));
}

TEST(CaptureTransfers, AnotherDevicesAnswerIsNotTheRequests) {
  Event fromAnother = answer(kState);
  fromAnother.device = 8;
  const Outcome outcome = readEvents({getReport(3, 0xE0, 7), fromAnother});
  ASSERT_EQ(outcome.reports.size(), 1u);
  EXPECT_EQ(outcome.reports[0].device, "1.8");
  EXPECT_TRUE(outcome.reports[0].typeGuessed);
  EXPECT_THAT(outcome.codes(), ElementsAre("unanswered-read"));
}

TEST(CaptureTransfers, AnAnswerWithAnotherIdIsKeptAndTold) {
  const Outcome outcome = readEvents({getReport(3, 0xE3, 57), answer(kSummary)});
  ASSERT_EQ(outcome.reports.size(), 1u);
  EXPECT_EQ(outcome.reports[0].id, 0xE3u);
  EXPECT_EQ(outcome.reports[0].bytes, kSummary);
  ASSERT_THAT(outcome.codes(), ElementsAre("wrong-report-id"));
  EXPECT_EQ(outcome.messages[0].reportId, 0xE3u);
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("0xE0"));
}

TEST(CaptureTransfers, FailuresSayWhatTheyMean) {
  const std::pair<std::int32_t, const char *> kLinux[] = {
      {-32, "-32 (stalled"},      {-75, "-75 (the device sent more"},  {-71, "-71 (bus error)"},
      {-84, "-84 (bus error)"},   {-110, "-110 (timed out)"},          {-2, "-2 (cancelled)"},
      {-104, "-104 (cancelled)"}, {-108, "-108 (the device is gone)"}, {-19, "-19 (the device is gone)"},
      {-5, "-5 (failed)"}};
  for (const auto &[status, text] : kLinux) {
    const Outcome outcome = readEvents({getReport(3, 0xE0, 7), failed(status), getReport(3, 0xDE, 2), answer(kState)});
    EXPECT_THAT(outcome.bytes(), ElementsAre(kState));
    ASSERT_THAT(outcome.codes(), ElementsAre("failed-read"));
    EXPECT_THAT(outcome.messages[0].text, HasSubstr(text));
    EXPECT_EQ(outcome.messages[0].kind->exitCode, 0);
    EXPECT_THAT(outcome.summary(), HasSubstr("failed reads 1"));
  }
  const std::pair<std::uint32_t, const char *> kWindows[] = {{0xC0000004, "0xC0000004 (stalled"},
                                                             {0xC0007000, "0xC0007000 (the device is gone)"},
                                                             {0xC0010000, "0xC0010000 (cancelled)"},
                                                             {0x80000300, "0x80000300 (refused by the USB driver)"}};
  for (const auto &[status, text] : kWindows) {
    const Outcome outcome = readEvents({getReport(3, 0xE0, 7), failed(static_cast<std::int32_t>(status))}, {249});
    EXPECT_THAT(outcome.messages.at(0).text, HasSubstr(text));
  }
}

TEST(CaptureTransfers, ASubmitThatFailsIsAFailure) {
  Event error = failed(-19);
  error.event = 'E';
  EXPECT_THAT(readEvents({getReport(3, 0xE0, 7), error}).codes(), ElementsAre("failed-read", "no-reports"));
}

TEST(CaptureTransfers, AnswersOfNoBytes) {
  for (unsigned linkType : {189u, 220u, 249u}) {
    const Outcome outcome = readEvents({getReport(3, 0xE0, 7), answer({}), inputData({})}, {linkType});
    EXPECT_THAT(outcome.reports, IsEmpty());
    EXPECT_THAT(outcome.codes(), ElementsAre("empty-read", "no-reports"));
  }
}

TEST(CaptureTransfers, DataThatTheCaptureCut) {
  for (unsigned linkType : {189u, 220u, 249u})
    for (std::size_t kept : {0u, 1u, 56u}) {
      Event cut = answer(pattern(0xE3, 57).substr(0, kept));
      cut.transferred = 57;
      const Outcome outcome =
          readEvents({getReport(3, 0xE3, 57), cut, getReport(3, 0xDE, 2), answer(kState)}, {linkType});
      EXPECT_THAT(outcome.bytes(), ElementsAre(kState));
      ASSERT_THAT(outcome.codes(), ElementsAre("cut-data"));
      EXPECT_THAT(outcome.messages[0].text, HasSubstr(std::to_string(kept) + " of the 57 bytes"));
      EXPECT_EQ(outcome.messages[0].kind->exitCode, 4);
    }
}

TEST(CaptureTransfers, ARecordThatTheSnapLengthCut) {
  const Form form;
  const Bytes whole = record(inputData(kImage), 220, false);
  const Bytes file = form.head() + form.packet(whole.substr(0, 128), kStartNs, whole.size());
  const Outcome outcome = readBytes(file);
  ASSERT_THAT(outcome.codes(), ElementsAre("cut-data", "no-reports"));
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("64 of the 792 bytes"));
  EXPECT_EQ(outcome.messages[0].reportId, 0x76u);
}

TEST(CaptureTransfers, WrittenReportsAreCounted) {
  for (unsigned linkType : {189u, 220u, 249u}) {
    Event done = answer({});
    done.endpoint = 0x00;
    const Outcome outcome =
        readEvents({setReport(0xE0, kSummary), done, getReport(3, 0xDE, 2), answer(kState)}, {linkType});
    EXPECT_THAT(outcome.bytes(), ElementsAre(kState));
    EXPECT_THAT(outcome.codes(), IsEmpty());
    EXPECT_THAT(outcome.summary(), HasSubstr("SET_REPORTs (not decoded) 1"));
  }
  Event setIdle;
  setIdle.endpoint = 0x00;
  setIdle.setup = setupBytes(0x21, 0x0A, 0, 0, 0);
  EXPECT_THAT(readEvents({setIdle}).summary(), Not(HasSubstr("SET_REPORT")));
}

TEST(CaptureTransfers, OlderUsbpcapWritesThreeStages) {
  Event data = answer(kSummary), status = answer({});
  data.stage = 1;
  status.stage = 2;
  for (bool withStatus : {true, false}) {
    std::vector<Event> events = {getReport(3, 0xE0, 7), data};
    if (withStatus) events.push_back(status);
    const Outcome outcome = readEvents(events, {249});
    EXPECT_THAT(outcome.bytes(), ElementsAre(kSummary));
    EXPECT_FALSE(outcome.reports.at(0).typeGuessed);
    EXPECT_THAT(outcome.codes(), IsEmpty());
  }
  EXPECT_THAT(readEvents({getReport(3, 0xE0, 7), status}, {249}).codes(), ElementsAre("empty-read", "no-reports"));
  // Data towards the device, in a stage of its own.
  Event setup = setReport(0xE0, {}), outData = setReport(0xE0, kSummary);
  outData.setup.clear();
  outData.stage = 1;
  Event outStatus = status;
  outStatus.endpoint = 0;
  const Outcome written = readEvents({setup, outData, outStatus}, {249});
  EXPECT_THAT(written.reports, IsEmpty());
  EXPECT_THAT(written.codes(), ElementsAre("no-reports"));
}

TEST(CaptureTransfers, UsbpcapWithoutAStageTellsTheDirectionInItsInfo) {
  const Form form{249};
  Bytes submit = usbpcapRecord(getReport(3, 0xE0, 7)), complete = usbpcapRecord(answer(kSummary));
  for (Bytes *bytes : {&submit, &complete}) {
    (*bytes)[0] = 27;
    bytes->erase(27, 1);
  }
  const Outcome outcome = readBytes(form.head() + form.packet(submit, 0) + form.packet(complete, 0));
  ASSERT_THAT(outcome.bytes(), ElementsAre(kSummary));
  EXPECT_TRUE(outcome.reports[0].typeGuessed);  // the request stands in the setup stage alone
}

TEST(CaptureTransfers, InputReportsFromInterrupts) {
  for (unsigned linkType : {189u, 220u, 249u})
    for (bool bigEndian : {false, true}) {
      const Outcome outcome = readEvents({inputData(kImage), inputData(kPacket)}, {linkType, bigEndian});
      EXPECT_THAT(outcome.bytes(), ElementsAre(kImage, kPacket));
      EXPECT_EQ(outcome.reports[0].type, ReportType::kInput);
      EXPECT_FALSE(outcome.reports[0].typeGuessed);
      EXPECT_EQ(outcome.reports[1].packet, 2u);
      EXPECT_EQ(outcome.reports[1].timeNs, 500'000);
      EXPECT_THAT(outcome.codes(), IsEmpty());
    }
}

TEST(CaptureTransfers, FailedInterruptsAreNoReports) {
  Event cancelled = inputData(kImage);
  cancelled.status = -2;
  EXPECT_THAT(readEvents({cancelled}).reports, IsEmpty());
}

TEST(CaptureTransfers, OtherDevicesAreLeftAlone) {
  Event mouse = inputData(hexBytes("0002FE0000000000"), 0x82), keyboard = inputData(hexBytes("0000040000000000"), 0x83);
  Event joystick = inputData(hexBytes("76800080"), 0x84), bulk = inputData(kImage);
  mouse.device = 3;
  keyboard.device = 4;
  joystick.device = 5;
  bulk.transfer = 3;
  bulk.device = 6;
  Event camera = getReport(3, 0x01, 8), cameraAnswers = answer(hexBytes("0102030405060708"));
  camera.device = cameraAnswers.device = 9;
  const Outcome outcome = readEvents({mouse, keyboard, joystick, bulk, camera, cameraAnswers, inputData(kImage)});
  EXPECT_THAT(outcome.bytes(), ElementsAre(kImage));
  EXPECT_THAT(outcome.codes(), IsEmpty());
  EXPECT_THAT(outcome.summary(), HasSubstr("packets of other traffic 5"));
}

TEST(CaptureTransfers, OtherInterfacesOfTheDevice) {
  const auto events = probed({3, 0x0A, 0xFF}, 64);
  Event otherInterface = getReport(3, 0xE0, 7);
  otherInterface.setup = setupBytes(0xA1, 0x01, 0x3E0, 1, 7);
  const Outcome outcome =
      readEvents(events + std::vector{otherInterface, answer(kSummary), inputData(kImage, 0x83),
                                      inputData(kPacket.substr(0, 64), 0x82), getReport(3, 0xDE, 2), answer(kState)});
  EXPECT_THAT(outcome.bytes(), ElementsAre(kState));
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureTransfers, DescriptorsNameTheDevice) {
  const Outcome outcome = readEvents(std::vector{inputData(kImage)} + probed({3}, 64) +
                                     std::vector{getReport(3, 0xE0, 7), answer(kSummary)} + probed({3}, 64, 0x4321) +
                                     std::vector{inputData(kImage)});
  ASSERT_EQ(outcome.reports.size(), 3u);
  EXPECT_EQ(outcome.reports[0].vendorProduct, 0u);
  EXPECT_EQ(outcome.reports[1].vendorProduct, 0x1234ABCDu);
  EXPECT_EQ(outcome.reports[2].vendorProduct, 0x4321ABCDu);  // another device at the same address
}

TEST(CaptureTransfers, DescriptorsMayBeCutOrWrong) {
  const Bytes device = deviceDescriptor(0x1234, 0xABCD), all = configuration({3, 10}, 64);
  for (std::size_t size = 1; size <= all.size(); ++size) {
    const Outcome outcome =
        readEvents({descriptorRequest(1, 18), answer(device.substr(0, std::min(size, device.size()))),
                    descriptorRequest(2, 255), answer(all.substr(0, size)), getReport(3, 0xE0, 7), answer(kSummary)});
    ASSERT_EQ(outcome.reports.size(), 1u);
    EXPECT_EQ(outcome.reports[0].vendorProduct, size < 12 ? 0u : 0x1234ABCDu);
  }
  Event refused = answer(device);
  refused.status = -32;
  Bytes ofAnotherType = device;
  ofAnotherType[1] = 2;
  for (const Event &event : {refused, answer(ofAnotherType)}) {
    const Outcome outcome = readEvents({descriptorRequest(1, 18), event, getReport(3, 0xE0, 7), answer(kSummary)});
    EXPECT_EQ(outcome.reports.at(0).vendorProduct, 0u);
  }
  for (int value = 0; value < 256; ++value)
    for (std::size_t at = 0; at < all.size(); ++at) {
      Bytes wrong = all;
      wrong[at] = static_cast<char>(value);
      EXPECT_THAT(readEvents({descriptorRequest(2, 255), answer(wrong)}).codes(), ElementsAre("no-reports"));
    }
}

TEST(CaptureTransfers, AnUnknownIdOnOurDeviceIsHandedOver) {
  const std::vector<Event> unknown = {getReport(3, 0xC1, 4), answer(hexBytes("C1010203"))};
  EXPECT_THAT(readEvents(unknown).reports, IsEmpty());
  EXPECT_THAT(readEvents(probed({3}, 64) + unknown).reports, IsEmpty());  // known, but not as ours
  const Outcome outcome = readEvents(std::vector{getReport(3, 0xDE, 2), answer(kState)} + unknown);
  ASSERT_EQ(outcome.reports.size(), 2u);
  EXPECT_EQ(outcome.reports[1].id, 0xC1u);
  EXPECT_EQ(outcome.reports[1].type, ReportType::kFeature);
  // And from the endpoint that has given input reports.
  const Outcome input = readEvents({inputData(kImage), inputData(hexBytes("10FF"), 0x82), inputData(hexBytes("1102"))});
  EXPECT_THAT(input.bytes(), ElementsAre(kImage, hexBytes("1102")));
  EXPECT_EQ(input.reports[1].id, 0x11u);
}

TEST(CaptureTransfers, AWrongLengthIsHandedOver) {
  EXPECT_THAT(readEvents({inputData(pattern(0x76, 791))}).bytes(), ElementsAre(pattern(0x76, 791)));
  EXPECT_THAT(readEvents({inputData(pattern(0x76, 793))}).bytes(), ElementsAre(pattern(0x76, 793)));
  EXPECT_THAT(readEvents({inputData(kImage), inputData(pattern(0x76, 9))}).bytes(),
              ElementsAre(kImage, pattern(0x76, 9)));
}

TEST(CaptureTransfers, PiecesOfEveryPacketSize) {
  for (std::size_t size : {8u, 16u, 32u, 64u, 128u, 256u, 512u, 1024u}) {
    SCOPED_TRACE(size);
    const Bytes second = pattern(0x76, 792, 50);
    const auto events = pieces(kImage, size) + pieces(kPacket, size) + pieces(second, size);
    for (const auto &before : {std::vector<Event>{}, probed({3}, static_cast<unsigned>(size))}) {
      const Outcome outcome = readEvents(before + events);
      EXPECT_EQ(outcome.bytes(), (std::vector{kImage, kPacket, second}));
      EXPECT_EQ(outcome.reports.at(1).packet, before.size() + (792 + size - 1) / size + 1);  // where it begins
      for (const std::string &code : outcome.codes()) EXPECT_EQ(code, "unproven-input");
      EXPECT_EQ(outcome.codes().empty(), size >= 16) << outcome.codes().size();
    }
    // Where the device is known there is nothing to prove.
    EXPECT_THAT(readEvents(std::vector{getReport(3, 0xDE, 2), answer(kState)} + events).codes(), IsEmpty());
  }
}

TEST(CaptureTransfers, APacketSizeThatTheDescriptorTells) {
  const auto events = pieces(kImage, 100) + pieces(kPacket, 100);
  const Outcome outcome = readEvents(probed({3}, 100) + events);
  EXPECT_THAT(outcome.bytes(), ElementsAre(kImage, kPacket));
}

TEST(CaptureTransfers, PiecesOfTwoEndpointsAndDevicesDoNotMix) {
  const auto one = pieces(kImage, 64), two = pieces(pattern(0x76, 792, 9), 64, 0x82);
  auto three = pieces(pattern(0x76, 792, 77), 64);
  for (Event &event : three) event.device = 12;
  std::vector<Event> events;
  for (std::size_t i = 0; i < one.size(); ++i) events = events + std::vector{one[i], two[i], three[i]};
  const Outcome outcome = readEvents(events);
  EXPECT_THAT(outcome.bytes(), ElementsAre(kImage, pattern(0x76, 792, 9), pattern(0x76, 792, 77)));
  EXPECT_EQ(outcome.reports[2].device, "1.12");
  EXPECT_THAT(outcome.codes(), IsEmpty());
}

TEST(CaptureTransfers, EveryPieceThatIsMissingIsNoticed) {
  const auto events = pieces(kImage, 64);
  const Bytes next = pattern(0x76, 792, 33);
  for (std::size_t missing = 0; missing < events.size(); ++missing) {
    SCOPED_TRACE(missing);
    auto some = events;
    some.erase(some.begin() + static_cast<long>(missing));
    const Outcome outcome = readEvents(pieces(kPacket, 64) + some + pieces(next, 64));
    EXPECT_THAT(outcome.bytes(), ElementsAre(kPacket, next));
    ASSERT_FALSE(outcome.codes().empty());
    for (const std::string &code : outcome.codes()) EXPECT_EQ(code, "incomplete-report");
    EXPECT_EQ(outcome.messages[0].kind->exitCode, 4);
  }
}

TEST(CaptureTransfers, AReportThatNeverEndsIsTold) {
  auto events = pieces(kImage, 64);
  events.pop_back();
  const Outcome outcome = readEvents(events);
  ASSERT_THAT(outcome.codes(), ElementsAre("incomplete-report", "no-reports"));
  EXPECT_THAT(outcome.messages[0].text, HasSubstr("only 768 of 792 bytes"));
  EXPECT_EQ(outcome.messages[0].place.number, 1u);
  EXPECT_EQ(outcome.messages[0].reportId, 0x76u);
}

TEST(CaptureTransfers, APieceThatTheCaptureCutEndsTheReport) {
  auto events = pieces(kImage, 64);
  events[3].data.resize(20);
  events[3].transferred = 64;
  const Outcome outcome = readEvents(events + pieces(kPacket, 64));
  EXPECT_THAT(outcome.bytes(), ElementsAre(kPacket));
  EXPECT_EQ(outcome.codes().at(0), "cut-data");
}

TEST(CaptureTransfers, SmallPiecesWithoutAnEndAreNotTakenForOurs) {
  const Event joystick = inputData(hexBytes("7680008000000000"));
  const Outcome outcome = readEvents({joystick, inputData(hexBytes("0102"))});
  EXPECT_THAT(outcome.codes(), ElementsAre("no-reports"));
  EXPECT_THAT(outcome.summary(), HasSubstr("packets of other traffic 2"));
  // Where the device is known to be the controller it is told.
  EXPECT_THAT(readEvents(std::vector{getReport(3, 0xDE, 2), answer(kState), joystick}).codes(),
              ElementsAre("incomplete-report"));
}

TEST(CaptureTransfers, ACutInputOfAnUnknownIdIsOursWhereTheEndpointIs) {
  Event cut = inputData(hexBytes("1102"));
  cut.transferred = 100;
  EXPECT_THAT(readEvents({cut}).codes(), ElementsAre("no-reports"));
  const Outcome outcome = readEvents({inputData(kImage), cut});
  ASSERT_THAT(outcome.codes(), ElementsAre("cut-data"));
  EXPECT_EQ(outcome.messages[0].reportId, std::nullopt);
}

TEST(CaptureTransfers, ThePendingTableIsBounded) {
  using vesk::host::UsbPending;
  UsbPending pending;
  const auto submit = [](std::uint64_t id) { return UsbPending::Submit{0, 1, 7, id, {}, id + 1}; };
  for (std::uint64_t id = 0; id < 65536; ++id) ASSERT_FALSE(pending.add(submit(id)));
  const auto oldest = pending.add(submit(65536));
  ASSERT_TRUE(oldest);
  EXPECT_EQ(oldest->transferId, 0u);
  EXPECT_FALSE(pending.take(0, 1, 0));
  EXPECT_TRUE(pending.take(0, 1, 1));
  EXPECT_FALSE(pending.take(0, 1, 1));
  EXPECT_FALSE(pending.take(0, 2, 2));
  EXPECT_FALSE(pending.take(1, 1, 2));
  EXPECT_EQ(pending.takeOldest()->transferId, 2u);
}

TEST(CaptureTransfers, MoreDevicesThanABusHasAreForgotten) {
  std::vector<Event> events;
  for (unsigned device = 0; device < 5000; ++device) {
    events.push_back(inputData(kImage));
    events.back().device = static_cast<std::uint16_t>(device);
  }
  const Outcome outcome = readEvents(events, {249});
  EXPECT_EQ(outcome.reports.size(), 5000u);
  EXPECT_THAT(outcome.summary(), HasSubstr("devices too many to be remembered 4096"));
}

}  // namespace
}  // namespace test
