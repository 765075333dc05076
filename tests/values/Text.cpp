// Texts as values: constants, which are not copied, and texts with memory of their own.
#include "values/Text.h"

#include <gtest/gtest.h>

#include <string>
#include <type_traits>
#include <utility>

#include "values/PrintfFormat.h"

namespace vesk {
namespace {

template <FormatText F>
concept IsKey = requires {
  typename std::bool_constant<(Key(F.text), true)>;
};
static_assert(IsKey<" AZ~!#[]"> && IsKey<"}">);
static_assert(!IsKey<"\x1F"> && !IsKey<"\x7F"> && !IsKey<"\""> && !IsKey<"\\"> && !IsKey<"a\n">);

constexpr Key kWord = "WARNING";

TEST(Text, ConstantIsNotCopied) {
  const Text text(kWord);
  EXPECT_EQ(text.view(), "WARNING");
  EXPECT_EQ(text.view().data(), kWord.text().data());
  EXPECT_TRUE(text.isConstant());
  const Text copy(text);
  EXPECT_EQ(copy.view().data(), kWord.text().data());
  EXPECT_TRUE(copy.isConstant());
}

TEST(Text, OtherTextsHaveMemoryOfTheirOwn) {
  std::string bytes("2.14\n\0x", 7);
  const Text text{std::string_view(bytes)};
  const Text copy(text);
  bytes.assign(7, '!');
  EXPECT_EQ(text.view(), std::string_view("2.14\n\0x", 7));
  EXPECT_EQ(copy.view(), text.view());
  EXPECT_NE(copy.view().data(), text.view().data());
  EXPECT_FALSE(text.isConstant());
  EXPECT_FALSE(copy.isConstant());
}

TEST(Text, EmptyTexts) {
  const Text own{std::string_view()};
  EXPECT_EQ(own.view(), "");
  EXPECT_FALSE(own.isConstant());
  EXPECT_TRUE(Text(Key("")) == own);
}

TEST(Text, MovesLeaveAnEmptyConstant) {
  Text first{std::string_view("moved")};
  Text second(std::move(first));
  EXPECT_EQ(second.view(), "moved");
  EXPECT_EQ(first.view(), "");      // NOLINT: the promise under test
  EXPECT_TRUE(first.isConstant());  // NOLINT
  first = std::move(second);
  EXPECT_EQ(first.view(), "moved");
  EXPECT_FALSE(first.isConstant());
  second = Text(kWord);
  EXPECT_TRUE(second.isConstant());
  first = second;
  EXPECT_EQ(first.view(), "WARNING");
  EXPECT_TRUE(first.isConstant());
  static_assert(std::is_nothrow_move_constructible_v<Text>);
}

TEST(Text, EqualityIsThatOfTheBytes) {
  EXPECT_TRUE(Text(kWord) == Text(std::string_view("WARNING")));
  EXPECT_FALSE(Text(kWord) == Text(std::string_view("WARNINGS")));
  EXPECT_TRUE(Text(kWord) == "WARNING");
  EXPECT_FALSE(Text(kWord) == "warning");
}

}  // namespace
}  // namespace vesk
