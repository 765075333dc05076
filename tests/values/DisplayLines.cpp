// The text arena: borders, growth, moves.
#include "values/DisplayLines.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <string>
#include <type_traits>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::vector<std::string> all(const DisplayLines &lines) {
  return {lines.begin(), lines.end()};
}

static_assert(!std::is_copy_constructible_v<DisplayLines> && std::is_nothrow_move_constructible_v<DisplayLines>);
static_assert(std::forward_iterator<DisplayLines::Iterator>);

TEST(DisplayLines, EmptyListHasNoText) {
  const DisplayLines lines;
  EXPECT_TRUE(lines.empty());
  EXPECT_EQ(lines.size(), 0u);
  EXPECT_EQ(lines.text(), "");
  EXPECT_THAT(all(lines), IsEmpty());
}

TEST(DisplayLines, EmptyLinesAreLines) {
  DisplayLines lines;
  lines.add("");
  lines.add("a");
  lines.add("");
  EXPECT_FALSE(lines.empty());
  EXPECT_THAT(all(lines), ElementsAre("", "a", ""));
  EXPECT_EQ(lines.text(), "\na\n\n");
}

TEST(DisplayLines, LineFeedsAndZerosInsideALineAreText) {
  DisplayLines lines;
  lines.add("one\ntwo\n");
  lines.add(std::string_view("a\0b", 3));
  lines.add("\n");
  EXPECT_EQ(lines.size(), 3u);
  EXPECT_EQ(lines[0], "one\ntwo\n");
  EXPECT_EQ(lines[1], std::string_view("a\0b", 3));
  EXPECT_EQ(lines[2], "\n");
  EXPECT_EQ(lines.text(), std::string_view("one\ntwo\n\na\0b\n\n\n", 15));
}

TEST(DisplayLines, GrowsFromAnyRoom) {
  for (std::size_t room : {0u, 1u, 2u, 7u, 100u, 100000u}) {
    DisplayLines lines(room, room);
    std::vector<std::string> wanted;
    for (std::size_t i = 0; i < 300; ++i) {
      wanted.emplace_back(i * 7 % 83, static_cast<char>('a' + i % 26));
      lines.add(wanted.back());
    }
    EXPECT_EQ(all(lines), wanted) << room;
  }
}

TEST(DisplayLines, RoomIsUsedToItsLastByteAndLine) {
  // Memory that is let go while the new one is filled never has its address, so the address tells whether it grew.
  const auto moves = [](std::size_t lineRoom, std::size_t bytes, auto append) {
    DisplayLines lines(lineRoom, bytes);
    const char *const before = lines.text().data();
    append(lines);
    EXPECT_EQ(lines.text(), "hello\n");
    return lines.text().data() != before;
  };
  const auto check = [&](std::size_t bytes, auto append) {
    EXPECT_FALSE(moves(1, bytes + 1, append));
    EXPECT_TRUE(moves(1, bytes, append));
    EXPECT_TRUE(moves(0, bytes + 1, append));
  };
  check(5, [](DisplayLines &lines) { lines.add("hello"); });
  check(vesk::Format<"%s">::room("hello"), [](DisplayLines &lines) { lines.line<"%s">("hello"); });
  check(5, [](DisplayLines &lines) {
    lines.rows(1, 5, [](char *out, std::size_t) { return std::copy_n("hello", 5, out); });
  });
}

TEST(DisplayLines, FormatsAndPlainTextInTurn) {
  DisplayLines lines(1, 1);
  for (unsigned i = 0; i < 100; ++i) {
    lines.line<"%20s: %i">("PSE", i);
    lines.add("-");
  }
  ASSERT_EQ(lines.size(), 200u);
  EXPECT_EQ(lines[198], "                 PSE: 99");
  EXPECT_EQ(lines[199], "-");
}

TEST(DisplayLines, RowsMadeInTheirRoom) {
  DisplayLines lines;
  lines.add("first");
  lines.rows(3, 1000, [](char *out, std::size_t i) { return std::fill_n(out, i * 500, static_cast<char>('x' + i)); });
  lines.rows(0, 1000, [](char *out, std::size_t) { return out + 1; });
  lines.add("last");
  EXPECT_THAT(all(lines), ElementsAre("first", "", std::string(500, 'y'), std::string(1000, 'z'), "last"));
  EXPECT_EQ(lines.text().substr(0, 9), "first\n\nyy");
}

TEST(DisplayLines, RowsGrowWhatOtherRowsHaveFilled) {
  DisplayLines lines(2, 10);
  for (unsigned round = 0; round < 5; ++round)
    lines.rows(100, 4, [&](char *out, std::size_t i) { return vesk::Format<"%x">::write(out, std::uint32_t(i)); });
  ASSERT_EQ(lines.size(), 500u);
  EXPECT_EQ(lines[99], "63");
  EXPECT_EQ(lines[100], "0");
  EXPECT_EQ(lines[499], "63");
}

TEST(DisplayLines, MoveLeavesAnEmptyListThatCanBeUsed) {
  DisplayLines first;
  first.add("a");
  DisplayLines second(std::move(first));
  EXPECT_THAT(all(second), ElementsAre("a"));
  EXPECT_TRUE(first.empty());  // NOLINT: the promise under test
  EXPECT_EQ(first.text(), "");
  first.add("b");
  first.add("c");
  second = std::move(first);
  EXPECT_THAT(all(second), ElementsAre("b", "c"));
  EXPECT_TRUE(first.empty());  // NOLINT
}

TEST(DisplayLines, EqualityCountsBordersToo) {
  const auto make = [](std::initializer_list<const char *> texts) {
    DisplayLines lines;
    for (const char *text : texts) lines.add(text);
    return lines;
  };
  EXPECT_TRUE(make({"a", "b"}) == make({"a", "b"}));
  EXPECT_FALSE(make({"a", "b"}) == make({"a", "c"}));
  EXPECT_FALSE(make({"a\nb"}) == make({"a", "b"}));  // the same text, other lines
  EXPECT_FALSE(make({}) == make({""}));
}

TEST(DisplayLines, IteratorSteps) {
  DisplayLines lines;
  lines.add("a");
  lines.add("b");
  auto line = lines.begin();
  EXPECT_EQ(*line++, "a");
  EXPECT_EQ(*line, "b");
  EXPECT_EQ(++line, lines.end());
}

}  // namespace
