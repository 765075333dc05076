// Hex text in every byte-wise layout: xxd, hexdump -C, od -tx1, arrays of C, plain digits.
#pragma once

#include "host/input/Input.h"

namespace vesk::host {

/// Words between the reports, taken as a label.
inline constexpr MessageKind kTextSkipped{"text-skipped", Severity::kNote, kExitOk};

extern const InputKind kHexText;

}  // namespace vesk::host
