// A second way to a report's display lines: from its value, through the C library's printf.
#pragma once

#include <string>
#include <string_view>

#include "values/ReportValue.h"

namespace fuzz {

/// The lines that string mode must give, each followed by a line feed, made from what object mode gave. What the value
/// does not hold (a magic number's bytes, one module's event count) comes out of `report`, which has the layout's
/// bytes.
std::string printedValue(unsigned id, const ReportValue &value, std::string_view report, bool decimal);

/// Text of a version report up to its first zero, split at line feeds, each piece followed by a line feed.
std::string printedVersion(std::string_view report);

}  // namespace fuzz
