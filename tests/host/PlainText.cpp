// What all readers of text ask: is it text, what do its numbers and bytes say.
#include "host/input/PlainText.h"

#include <gtest/gtest.h>

namespace vesk::host {
namespace {

TEST(PlainText, HasNoControlCharactersButThoseOfTexts) {
  EXPECT_TRUE(isText("one\ttwo\r\nthree\f\v"));
  EXPECT_TRUE(isText("\x1b[1mbold\x1b[0m"));
  for (const char *bytes : {"a\x01", "a\x08", "a\x0e", "a\x1a", "a\x1c", "a\x7f"}) EXPECT_FALSE(isText(bytes)) << bytes;
  EXPECT_FALSE(isText(std::string_view("a\0", 2)));
  EXPECT_FALSE(isText(""));
}

TEST(PlainText, BeginsBeyondAsciiOnlyWhereItIsUtf8) {
  EXPECT_TRUE(isText("\xc3\xbc"));
  EXPECT_TRUE(isText("\xc3\xbc and \xe2\x82"));  // the head ends within a character
  for (const char *bytes : {"\xff", "\xe0\x0d", "\x80", "\xf0\x9f\x98", "\x80\x80\x80\x80\x80"})
    EXPECT_FALSE(isText(bytes)) << bytes;
  EXPECT_TRUE(isText("later \xff"));  // in whatever encoding
}

TEST(PlainText, SecondsHaveUpToNineDecimals) {
  EXPECT_EQ(parseSeconds("2"), 2'000'000'000);
  EXPECT_EQ(parseSeconds("000002.500135"), 2'500'135'000);
  EXPECT_EQ(parseSeconds("0.123456789"), 123'456'789);
  EXPECT_EQ(parseSeconds("9000000000"), 9'000'000'000'000'000'000);
  for (const char *text : {"", ".", "1.", ".5", "-1.0", "1.x", "0.1234567890", "9000000001", "99999999999999999999"})
    EXPECT_EQ(parseSeconds(text), std::nullopt) << text;
}

TEST(PlainText, BytesHaveTwoDigits) {
  std::string bytes;
  EXPECT_EQ(takeBytes(" e0 0D\t05 ", bytes), "");
  EXPECT_EQ(bytes, "\xe0\r\x05");
  for (const char *word : {"e", "e00", "g0", "0g", "+1"})
    EXPECT_EQ(takeBytes(std::string("00 ") + word + " 01", bytes), word);
}

}  // namespace
}  // namespace vesk::host
