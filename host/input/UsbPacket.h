// One record of a USB capture, the same for all writers.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "host/input/CaptureHandle.h"
#include "values/LittleEndian.h"

namespace vesk::host {

/// The eight bytes that begin a control transfer, little-endian in every capture.
struct UsbSetup {
  U8 requestType, request;
  U16 value, index, length;
};
static_assert(sizeof(UsbSetup) == 8);

struct UsbPacket {
  enum class Event : std::uint8_t {
    kSubmit,    // the host asks
    kComplete,  // the answer, or why there is none
    kStatus,    // the closing stage that older USBPcap writes behind the answer of a control transfer
    kOther,
  };
  enum class Transfer : std::uint8_t { kIsochronous, kInterrupt, kControl, kBulk, kOther };

  Event event = Event::kOther;
  Transfer transfer = Transfer::kOther;
  std::uint64_t transferId = 0;  // joins submit and completion; used again for later transfers
  std::uint16_t bus = 0, device = 0;
  std::uint8_t endpoint = 0;  // bit 7: towards the host
  bool usbpcap = false;       // whose status codes are not Linux's
  std::int32_t status = 0;    // 0 where all is well
  std::optional<UsbSetup> setup;
  std::string_view data;       // what the capture holds of it
  std::uint32_t dataSize = 0;  // what was transferred

  bool in() const { return (endpoint & 0x80) != 0; }
  bool isCut() const { return data.size() < dataSize; }
};

/// Reads the header that the link type has; nothing where the packet is shorter than that or contradicts itself.
std::optional<UsbPacket> readUsbPacket(const CapturedPacket &packet);

/// "-32 (stalled: the device does not know this report)".
std::string statusText(const UsbPacket &packet);

}  // namespace vesk::host
