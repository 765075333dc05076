// One line of usbmon text and its parts.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace vesk::host {

struct UsbmonEvent {
  std::uint64_t tag = 0;
  std::uint32_t microseconds = 0;  // of a clock that starts again after little more than an hour
  char step = 0;                   // S: submitted, C: completed, E: could not be submitted
  char transfer = 0;               // C control, I interrupt, Z isochronous, B bulk
  bool in = false;
  std::uint64_t bus = 0, device = 0;  // older kernels leave out the bus
  std::string_view rest;              // from the status on
};

/// "ffff888100000001 1001500 C Ci:1:007:0 0 7 = e00d0500 214024"
std::optional<UsbmonEvent> parseUsbmonEvent(std::string_view line);

/// What a host asked of a device.
struct UsbRequest {
  static constexpr std::uint64_t kGetReport = 0xA101, kSetReport = 0x2109, kGetDescriptor = 0x8006;
  std::uint64_t kind = 0;   // bmRequestType << 8 | bRequest
  std::uint64_t value = 0;  // wValue: report type and ID, or descriptor type
  std::uint64_t line = 0;

  std::uint32_t reportId() const { return static_cast<std::uint32_t>(value & 0xFF); }
};

/// "s a1 01 03e0 0000 0007 7 <"
std::optional<UsbRequest> parseUsbmonRequest(std::string_view rest);

/// Takes what stands before the next colon from the front of `text`.
std::string_view takeUsbmonPart(std::string_view &text);

}  // namespace vesk::host
