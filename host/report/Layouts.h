// Every field of a report, down to the single module and event of the black box.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "host/report/KnownReports.h"

namespace vesk::host {

/// A row of the table, or one that was asked of the decoder: its texts are its own.
struct Field {
  std::uint32_t offset;
  FieldType type;
  std::uint32_t count;
  std::optional<unsigned> bit;  // where it is one bit of its byte
  std::string label, key, unit, note;

  std::uint32_t width() const { return count * elementWidth(type); }
};

/// The fields of a report in the order of their offsets. The black box's modules and events, hundreds of names, stand
/// nowhere but in the plug-in: byte by byte it is asked which key and which line change.
std::vector<Field> layoutOf(const KnownReport &report);

}  // namespace vesk::host
