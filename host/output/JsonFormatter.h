// JSON output: one document, or one object a line. The shape is a contract; docs/JSON.md describes it.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

/// {"format": ..., "tool": ..., "reports": [one record a line], "messages": ..., "exit_status": ...}
std::unique_ptr<Formatter> makeJsonFormatter(const FormatOptions &options);
/// One record a line, and a last line for what the document has beside its reports.
std::unique_ptr<Formatter> makeJsonLinesFormatter(const FormatOptions &options);

}  // namespace vesk::host
