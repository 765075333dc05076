// What is taken from a capture, and the account of what is not: control transfers here, interrupt transfers beside it.
#include "host/input/CaptureReports.h"

#include "host/input/CaptureFile.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr std::uint8_t kGetReport = 0x01, kSetReport = 0x09, kGetDescriptor = 0x06;
constexpr std::uint8_t kFromDevice = 0x80, kFromInterface = 0xA1, kToInterface = 0x21;
constexpr std::uint8_t kDeviceDescriptor = 1, kConfigurationDescriptor = 2, kStringDescriptor = 3;

std::uint8_t lowByte(std::uint16_t value) {
  return static_cast<std::uint8_t>(value & 0xFF);
}
std::uint8_t highByte(std::uint16_t value) {
  return static_cast<std::uint8_t>(value >> 8);
}

bool isGetReport(const UsbSetup &setup) {
  return setup.requestType == kFromInterface && setup.request == kGetReport;
}

/// On the wire the types are counted from 1.
std::optional<ReportType> typeOnWire(std::uint8_t wire) {
  if (wire < 1 || wire > 3) return {};
  return static_cast<ReportType>(wire - 1);
}

void list(std::string &text, std::uint64_t count, std::string_view what) {
  if (count != 0) text += ", " + std::string(what) + " " + std::to_string(count);
}

}  // namespace

void CaptureReports::packet(const CapturedPacket &captured) {
  number_ = captured.number;
  interface_ = captured.interface;
  timeNs_.reset();
  if (captured.timeNs) {
    if (!startNs_) startNs_ = captured.timeNs;
    timeNs_ =
        static_cast<std::int64_t>(static_cast<std::uint64_t>(*captured.timeNs) - static_cast<std::uint64_t>(*startNs_));
  }
  const std::optional<UsbPacket> usb = readUsbPacket(captured);
  if (!usb) return tell(kPacketDamaged, {}, "no USB header where one was expected, or one that was cut; not read");
  switch (usb->transfer) {
    case UsbPacket::Transfer::kControl:
      return control(*usb);
    case UsbPacket::Transfer::kInterrupt:
      return interrupt(*usb);
    default:
      ++counts_.other;
  }
}

void CaptureReports::control(const UsbPacket &usb) {
  if (usb.event == UsbPacket::Event::kSubmit) {
    if (!usb.setup) return;
    if (usb.setup->requestType == kToInterface && usb.setup->request == kSetReport) ++counts_.written;
    const auto old = pending_.add({interface_, usb.bus, usb.device, usb.transferId, *usb.setup, number_});
    if (old) unanswered(*old);
    return;
  }
  if (usb.event == UsbPacket::Event::kOther) return;
  auto submit = pending_.take(interface_, usb.bus, usb.transferId);
  if (submit && submit->device != usb.device) {
    unanswered(*submit);
    submit.reset();
  }
  if (submit)
    answer(*submit, usb);
  else if (usb.event == UsbPacket::Event::kComplete)
    answerWithoutSubmit(usb);
}

void CaptureReports::answer(const UsbPending::Submit &submit, const UsbPacket &usb) {
  const UsbSetup &setup = submit.setup;
  if (isGetReport(setup)) return getReport(setup, usb);
  ++counts_.other;
  if (setup.requestType != kFromDevice || setup.request != kGetDescriptor || usb.status != 0) return;
  if (highByte(setup.value) == kDeviceDescriptor) devices_.get(interface_, usb).learnDevice(usb.data);
  if (highByte(setup.value) == kConfigurationDescriptor) devices_.get(interface_, usb).learnConfiguration(usb.data);
}

void CaptureReports::getReport(const UsbSetup &setup, const UsbPacket &usb) {
  const std::uint8_t id = lowByte(setup.value);
  const KnownReport *known = findReport(id);
  const UsbDevice *seen = devices_.find(interface_, usb);
  const bool otherInterface = seen != nullptr && seen->isOtherInterface(lowByte(setup.index));
  if (otherInterface || (known == nullptr && (seen == nullptr || !seen->ours))) {
    ++counts_.other;
    return;
  }
  if (usb.status != 0) {
    ++counts_.failed;
    return tell(kFailedRead, id, "the device did not give this report: status " + statusText(usb));
  }
  if (usb.dataSize == 0) {
    ++counts_.empty;
    return tell(kEmptyRead, id, "asked for, answered with 0 bytes");
  }
  if (isCut(usb, id)) return;
  UsbDevice &device = devices_.get(interface_, usb);
  const auto first = static_cast<std::uint8_t>(usb.data.front());
  if (first != id) {
    tell(kWrongReportId, id,
         "the answer begins with " + formatted<"0x%02X">(std::uint32_t{first}) +
             ", not with this ID; its bytes are decoded as what was asked for");
  } else if (known != nullptr) {
    device.ours = true;
  }
  SourceReport report;
  report.bytes = usb.data;
  report.id = id;
  const auto type = typeOnWire(highByte(setup.value));
  report.type = type ? *type : typeOf(id, options_);
  report.typeGuessed = !type;
  ++counts_.answers;
  handOver(report, device);
}

