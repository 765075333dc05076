// CSV output for the reports that are samples: one row a channel, ready for a data frame or a spreadsheet.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

std::unique_ptr<Formatter> makeCsvFormatter(const FormatOptions &options);

}  // namespace vesk::host
