// What the kernel's usbmon shows as text: one line an event, with at most 32 bytes of data.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

/// What the text holds besides reports.
inline constexpr MessageKind kUsbmonSummary{"usbmon-summary", Severity::kNote, kExitOk};

extern const InputKind kUsbmonText;

}  // namespace vesk::host
