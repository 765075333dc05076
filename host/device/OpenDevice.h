// From the name that a user gives to an open device.
#pragma once

#include <memory>
#include <span>
#include <stdexcept>
#include <string>

#include "host/device/HidNode.h"
#include "host/device/Stop.h"
#include "host/diagnostics/Message.h"

namespace vesk::host {

inline constexpr MessageKind kNoDevice{"no-device", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kAmbiguousDevice{"ambiguous-device", Severity::kError, kExitUsage};
inline constexpr MessageKind kDeviceDenied{"device-denied", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kDeviceUnopened{"device-unopened", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kDeviceUnreadable{"device-unreadable", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kDeviceGone{"device-gone", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kInterrupted{"interrupted", Severity::kWarning, kExitOk};

/// No device to work with; the message says why.
class DeviceError : public std::runtime_error {
 public:
  explicit DeviceError(Message message) : runtime_error(message.text), message_(std::move(message)) {}
  const Message &message() const { return message_; }

 private:
  Message message_;
};

/// The node that `name` means: a path, which is taken as it is; "hidraw3"; vendor:product; a serial number; or, where
/// it is empty, the one device that speaks our reports. Where IDs or a serial number are shared, the one among them
/// that speaks our reports is meant. Throws DeviceError.
std::string findDevice(std::span<const DeviceIdentity> devices, const std::string &name);

/// The node that a path leads to, links followed, as devices are listed by it.
std::string canonicalNode(const std::string &path);

/// Opens the device that `name` means. For a second it tries again where rights are missing or the node is: after
/// hot-plug both come a little later than the device; and where a signal came between. Throws DeviceError; returns null
/// when a stop was requested.
std::unique_ptr<HidNode> openDevice(HidSystem &system, const std::string &name, const Stop &stop);

/// "1234:5678"
std::string idsText(const DeviceIdentity &device);

/// What a device says of itself, without control characters.
std::string printable(std::string_view text);

}  // namespace vesk::host
