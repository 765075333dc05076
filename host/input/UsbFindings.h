// What can be wrong with reports on their way over the bus, whoever recorded them.
#pragma once

#include "host/diagnostics/Message.h"

namespace vesk::host {

inline constexpr MessageKind kCutData{"cut-data", Severity::kError, kExitFindings};
inline constexpr MessageKind kWrongReportId{"wrong-report-id", Severity::kError, kExitFindings};
inline constexpr MessageKind kIncompleteReport{"incomplete-report", Severity::kError, kExitFindings};
inline constexpr MessageKind kFailedRead{"failed-read", Severity::kWarning, kExitOk};
inline constexpr MessageKind kEmptyRead{"empty-read", Severity::kWarning, kExitOk};
inline constexpr MessageKind kUnansweredRead{"unanswered-read", Severity::kWarning, kExitOk};
inline constexpr MessageKind kUnprovenInput{"unproven-input", Severity::kWarning, kExitOk};

}  // namespace vesk::host
