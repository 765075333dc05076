// The packet headers of Linux's usbmon and of USBPcap on Windows.
#include "host/input/UsbPacket.h"

#include <algorithm>
#include <cstddef>
#include <cstring>

#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr std::uint32_t kSetupSize = sizeof(UsbSetup);

/// usbmon's header. In the file its numbers have the writer's byte order; libpcap has brought them to this machine's.
struct LinuxHeader {
  std::uint64_t urb;
  char event;
  std::uint8_t transfer, endpoint, device;
  std::uint16_t bus;
  char setupFlag, dataFlag;  // 0: there is one
  std::int64_t seconds;
  std::int32_t microseconds, status;
  std::uint32_t urbLength, capturedLength;
  char setup[kSetupSize];
};
static_assert(sizeof(LinuxHeader) == 48 && offsetof(LinuxHeader, setup) == 40);
constexpr std::size_t kMmappedHeaderSize = 64;  // the longer form has 16 bytes more, of which none is needed here

struct UsbpcapHeader {
  U16 headerLength;
  U64 irp;
  U32 status;
  U16 function;
  U8 info;
  U16 bus, device;
  U8 endpoint, transfer;
  U32 dataLength;
};
static_assert(sizeof(UsbpcapHeader) == 27 && offsetof(UsbpcapHeader, dataLength) == 23);

enum UsbpcapStage : char { kSetupStage = 0, kDataStage = 1, kStatusStage = 2, kCompleteStage = 3 };

UsbPacket::Transfer transferOf(std::uint8_t number) {
  return number < 4 ? static_cast<UsbPacket::Transfer>(number) : UsbPacket::Transfer::kOther;
}

UsbSetup setupAt(const char *bytes) {
  return read<UsbSetup>(bytes);
}

std::optional<UsbPacket> readLinux(std::string_view bytes, std::size_t headerSize) {
  if (bytes.size() < headerSize) return {};
  LinuxHeader header;
  std::memcpy(&header, bytes.data(), sizeof(header));
  UsbPacket packet;
  switch (header.event) {
    case 'S':
      packet.event = UsbPacket::Event::kSubmit;
      break;
    case 'C':
    case 'E':
      packet.event = UsbPacket::Event::kComplete;
      break;
    default:
      return {};
  }
  packet.transfer = transferOf(header.transfer);
  packet.transferId = header.urb;
  packet.bus = header.bus;
  packet.device = header.device;
  packet.endpoint = header.endpoint;
  packet.status = header.status;
  if (packet.transfer == UsbPacket::Transfer::kControl && packet.event == UsbPacket::Event::kSubmit &&
      header.setupFlag == 0)
    packet.setup = setupAt(header.setup);
  // Data go one way only: with the submit towards the device, with the completion towards the host.
  if (packet.in() == (packet.event == UsbPacket::Event::kComplete)) {
    packet.dataSize = header.urbLength;
    if (header.dataFlag == 0) packet.data = bytes.substr(headerSize, std::min(header.capturedLength, header.urbLength));
  }
  return packet;
}

void readUsbpcapStage(UsbPacket &packet, char stage) {
  switch (stage) {
    case kSetupStage:
      packet.event = UsbPacket::Event::kSubmit;
      if (packet.data.size() < kSetupSize) break;
      packet.setup = setupAt(packet.data.data());
      packet.data.remove_prefix(kSetupSize);
      packet.dataSize -= kSetupSize;
      break;
    case kDataStage:
      // Data towards the device belong to a request that has been seen whole in its setup stage.
      if (packet.event == UsbPacket::Event::kSubmit) packet.event = UsbPacket::Event::kOther;
      break;
    case kStatusStage:
      packet.event = UsbPacket::Event::kStatus;
      break;
    case kCompleteStage:
      packet.event = UsbPacket::Event::kComplete;
      break;
    default:
      packet.event = UsbPacket::Event::kOther;
  }
}

std::optional<UsbPacket> readUsbpcap(std::string_view bytes) {
  if (bytes.size() < sizeof(UsbpcapHeader)) return {};
  const auto header = read<UsbpcapHeader>(bytes.data());
  const std::size_t headerSize = header.headerLength;
  if (headerSize < sizeof(UsbpcapHeader) || headerSize > bytes.size()) return {};
  UsbPacket packet;
  packet.event = (header.info & 1) != 0 ? UsbPacket::Event::kComplete : UsbPacket::Event::kSubmit;
  packet.transfer = transferOf(header.transfer);
  packet.transferId = header.irp;
  packet.bus = header.bus;
  packet.device = header.device;
  packet.endpoint = header.endpoint;
  packet.usbpcap = true;
  packet.status = static_cast<std::int32_t>(std::uint32_t{header.status});
  packet.dataSize = header.dataLength;
  packet.data = bytes.substr(headerSize, packet.dataSize);
  if (packet.transfer == UsbPacket::Transfer::kControl && headerSize > sizeof(UsbpcapHeader))
    readUsbpcapStage(packet, bytes[sizeof(UsbpcapHeader)]);
  return packet;
}

std::string_view meaningOf(std::int32_t status, bool usbpcap) {
  if (usbpcap) {
    switch (static_cast<std::uint32_t>(status)) {
      case 0xC0000004:
        return "stalled: the device does not know this report";
      case 0xC0007000:
        return "the device is gone";
      case 0xC0010000:
        return "cancelled";
      default:
        return "refused by the USB driver";
    }
  }
  switch (status) {
    case -32:
      return "stalled: the device does not know this report";
    case -75:
      return "the device sent more than was asked for";
    case -71:
    case -84:
      return "bus error";
    case -110:
      return "timed out";
    case -2:
    case -104:
      return "cancelled";
    case -108:
    case -19:
      return "the device is gone";
    default:
      return "failed";
  }
}

}  // namespace

std::optional<UsbPacket> readUsbPacket(const CapturedPacket &packet) {
  switch (packet.linkType) {
    case DLT_USB_LINUX:
      return readLinux(packet.bytes, sizeof(LinuxHeader));
    case DLT_USB_LINUX_MMAPPED:
      return readLinux(packet.bytes, kMmappedHeaderSize);
    case DLT_USBPCAP:
      return readUsbpcap(packet.bytes);
    default:
      return {};
  }
}

std::string statusText(const UsbPacket &packet) {
  const std::string number =
      packet.usbpcap ? formatted<"0x%08X">(static_cast<std::uint32_t>(packet.status)) : std::to_string(packet.status);
  return number + " (" + std::string(meaningOf(packet.status, packet.usbpcap)) + ")";
}

}  // namespace vesk::host
