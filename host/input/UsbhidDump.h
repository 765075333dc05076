// What usbhid-dump prints: the interrupt transfers of HID interfaces in chunks of hex.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

/// Transfers that begin no report of the controller: other devices, or a report whose beginning is missing.
inline constexpr MessageKind kOtherTransfers{"other-transfers", Severity::kNote, kExitOk};

extern const InputKind kUsbhidDump;

}  // namespace vesk::host
