// The layouts of hex text that are refused, because their bytes cannot be told for certain or are no bytes.
#pragma once

#include <optional>
#include <string>

#include "host/diagnostics/Message.h"
#include "host/input/HexTextLine.h"

namespace vesk::host {

/// Each message names the command that works.
inline constexpr MessageKind kSwappedWords{"swapped-words", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kOctalText{"octal-text", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kDecimalText{"decimal-text", Severity::kError, kExitUnreadable};
inline constexpr MessageKind kBitText{"bit-text", Severity::kError, kExitUnreadable};

struct LayoutRefusal {
  const MessageKind *kind;
  std::string text;
};

/// By the number of digits of a data line's fields. `isFirst`: it is the first line of a report.
std::optional<LayoutRefusal> refuseLayout(const HexTextLine &line, bool isFirst);

/// By the text column, for a line with an offset in front of `bytes`: 'xxd -e' swaps the bytes of its groups and looks
/// like 'xxd' otherwise.
std::optional<LayoutRefusal> refuseSwappedText(const HexTextLine &line, std::string_view bytes);

}  // namespace vesk::host
