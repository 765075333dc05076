// Raw binary: the bytes of one report, or of many one behind the other.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

/// More bytes than any report has, and nobody said that they are many.
inline constexpr MessageKind kRawTooLong{"raw-too-long", Severity::kError, kExitFindings};
/// Split input that goes on with a byte that is no report ID, so that nobody can say where the next report begins.
inline constexpr MessageKind kRawNoReportId{"raw-no-report-id", Severity::kError, kExitFindings};

extern const InputKind kRawBinary;

}  // namespace vesk::host
