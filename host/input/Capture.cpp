// Recognises captures, reads their packets to the end, and refuses those that hold no USB transfers.
#include "host/input/Capture.h"

#include <algorithm>
#include <array>
#include <string>

#include "host/input/CaptureFile.h"
#include "host/input/CaptureReports.h"

namespace vesk::host {

namespace {

constexpr MessageKind kUnsupportedCapture{"unsupported-capture", Severity::kError, kExitUnreadable};
constexpr MessageKind kOtherLinkType{"other-link-type", Severity::kNote, kExitOk};

constexpr std::string_view kWhatHelps = "record with usbmon on Linux or with USBPcap on Windows";

std::string linkTypeText(int linkType) {
  constexpr int kUsbFreeBsd = 186, kUsb20 = 288, kUsb20Low = 293, kUsb20Full = 294, kUsb20High = 295;
  const std::string number = " (link type " + std::to_string(linkType) + ")";
  switch (linkType) {
    case kUsbFreeBsd:
      return "USB transfers as FreeBSD records them" + number + ", a form that is not read here";
    case kUsb20:
      return "USB 2.0 bus packets" + number + ", in which reports are cut into pieces with check sums";
    case kUsb20Low:
      return "USB 2.0 low-speed bus packets" + number + ", in which reports are cut into pieces with check sums";
    case kUsb20Full:
      return "USB 2.0 full-speed bus packets" + number + ", in which reports are cut into pieces with check sums";
    case kUsb20High:
      return "USB 2.0 high-speed bus packets" + number + ", in which reports are cut into pieces with check sums";
    default:
      break;
  }
  const char *name = pcap_datalink_val_to_description(linkType);
  return "no USB traffic but " + (name == nullptr ? "packets of link type " + std::to_string(linkType) : name + number);
}

std::string packetsText(std::uint64_t count) {
  return std::to_string(count) + (count == 1 ? " packet" : " packets");
}

/// Tells what was in the file that is no USB capture; true where nothing else was in it.
bool tellOthers(const CaptureFile &file, std::string_view name, ReadSink &sink) {
  for (const auto &[linkType, packets] : file.otherLinkTypes()) {
    if (file.hasUsb())
      sink.message({&kOtherLinkType,
                    std::string(name),
                    {},
                    {},
                    packetsText(packets) + " of an interface passed over: it holds " + linkTypeText(linkType)});
    else
      sink.message({&kUnsupportedCapture,
                    std::string(name),
                    {},
                    {},
                    "the capture holds " + linkTypeText(linkType) + "; " + std::string(kWhatHelps)});
  }
  return !file.hasUsb() && !file.otherLinkTypes().empty();
}

}  // namespace

bool isCapture(std::string_view head) {
  constexpr std::array<std::string_view, 5> kMagics = {"\xd4\xc3\xb2\xa1", "\xa1\xb2\xc3\xd4", "\x4d\x3c\xb2\xa1",
                                                       "\xa1\xb2\x3c\x4d", "\x0a\x0d\x0d\x0a"};
  return std::any_of(kMagics.begin(), kMagics.end(), [&](std::string_view magic) { return head.starts_with(magic); });
}

void readCapture(ByteSource &source, const ReadOptions &options, ReadSink &sink) {
  CaptureReports reports(source.name(), options, sink);
  const auto file = CaptureFile::open(source, sink);
  const auto finish = [&] {
    if (!tellOthers(*file, source.name(), sink)) reports.finish(file->packets());
  };
  try {
    for (CapturedPacket packet; file->next(packet);) reports.packet(packet);
  } catch (const InputError &) {
    finish();
    throw;
  }
  finish();
}

}  // namespace vesk::host
