// One row of a report's layout, as the table of known reports holds it.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

namespace vesk::host {

enum class FieldType : std::uint8_t {
  kU8,
  kU16,
  kU32,
  kU64,
  kI32,
  kF32,
  kString,   // to its terminating zero, however long
  kBytes,    // shown as they stand
  kUnused,   // nobody's
  kOption,   // one byte: level and flags of a black box event
  kBit,      // one bit of a byte
  kModules,  // one field for each module or event of the black box; layoutOf() asks the decoder which
};

constexpr std::string_view fieldTypeName(FieldType type) {
  constexpr std::string_view kNames[] = {"u8",   "u16",   "u32",    "u64",    "i32", "float",
                                         "text", "bytes", "unused", "option", "bit", "modules"};
  return kNames[static_cast<std::size_t>(type)];
}

/// Bytes of one element. Text, bytes and the like are counted in bytes.
constexpr std::uint32_t elementWidth(FieldType type) {
  switch (type) {
    case FieldType::kU16:
      return 2;
    case FieldType::kU32:
    case FieldType::kI32:
    case FieldType::kF32:
      return 4;
    case FieldType::kU64:
      return 8;
    default:
      return 1;
  }
}

/// Stands for a label or a key where a form does not show the field.
inline constexpr std::string_view kNotShown = "-";

struct FieldRow {
  std::uint32_t offset;  // of the first byte, the report ID being byte 0
  FieldType type;
  std::uint32_t count;     // elements of an array; bytes for types that have no elements; else 1
  std::string_view label;  // on the line that shows it, or over the lines of an array
  std::string_view key;    // in the value, as a JSON Pointer
  std::string_view unit = {};
  std::string_view note = {};  // what is strange, and what the two forms show differently and why

  constexpr std::uint32_t end() const { return offset + count * elementWidth(type); }
};

/// Bytes that the rows take, the report ID counted.
constexpr std::uint32_t layoutSize(std::span<const FieldRow> rows) {
  std::uint32_t size = 1;
  for (const FieldRow &row : rows) size = row.end() > size ? row.end() : size;
  return size;
}

}  // namespace vesk::host
