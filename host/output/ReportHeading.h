// The words that introduce a report to people.
#pragma once

#include "host/output/OutputBuffer.h"
#include "host/report/SourceReport.h"

namespace vesk::host {

/// "feature 0xE3 open-short-result, 57 bytes"
void appendReportName(OutputBuffer &out, const SourceReport &report);

/// "== s.pcapng:packet 17 3.000412 s, device 1.7: feature 0xE3 open-short-result, 57 bytes", and a line feed.
void appendHeading(OutputBuffer &out, const SourceReport &report);

}  // namespace vesk::host
