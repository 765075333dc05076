// Input reports from interrupt transfers: whole ones, ones in pieces, and what only looks like one.
#include <bit>

#include "host/input/CaptureReports.h"

namespace vesk::host {

namespace {

/// Whether a transfer of this size may be the first piece of a report, which is to say, filled the buffer it had.
bool mayBePiece(std::size_t size, const UsbEndpoint &endpoint) {
  if (endpoint.packetSize != 0) return size % endpoint.packetSize == 0;
  return size >= 8 && std::has_single_bit(size);
}

}  // namespace

void CaptureReports::interrupt(const UsbPacket &usb) {
  if (usb.event != UsbPacket::Event::kComplete || !usb.in()) return;
  if (usb.status != 0 || usb.dataSize == 0) {
    ++counts_.other;
    return;
  }
  UsbDevice *device = devices_.find(interface_, usb);
  UsbEndpoint *endpoint = device == nullptr ? nullptr : &device->endpoint(usb.endpoint);
  const std::uint32_t first = usb.data.empty() ? 0 : static_cast<std::uint8_t>(usb.data[0]);
  const KnownReport *known = findReport(first);
  if (known != nullptr && known->type != ReportType::kInput) known = nullptr;
  if (endpoint != nullptr && endpoint->otherClass) {
    ++counts_.other;
    return;
  }
  const bool inPieces = endpoint != nullptr && endpoint->assembly.isActive();
  if (usb.isCut()) {
    const bool ours = known != nullptr ? usb.dataSize >= kLargePiece : endpoint != nullptr && endpoint->ours;
    if (inPieces) endpoint->assembly.end();
    if (!ours && !inPieces)
      ++counts_.other;
    else
      isCut(usb, known != nullptr ? std::optional(first) : std::nullopt);
    return;
  }
  if (inPieces && continueAssembly(*device, *endpoint, usb.data)) return;
  if (known != nullptr)
    inputOfKnownId(*known, usb);
  else
    inputOfUnknownId(device, endpoint, usb);
}

bool CaptureReports::continueAssembly(UsbDevice &device, UsbEndpoint &endpoint, std::string_view piece) {
  InputAssembly &assembly = endpoint.assembly;
  if (!assembly.append(piece)) {
    incomplete(device, assembly);
    return false;
  }
  if (!assembly.isWhole()) return true;
  SourceReport report;
  report.bytes = assembly.bytes();
  report.id = assembly.report().id;
  report.type = ReportType::kInput;
  report.place = Place::packet(assembly.packet());
  report.timeNs = assembly.timeNs();
  if (device.ours || assembly.isConvincing()) {
    device.ours = endpoint.ours = endpoint.inPieces = true;
  } else {
    tell(kUnprovenInput, report.id,
         "put together from pieces of " + std::to_string(assembly.pieceSize()) +
             " bytes, and nothing else in the capture shows that device " + device.name + " is the controller",
         assembly.packet());
  }
  assembly.end();
  ++counts_.inputs;
  ++counts_.assembled;
  handOver(report, device);
  return true;
}

void CaptureReports::inputOfKnownId(const KnownReport &known, const UsbPacket &usb) {
  UsbDevice &device = devices_.get(interface_, usb);
  UsbEndpoint &endpoint = device.endpoint(usb.endpoint);
  const std::size_t size = usb.data.size();
  if (size < known.layoutSize && mayBePiece(size, endpoint)) {
    endpoint.assembly.begin(known, usb.data, number_, timeNs_);
    return;
  }
  if (size < kLargePiece && !endpoint.ours) {
    ++counts_.other;
    return;
  }
  if (size == known.layoutSize) device.ours = endpoint.ours = true;
  SourceReport report;
  report.bytes = usb.data;
  report.id = known.id;
  report.type = ReportType::kInput;
  ++counts_.inputs;
  handOver(report, device);
}

void CaptureReports::inputOfUnknownId(UsbDevice *device, UsbEndpoint *endpoint, const UsbPacket &usb) {
  if (endpoint == nullptr || !endpoint->ours) {
    ++counts_.other;
    return;
  }
  const std::uint32_t first = static_cast<std::uint8_t>(usb.data[0]);
  if (endpoint->inPieces) {
    ++counts_.incomplete;
    return tell(kIncompleteReport, {}, "a piece of an input report without its beginning; not decoded");
  }
  SourceReport report;
  report.bytes = usb.data;
  report.id = first;
  report.type = ReportType::kInput;
  ++counts_.inputs;
  handOver(report, *device);
}

void CaptureReports::incomplete(const UsbDevice &device, InputAssembly &assembly) {
  if (!device.ours && assembly.pieceSize() < kLargePiece) {
    ++counts_.other;
  } else {
    ++counts_.incomplete;
    tell(kIncompleteReport, assembly.report().id,
         "only " + std::to_string(assembly.bytes().size()) + " of " + std::to_string(assembly.report().layoutSize) +
             " bytes came, in pieces of " + std::to_string(assembly.pieceSize()) + "; not decoded",
         assembly.packet());
  }
  assembly.end();
}

}  // namespace vesk::host
