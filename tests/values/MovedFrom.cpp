// What was moved from is empty and can be filled again.
#include <gtest/gtest.h>

#include "values/DisplayLines.h"

namespace {

TEST(MovedFrom, LinesCanBeAddedToOnesThatWereMovedFrom) {
  DisplayLines lines(2, 64);
  lines.add("one");
  DisplayLines taken(std::move(lines));
  EXPECT_TRUE(lines.empty());
  lines.add("");  // one byte, for the line end
  EXPECT_EQ(lines.text(), "\n");
  EXPECT_EQ(taken.text(), "one\n");

  DisplayLines other;
  other = std::move(lines);
  EXPECT_EQ(lines.text(), "");
  lines.add("");
  lines.add("two");
  EXPECT_EQ(lines.text(), "\ntwo\n");
  EXPECT_EQ(other.text(), "\n");
}

}  // namespace
