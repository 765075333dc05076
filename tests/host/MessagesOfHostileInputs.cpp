// Messages quote inputs, and an input may hold what a terminal would obey.
#include <gtest/gtest.h>

#include <cstdlib>

#include "host/diagnostics/Messages.h"

namespace {

using namespace vesk::host;

std::string printed(const std::string &file, const std::string &text) {
  char *memory = nullptr;
  std::size_t size = 0;
  std::FILE *stream = open_memstream(&memory, &size);
  Messages messages({}, stream);
  messages.add({&kBadInput, file, Place::line(3), {}, text});
  std::fclose(stream);
  std::string line(memory, size);
  std::free(memory);
  return line;
}

TEST(MessagesOfHostileInputs, EscapeSequencesAreShownAndNotSent) {
  EXPECT_EQ(printed("f", "\x1b]0;title\x07 \x7f"), "f:3: error: \\x1B]0;title\\x07 \\x7F\n");
  EXPECT_EQ(printed("a\x1b[2Jb", "text"), "a\\x1B[2Jb:3: error: text\n");
}

TEST(MessagesOfHostileInputs, ControlsOfTwoBytesToo) {
  EXPECT_EQ(printed("f",
                    "\xC2\x9B"
                    "31m"),
            "f:3: error: \\x9B31m\n");
  EXPECT_EQ(printed("f", "\xC2\xA0"), "f:3: error: \xC2\xA0\n");
  EXPECT_EQ(printed("f", "cut \xC2"), "f:3: error: cut \\xC2\n");
}

TEST(MessagesOfHostileInputs, TextStaysTextAndBytesBecomeDigits) {
  EXPECT_EQ(printed("f", "gr\xC3\xBC\xC3\x9F"), "f:3: error: gr\xC3\xBC\xC3\x9F\n");
  EXPECT_EQ(printed("f", "v\xFF\x9B"), "f:3: error: v\\xFF\\x9B\n");
}

TEST(MessagesOfHostileInputs, OurOwnLinesStayLines) {
  EXPECT_EQ(printed("f", "one\ntwo"), "f:3: error: one\ntwo\n");
}

}  // namespace
