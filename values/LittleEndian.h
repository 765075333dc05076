// Little-endian fields of alignment 1, so that a report's layout is a plain struct, and the one function that reads a
// report's memory.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace vesk {

static_assert(std::endian::native == std::endian::little, "fields are read in the machine's own byte order");

/// A number as it lies in a report: its bytes, least significant first, at any address.
template <class Number>
class LittleEndian {
 public:
  using value_type = Number;

  operator Number() const noexcept {
    Number number;
    std::memcpy(&number, bytes_, sizeof(number));
    return number;
  }

 private:
  unsigned char bytes_[sizeof(Number)];
};

using U8 = LittleEndian<std::uint8_t>;
using U16 = LittleEndian<std::uint16_t>;
using U32 = LittleEndian<std::uint32_t>;
using U64 = LittleEndian<std::uint64_t>;
using I32 = LittleEndian<std::int32_t>;
using F32 = LittleEndian<float>;

/// Copies one layout out of a report. REQUIRES: sizeof(Layout) readable bytes behind `bytes`.
template <class Layout>
Layout read(const char *bytes) noexcept {
  static_assert(std::is_trivially_copyable_v<Layout> && alignof(Layout) == 1);
  Layout layout;
  std::memcpy(&layout, bytes, sizeof(layout));
  return layout;
}

}  // namespace vesk