void CaptureReports::answerWithoutSubmit(const UsbPacket &usb) {
  const bool hasData = usb.status == 0 && usb.in() && !usb.data.empty();
  const auto first = hasData ? static_cast<std::uint8_t>(usb.data[0]) : std::uint8_t{0};
  // A string descriptor's first byte is its length, which may be any number, ours too.
  const bool isString = usb.dataSize == first && usb.data.size() > 1 && usb.data[1] == kStringDescriptor;
  if (!hasData || isString || findReport(first) == nullptr) {
    ++counts_.other;
    return;
  }
  if (isCut(usb, first)) return;
  SourceReport report;
  report.bytes = usb.data;
  report.id = first;
  report.type = typeOf(first, options_);
  report.typeGuessed = true;
  ++counts_.answers;
  ++counts_.guessed;
  handOver(report, devices_.get(interface_, usb));
}

void CaptureReports::unanswered(const UsbPending::Submit &submit) {
  const std::uint8_t id = lowByte(submit.setup.value);
  if (!isGetReport(submit.setup) || findReport(id) == nullptr) return;
  ++counts_.unanswered;
  tell(kUnansweredRead, id, "asked for, but the capture holds no answer", submit.packet);
}

bool CaptureReports::isCut(const UsbPacket &usb, std::optional<std::uint32_t> id) {
  if (!usb.isCut()) return false;
  ++counts_.cut;
  tell(kCutData, id,
       "the capture holds " + std::to_string(usb.data.size()) + " of the " + std::to_string(usb.dataSize) +
           " bytes that were transferred; not decoded. Record with a larger snapshot length");
  return true;
}

void CaptureReports::handOver(SourceReport report, const UsbDevice &device) {
  report.file = file_;
  if (report.place.kind == Place::Kind::kNone) {
    report.place = Place::packet(number_);
    report.timeNs = timeNs_;
  }
  report.index = index_++;
  report.device = device.name;
  report.vendorProduct = device.vendorProduct;
  sink_.report(report);
}

void CaptureReports::tell(const MessageKind &kind, std::optional<std::uint32_t> id, std::string text,
                          std::uint64_t packet) {
  sink_.message({&kind, std::string(file_), Place::packet(packet == 0 ? number_ : packet), id, std::move(text)});
}

void CaptureReports::finish(std::uint64_t packets) {
  devices_.forEach([this](UsbDevice &device) {
    for (UsbEndpoint &endpoint : device.endpoints)
      if (endpoint.assembly.isActive()) incomplete(device, endpoint.assembly);
  });
  while (const auto submit = pending_.takeOldest()) unanswered(*submit);
  std::string text = "packets " + std::to_string(packets) + ", reports " + std::to_string(index_);
  list(text, counts_.answers, "answers to requests");
  list(text, counts_.guessed, "of these without the request, so that the ID chose the type");
  list(text, counts_.inputs, "from interrupt transfers");
  list(text, counts_.assembled, "of these put together from pieces");
  list(text, counts_.failed, "failed reads");
  list(text, counts_.empty, "empty answers");
  list(text, counts_.unanswered, "reads without an answer");
  list(text, counts_.cut, "cut by the capture");
  list(text, counts_.incomplete, "incomplete");
  list(text, counts_.written, "SET_REPORTs (not decoded)");
  list(text, devices_.forgotten(), "devices too many to be remembered");
  list(text, counts_.other, "packets of other traffic");
  sink_.message({&kCaptureSummary, std::string(file_), {}, {}, std::move(text)});
  if (index_ == 0)
    sink_.message({&kNoReports, std::string(file_), {}, {}, "the capture holds no report of the controller"});
}

}  // namespace vesk::host
