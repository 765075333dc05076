// Numbers of a capture file in the byte order of whoever wrote it.
#pragma once

#include <cstdint>
#include <string_view>

namespace vesk::host {

/// REQUIRES: the number lies within `bytes`.
inline std::uint32_t number32(std::string_view bytes, std::size_t offset, bool bigEndian) {
  std::uint32_t number = 0;
  for (std::size_t i = 0; i < 4; ++i)
    number = number << 8 | static_cast<unsigned char>(bytes[offset + (bigEndian ? i : 3 - i)]);
  return number;
}

inline std::uint16_t number16(std::string_view bytes, std::size_t offset, bool bigEndian) {
  const auto high = static_cast<unsigned char>(bytes[offset + (bigEndian ? 0 : 1)]);
  const auto low = static_cast<unsigned char>(bytes[offset + (bigEndian ? 1 : 0)]);
  return static_cast<std::uint16_t>(high << 8 | low);
}

}  // namespace vesk::host
