// The lines of a HID recording that hold bytes.
#pragma once

#include <cstdint>
#include <string_view>

#include "host/output/OutputBuffer.h"
#include "host/report/SourceReport.h"

namespace vesk::host {

/// To the nearest microsecond. REQUIRES: nanoseconds >= 0.
constexpr std::int64_t roundedMicroseconds(std::int64_t nanoseconds) {
  return nanoseconds / 1000 + (nanoseconds % 1000 >= 500 ? 1 : 0);
}

/// "R: 4 06 00 ff c0": a report descriptor.
void appendDescriptorLine(OutputBuffer &out, std::string_view descriptor);

/// "E: 000002.500135 3 77 00 01" for an input report, and the same with F: for a feature report.
void appendRecordingLine(OutputBuffer &out, ReportType type, std::int64_t microseconds, std::string_view bytes);

}  // namespace vesk::host
