// Where a report ends in bytes that say nothing of it but its ID.
#pragma once

#include <cstddef>
#include <string_view>

#include "host/diagnostics/Message.h"

namespace vesk::host {

/// One report as it was read, whose bytes would also make several.
inline constexpr MessageKind kRawManyReports{"raw-many-reports", Severity::kWarning, kExitOk};

/// How many bytes the report at the start of `bytes` has: what its ID says, or fewer at the end of the input. A text
/// ends with its zero, and the zeros that pad it are its own, for no report has the ID 0. 0 for no report of ours.
/// REQUIRES: !bytes.empty().
std::size_t reportLength(std::string_view bytes);

/// Whether `bytes` are a report of ours that lacks nothing: as long as its layout and padded with zeros at most, where
/// it may be padded, or a text with its zero.
bool isWholeReport(std::string_view bytes);

/// Whether `bytes` begin as a report does whose length its ID does not tell.
bool isTextReport(std::string_view bytes);

/// How many whole reports `bytes` are, one behind the other; 0 where something is left over.
std::size_t countReports(std::string_view bytes);

}  // namespace vesk::host
