// Iterators over lines are equal at the same line of the same list, and nowhere else.
#include <gtest/gtest.h>

#include "values/DisplayLines.h"

namespace {

TEST(LineIterators, EqualOnlyWithinOneList) {
  DisplayLines a, b;
  a.add("one");
  b.add("one");
  EXPECT_EQ(a.begin(), a.begin());
  EXPECT_NE(a.begin(), a.end());
  EXPECT_NE(a.begin(), b.begin());
  EXPECT_EQ(a.begin()++, a.begin());
  EXPECT_EQ(++a.begin(), a.end());
}

}  // namespace
