// Text output: the plug-in's display lines as they are printed, and nothing else.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

std::unique_ptr<Formatter> makeTextFormatter(const FormatOptions &options);

}  // namespace vesk::host
