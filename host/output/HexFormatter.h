// The reports themselves as hex text that names each of them.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

std::unique_ptr<Formatter> makeHexFormatter(const FormatOptions &options);

}  // namespace vesk::host
