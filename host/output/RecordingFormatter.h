// The reports themselves as a HID recording.
#pragma once

#include "host/output/Formatter.h"

namespace vesk::host {

std::unique_ptr<Formatter> makeRecordingFormatter(const FormatOptions &options);

}  // namespace vesk::host
