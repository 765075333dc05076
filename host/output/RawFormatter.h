// The reports themselves, one behind the other.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

std::unique_ptr<Formatter> makeRawFormatter(const FormatOptions &options);

}  // namespace vesk::host
