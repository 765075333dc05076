// What is true of reports on their way over the bus, and what can be wrong with them, whoever recorded them.
#pragma once

#include <cstddef>

#include "host/diagnostics/Message.h"

namespace vesk::host {

/// The smallest piece by which data of a device that is not known to be the controller are taken for its own at once:
/// what mice, keyboards and joysticks send is shorter.
inline constexpr std::size_t kLargePiece = 64;

inline constexpr MessageKind kCutData{"cut-data", Severity::kError, kExitFindings};
inline constexpr MessageKind kWrongReportId{"wrong-report-id", Severity::kError, kExitFindings};
inline constexpr MessageKind kIncompleteReport{"incomplete-report", Severity::kError, kExitFindings};
inline constexpr MessageKind kFailedRead{"failed-read", Severity::kWarning, kExitOk};
inline constexpr MessageKind kEmptyRead{"empty-read", Severity::kWarning, kExitOk};
inline constexpr MessageKind kUnansweredRead{"unanswered-read", Severity::kWarning, kExitOk};
inline constexpr MessageKind kUnprovenInput{"unproven-input", Severity::kWarning, kExitOk};

}  // namespace vesk::host
