// The table of well-formed UTF-8 byte sequences, walked.
#include "values/Utf8.h"

#include <cstddef>

namespace vesk {

bool isUtf8(std::string_view bytes) noexcept {
  const auto at = [&](std::size_t i) { return static_cast<unsigned char>(bytes[i]); };
  for (std::size_t i = 0; i < bytes.size();) {
    const unsigned char lead = at(i);
    std::size_t following = 0;
    unsigned char low = 0x80, high = 0xBF;  // what the second byte may be
    if (lead < 0x80)
      following = 0;
    else if (lead >= 0xC2 && lead <= 0xDF)
      following = 1;
    else if (lead >= 0xE0 && lead <= 0xEF)
      following = 2;
    else if (lead >= 0xF0 && lead <= 0xF4)
      following = 3;
    else
      return false;
    if (lead == 0xE0)
      low = 0xA0;  // below: overlong
    else if (lead == 0xED)
      high = 0x9F;  // above: surrogates
    else if (lead == 0xF0)
      low = 0x90;  // below: overlong
    else if (lead == 0xF4)
      high = 0x8F;  // above: beyond U+10FFFF
    if (bytes.size() - i <= following) return false;
    for (std::size_t k = 1; k <= following; ++k, low = 0x80, high = 0xBF)
      if (at(i + k) < low || at(i + k) > high) return false;
    i += following + 1;
  }
  return true;
}

}  // namespace vesk
