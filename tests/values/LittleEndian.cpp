// Fields of every width, at any address.
#include "values/LittleEndian.h"

#include <gtest/gtest.h>

#include <array>
#include <cstddef>

namespace {

struct Layout {
  vesk::U8 a;
  vesk::U16 b;
  vesk::U32 c;
  vesk::U64 d;
  vesk::I32 e;
  vesk::F32 f;
  std::array<vesk::U16, 2> g;
};
static_assert(alignof(Layout) == 1 && sizeof(Layout) == 27);

TEST(LittleEndian, EveryWidthAtEveryAlignment) {
  for (std::size_t shift = 0; shift < 8; ++shift) {
    char bytes[40] = {};
    constexpr unsigned char kReport[] = {0x81, 0x02, 0x91, 0x04, 0x05, 0x06, 0xA7, 0x11, 0x12,
                                         0x13, 0x14, 0x15, 0x16, 0x17, 0x98, 0xFE, 0xFF, 0xFF,
                                         0xFF, 0x00, 0x00, 0xC0, 0xBF, 0x34, 0x12, 0xCD, 0xAB};
    static_assert(sizeof(kReport) == sizeof(Layout));
    std::memcpy(bytes + shift, kReport, sizeof(kReport));
    const auto r = vesk::read<Layout>(bytes + shift);
    EXPECT_EQ(r.a, 0x81u);
    EXPECT_EQ(r.b, 0x9102u);
    EXPECT_EQ(r.c, 0xA7060504u);
    EXPECT_EQ(r.d, 0x9817161514131211u);
    EXPECT_EQ(r.e, -2);
    EXPECT_EQ(r.f, -1.5f);
    EXPECT_EQ(r.g[0], 0x1234u);
    EXPECT_EQ(r.g[1], 0xABCDu);
  }
}

TEST(LittleEndian, ReadTakesACopy) {
  char bytes[] = {1, 0};
  const auto field = vesk::read<vesk::U16>(bytes);
  bytes[0] = 2;
  EXPECT_EQ(field, 1u);
}

}  // namespace
