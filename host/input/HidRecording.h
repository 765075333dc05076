// Recordings of HID devices in lines of text, and our own line for feature reports. See docs/RECORDING.md.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

/// A report of which the line says another length than it has bytes.
inline constexpr MessageKind kLengthMismatch{"length-mismatch", Severity::kError, kExitFindings};
/// A line of a kind that no recorder writes.
inline constexpr MessageKind kUnknownLine{"unknown-line", Severity::kWarning, kExitOk};
/// A report as it was before a filter program changed it, which stands beside the one that came out.
inline constexpr MessageKind kBeforeFilter{"before-filter", Severity::kNote, kExitOk};
/// A time before that of the report before it. One recorder's clock starts again after a day.
inline constexpr MessageKind kTimeBackwards{"time-backwards", Severity::kNote, kExitOk};
/// A time that cannot be: the report goes on without it.
inline constexpr MessageKind kBadTime{"bad-time", Severity::kWarning, kExitOk};
/// More devices than anybody has.
inline constexpr MessageKind kTooManyDevices{"too-many-devices", Severity::kError, kExitFindings};

extern const InputKind kHidRecording;

}  // namespace vesk::host
