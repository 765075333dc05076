// Strictness of the UTF-8 test, at every boundary.
#include "values/Utf8.h"

#include <gtest/gtest.h>

#include <string>

namespace {

struct Row {
  const char *what;
  std::string bytes;
  bool valid;
};

const Row kRows[] = {
    {"nothing", "", true},
    {"a zero byte", std::string(1, '\0'), true},
    {"ASCII", "1.2.3-rc/\x7F", true},
    {"U+0080", "\xC2\x80", true},
    {"U+07FF", "\xDF\xBF", true},
    {"U+0800", "\xE0\xA0\x80", true},
    {"U+0FFF", "\xE0\xBF\xBF", true},
    {"U+1000", "\xE1\x80\x80", true},
    {"U+CFFF", "\xEC\xBF\xBF", true},
    {"U+D000", "\xED\x80\x80", true},
    {"U+D7FF, below the surrogates", "\xED\x9F\xBF", true},
    {"U+E000, above the surrogates", "\xEE\x80\x80", true},
    {"U+FFFF", "\xEF\xBF\xBF", true},
    {"U+10000", "\xF0\x90\x80\x80", true},
    {"U+3FFFF", "\xF0\xBF\xBF\xBF", true},
    {"U+40000", "\xF1\x80\x80\x80", true},
    {"U+FFFFF", "\xF3\xBF\xBF\xBF", true},
    {"U+100000", "\xF4\x80\x80\x80", true},
    {"U+10FFFF", "\xF4\x8F\xBF\xBF", true},
    {"mixed lengths", "a\xC3\xA4\xE2\x82\xAC\xF0\x9F\x98\x80z", true},

    {"U+D800", "\xED\xA0\x80", false},
    {"U+DBFF", "\xED\xAF\xBF", false},
    {"U+DC00", "\xED\xB0\x80", false},
    {"U+DFFF", "\xED\xBF\xBF", false},
    {"a surrogate pair", "\xED\xA0\xBD\xED\xB8\x80", false},
    {"U+110000", "\xF4\x90\x80\x80", false},
    {"U+13FFFF", "\xF4\xBF\xBF\xBF", false},
    {"U+140000", "\xF5\x80\x80\x80", false},
    {"five bytes", "\xF8\x88\x80\x80\x80", false},
    {"six bytes", "\xFC\x84\x80\x80\x80\x80", false},
    {"FE", "\xFE", false},
    {"FF", "\xFF", false},
    {"overlong zero, 2 bytes", "\xC0\x80", false},
    {"overlong slash, 2 bytes", "\xC0\xAF", false},
    {"overlong U+007F, 2 bytes", "\xC1\xBF", false},
    {"overlong zero, 3 bytes", "\xE0\x80\x80", false},
    {"overlong U+07FF, 3 bytes", "\xE0\x9F\xBF", false},
    {"overlong zero, 4 bytes", "\xF0\x80\x80\x80", false},
    {"overlong U+FFFF, 4 bytes", "\xF0\x8F\xBF\xBF", false},
    {"a continuation alone", "\x80", false},
    {"the last continuation alone", "\xBF", false},
    {"a continuation after a whole character", "\xC2\x80\x80", false},
    {"cut after 1 of 2", "\xC2", false},
    {"cut after 1 of 3", "\xE1", false},
    {"cut after 2 of 3", "\xE1\x80", false},
    {"cut after 1 of 4", "\xF1", false},
    {"cut after 2 of 4", "\xF1\x80", false},
    {"cut after 3 of 4", "\xF1\x80\x80", false},
    {"cut by a letter, 2 bytes", "\xC2z", false},
    {"cut by a letter, 3 bytes", "\xE1\x80z", false},
    {"cut by a letter, 4 bytes", "\xF1\x80\x80z", false},
    {"a lead where a continuation belongs", "\xE1\xC2\x80", false},
    {"bad at the end of good text", "version 1\xFF", false},
    {"bad at the beginning of good text", "\xFFversion 1", false},
};

TEST(Utf8, Table) {
  for (const Row &row : kRows) EXPECT_EQ(vesk::isUtf8(row.bytes), row.valid) << row.what;
}

/// The encoder that the standard describes, for every code point there is.
std::string encode(unsigned point) {
  const auto byte = [](unsigned value) { return static_cast<char>(value); };
  const auto tail = [&](unsigned shift) { return byte(0x80 | (point >> shift & 0x3F)); };
  if (point < 0x80) return {byte(point)};
  if (point < 0x800) return {byte(0xC0 | point >> 6), tail(0)};
  if (point < 0x10000) return {byte(0xE0 | point >> 12), tail(6), tail(0)};
  return {byte(0xF0 | point >> 18), tail(12), tail(6), tail(0)};
}

TEST(Utf8, EveryCodePoint) {
  for (unsigned point = 0; point <= 0x1FFFFF; ++point) {
    const bool valid = point <= 0x10FFFF && (point < 0xD800 || point > 0xDFFF);
    ASSERT_EQ(vesk::isUtf8(encode(point)), valid) << std::hex << point;
  }
}

/// Of the sequences of two, and of three bytes with a fixed continuation, exactly as many are good as the encoder
/// makes.
TEST(Utf8, CountOfGoodSequences) {
  unsigned ofTwo = 0, ofThree = 0;
  for (unsigned a = 0x80; a < 0x100; ++a)
    for (unsigned b = 0; b < 0x100; ++b) {
      const std::string pair = {static_cast<char>(a), static_cast<char>(b)};
      ofTwo += vesk::isUtf8(pair);
      for (unsigned c = 0x80; c < 0x100; ++c) ofThree += a >= 0xE0 && vesk::isUtf8(pair + static_cast<char>(c));
    }
  EXPECT_EQ(ofTwo, 0x800u - 0x80u);
  EXPECT_EQ(ofThree, 0x10000u - 0x800u - 0x800u);
}

}  // namespace
