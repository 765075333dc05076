// The value tree: widths, look-up, order, equality, copies, and one block of memory for nested dictionaries.
#include "values/ReportValue.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <bit>
#include <limits>
#include <sstream>
#include <stdexcept>

namespace {

using testing::ElementsAre;
using testing::ThrowsMessage;
using vesk::Dictionary;
using vesk::EntryAdder;
using vesk::Text;
using vesk::u16;
using vesk::u32;
using vesk::u8;

static_assert(!std::is_copy_constructible_v<ReportValue> && std::is_move_constructible_v<ReportValue>);
static_assert(!std::is_convertible_v<int, ReportValue> && !std::is_constructible_v<ReportValue, const char *>);

template <class T>
ReportValue value(T v) {
  return ReportValue(std::move(v));
}

std::string text(const ReportValue &v) {
  std::ostringstream out;
  out << v;
  return out.str();
}

std::vector<std::string> keys(const Dictionary &d) {
  std::vector<std::string> all;
  for (const auto &[key, entry] : d) all.emplace_back(key.text());
  return all;
}

template <class T>
void expectKeeps(T v) {
  const ReportValue made(v);
  EXPECT_TRUE(made.is<T>());
  EXPECT_EQ(made.as<T>(), v);
  EXPECT_EQ(made.size(), 0u);
  EXPECT_EQ(made.find("x"), nullptr);
  EXPECT_THROW(made.at("x"), std::out_of_range);
  EXPECT_THROW(made.at(std::size_t{0}), std::out_of_range);
  EXPECT_TRUE(made == made.clone());
}

TEST(ReportValue, KeepsWidthAndSignedness) {
  expectKeeps<std::uint8_t>(0xFF);
  expectKeeps<std::uint16_t>(0xFFFF);
  expectKeeps<std::uint32_t>(0xFFFFFFFF);
  expectKeeps<std::uint64_t>(0xFFFFFFFFFFFFFFFF);
  expectKeeps<std::int32_t>(-1);
  expectKeeps<std::int64_t>(std::numeric_limits<std::int64_t>::min());
  expectKeeps<float>(36.5f);
  expectKeeps<double>(1250999.875);
  expectKeeps<bool>(true);
  expectKeeps<Text>(Text(vesk::Key("RX_EN")));
  expectKeeps<Text>(Text(std::string("RX_EN")));
  EXPECT_THROW(value(u8(1)).as<std::uint16_t>(), std::bad_variant_access);
}

TEST(ReportValue, SameNumberOfAnotherTypeIsNotEqual) {
  EXPECT_FALSE(value(u8(1)) == value(u16(1)));
  EXPECT_FALSE(value(u32(1)) == value(vesk::i32(1)));
  EXPECT_FALSE(value(vesk::u64(1)) == value(vesk::i64(1)));
  EXPECT_FALSE(value(1.0f) == value(1.0));
  EXPECT_FALSE(value(u8(1)) == value(true));
  EXPECT_FALSE(value(u8(1)) == value(u8(2)));
  EXPECT_FALSE(value(std::vector<std::uint32_t>{1}) == value(std::vector<std::int32_t>{1}));
}

TEST(ReportValue, FloatsCompareByTheirBits) {
  const float nan = std::numeric_limits<float>::quiet_NaN();
  EXPECT_TRUE(value(nan) == value(nan));
  EXPECT_FALSE(value(nan) == value(-nan));
  EXPECT_FALSE(value(0.0f) == value(-0.0f));
  EXPECT_FALSE(value(0.0) == value(-0.0));
  EXPECT_TRUE(value(std::vector{nan, 1.0f}) == value(std::vector{nan, 1.0f}));
  EXPECT_FALSE(value(std::vector{0.0f}) == value(std::vector{-0.0f}));
  EXPECT_FALSE(value(std::vector{1.0f, 2.0f, 3.0f}) == value(std::vector{1.0f, 2.0f, 4.0f}));
  EXPECT_FALSE(value(std::vector{1.0f}) == value(std::vector{1.0f, 1.0f}));
}

TEST(ReportValue, NanBitsSurviveEveryMove) {
  for (const std::uint32_t bits : {0x7FC00001u, 0x7F800001u, 0xFFA55AA5u, 0x7FFFFFFFu}) {
    Dictionary d(2);
    d.add("F", std::vector<float>{std::bit_cast<float>(bits)});
    d.add("S", std::bit_cast<float>(bits));
    const ReportValue copy = ReportValue(std::move(d)).clone();
    EXPECT_EQ(std::bit_cast<std::uint32_t>(copy.at("F").as<std::vector<float>>()[0]), bits);
    EXPECT_EQ(std::bit_cast<std::uint32_t>(copy.at("S").as<float>()), bits);
  }
}

TEST(ReportValue, ArraysByIndex) {
  const ReportValue words(std::vector<std::uint32_t>{7, 0xFFFFFFFF});
  EXPECT_EQ(words.size(), 2u);
  EXPECT_TRUE(words.at(std::size_t{1}) == value(u32(0xFFFFFFFF)));
  EXPECT_THROW(words.at(std::size_t{2}), std::out_of_range);
  EXPECT_TRUE(value(std::vector<std::int32_t>{-3}).at(std::size_t{0}) == value(vesk::i32(-3)));
  EXPECT_TRUE(value(std::vector<float>{-1.5f}).at(std::size_t{0}) == value(-1.5f));
  EXPECT_EQ(value(std::vector<float>{}).size(), 0u);
  EXPECT_EQ(words.find("x"), nullptr);
}

ReportValue sample() {
  Dictionary d(3);
  d.add("Count", u32(7));
  d.add("Name", Text(std::string("x")));
  d.add("List", std::vector<std::int32_t>{1, -2});
  return ReportValue(std::move(d));
}

TEST(Dictionary, LookUpAndOrder) {
  const ReportValue d = sample();
  EXPECT_EQ(d.size(), 3u);
  EXPECT_THAT(keys(d.as<Dictionary>()), ElementsAre("Count", "Name", "List"));
  EXPECT_EQ(d.at("Count").as<std::uint32_t>(), 7u);
  EXPECT_EQ(d.find("Count"), &d.at("Count"));
  EXPECT_EQ(d.find("count"), nullptr);
  EXPECT_EQ(d.find("Coun"), nullptr);
  EXPECT_EQ(d.find(""), nullptr);
  EXPECT_THROW(d.at("Nobody"), std::out_of_range);
  EXPECT_THROW(d.at(std::size_t{0}), std::out_of_range);
}

TEST(Dictionary, EqualityIgnoresOrder) {
  const auto make = [](bool swapped, std::uint32_t b) {
    Dictionary d(2);
    if (!swapped) d.add("A", u8(1));
    d.add("B", b);
    if (swapped) d.add("A", u8(1));
    return ReportValue(std::move(d));
  };
  EXPECT_TRUE(make(false, 2) == make(true, 2));
  EXPECT_FALSE(make(false, 2) == make(true, 3));
  Dictionary fewer(1), others(2);
  fewer.add("A", u8(1));
  others.add("A", u8(1));
  others.add("C", u32(2));
  EXPECT_FALSE(make(false, 2) == ReportValue(std::move(fewer)));
  EXPECT_FALSE(make(false, 2) == ReportValue(std::move(others)));
  EXPECT_FALSE(make(false, 2) == value(u8(1)));
}

TEST(Dictionary, FullDictionaryRaises) {
  Dictionary none, one(1);
  EXPECT_THROW(none.add("A", u8(1)), std::length_error);
  one.add("A", u8(1));
  EXPECT_THROW(one.add("B", u8(2)), std::length_error);
  EXPECT_THROW(one.addDictionary("C", 1), std::length_error);
  EXPECT_THAT(keys(one), ElementsAre("A"));
}

TEST(Dictionary, WhatIsRaisedSaysWhy) {
  Dictionary none;
  EXPECT_THAT([&] { none.add("A", u8(1)); },
              ThrowsMessage<std::length_error>("vesk::Dictionary: more entries than it was given room for"));
  const ReportValue number = value(u8(1));
  EXPECT_THAT([&] { number.at("Key"); }, ThrowsMessage<std::out_of_range>("ReportValue: no key Key"));
  EXPECT_THAT([&] { number.at(std::size_t{0}); },
              ThrowsMessage<std::out_of_range>("ReportValue: an index into what is no array"));
}

/// A dictionary of three, two of them with room in the outer block, the last one without.
ReportValue nested() {
  Dictionary outer(4, 4);
  outer.add("N", u16(3));
  for (int i = 0; i < 2; ++i) {
    EntryAdder inner = i == 0 ? outer.addDictionary("P", 2) : outer.addDictionary("Q", 2);
    inner.add("A", u32(static_cast<std::uint32_t>(i)));
    inner.add("T", Text(std::string(40, static_cast<char>('a' + i))));
  }
  EntryAdder own = outer.addDictionary("R", 1);
  own.add("A", std::vector<float>{1, 2, 3});
  return ReportValue(std::move(outer));
}

TEST(Dictionary, NestedDictionariesFillTheOuterRoomAndThenTheirOwn) {
  const ReportValue v = nested();
  EXPECT_THAT(keys(v.as<Dictionary>()), ElementsAre("N", "P", "Q", "R"));
  EXPECT_EQ(v.at("P").at("A").as<std::uint32_t>(), 0u);
  EXPECT_EQ(v.at("Q").at("A").as<std::uint32_t>(), 1u);
  EXPECT_EQ(v.at("P").at("T").as<vesk::Text>(), std::string(40, 'a'));
  EXPECT_EQ(v.at("Q").at("T").as<vesk::Text>(), std::string(40, 'b'));
  EXPECT_EQ(v.at("R").at("A").size(), 3u);
}

TEST(Dictionary, NestedEntriesLieBehindTheirDictionarysOwn_AsFarAsThereIsRoom) {
  const auto entriesOf = [](const Dictionary &dictionary, std::string_view key) {
    return dictionary.find(key)->as<Dictionary>().begin();
  };
  Dictionary first(3, 2);
  Dictionary outer(std::move(first));
  outer.addDictionary("P", 2);
  outer.addDictionary("Q", 1);
  EXPECT_EQ(entriesOf(outer, "P"), outer.begin() + 3);
  EXPECT_NE(entriesOf(outer, "Q"), outer.begin() + 3);
  EXPECT_NE(entriesOf(outer, "Q"), outer.begin() + 5);
  Dictionary without(1);
  without.addDictionary("P", 1);
  EXPECT_NE(entriesOf(without, "P"), without.begin() + 1);
  // What was dealt out deals nothing out.
  Dictionary whole(1, 2);
  whole.addDictionary("P", 1).addDictionary("D", 1);
  const auto &nested = whole.find("P")->as<Dictionary>();
  EXPECT_NE(entriesOf(nested, "D"), nested.begin() + 1);
}
TEST(Dictionary, NestedDictionaryIsFullToo) {
  Dictionary outer(2, 4);
  EntryAdder inner = outer.addDictionary("P", 1);
  inner.add("A", u8(1));
  EXPECT_THROW(inner.add("B", u8(2)), std::length_error);
  EntryAdder next = outer.addDictionary("Q", 3);
  next.add("A", u8(2));
  EXPECT_EQ(outer.find("P")->at("A").as<std::uint8_t>(), 1);
}

// A nested dictionary lies in its parent's block, so nobody is handed one that could be moved out of it.
static_assert(!std::is_convertible_v<EntryAdder, Dictionary> && !std::is_constructible_v<Dictionary, EntryAdder>);
static_assert(std::is_nothrow_move_constructible_v<ReportValue> && std::is_nothrow_move_assignable_v<ReportValue>);

TEST(Dictionary, NestedDictionariesMoveWithTheirTree) {
  Dictionary outer(1, 3);
  EntryAdder inner = outer.addDictionary("P", 3);
  inner.add("A", u32(7));
  inner.add("B", Text(std::string(100, 'b')));
  inner.addDictionary("C", 0);
  ReportValue taken(u8(0));
  taken = ReportValue(std::move(outer));
  EXPECT_EQ(outer.size(), 0u);
  EXPECT_THROW(outer.add("A", u8(1)), std::length_error);
  EXPECT_THROW(outer.addDictionary("A", 1), std::length_error);
  EXPECT_THAT(keys(taken.at("P").as<Dictionary>()), ElementsAre("A", "B", "C"));
  EXPECT_EQ(taken.at("P").at("A").as<std::uint32_t>(), 7u);
  EXPECT_EQ(taken.at("P").at("B").as<vesk::Text>(), std::string(100, 'b'));
  EXPECT_EQ(taken.at("P").at("C").size(), 0u);
}

TEST(Dictionary, MovesOfTheWholeTree) {
  ReportValue a = nested();
  ReportValue b(std::move(a));
  EXPECT_TRUE(b == nested());
  ReportValue c(u8(0));
  c = std::move(b);
  EXPECT_TRUE(c == nested());
  Dictionary d(1), e(1);
  d.add("A", u8(1));
  e.add("B", Text(std::string(50, 'x')));
  e = std::move(d);
  EXPECT_THAT(keys(e), ElementsAre("A"));
  EXPECT_EQ(d.size(), 0u);  // NOLINT: what is left can still be asked
}

TEST(Dictionary, CloneIsDeep) {
  ReportValue copy(u8(0));
  {
    const ReportValue original = nested();
    copy = original.clone();
    EXPECT_TRUE(copy == original);
    EXPECT_NE(copy.find("P"), original.find("P"));
  }
  EXPECT_TRUE(copy == nested());
  EXPECT_THAT(keys(copy.as<Dictionary>()), ElementsAre("N", "P", "Q", "R"));
}

TEST(Dictionary, DebugPrint) {
  EXPECT_EQ(text(sample()), R"({"Count": u32 7, "Name": "x", "List": i32[1, -2]})");
  EXPECT_EQ(text(value(u8(65))), "u8 65");  // a number, not the letter A
  EXPECT_EQ(text(value(u16(65535))), "u16 65535");
  EXPECT_EQ(text(value(vesk::u64(18446744073709551615u))), "u64 18446744073709551615");
  EXPECT_EQ(text(value(vesk::i32(-1))), "i32 -1");
  EXPECT_EQ(text(value(vesk::i64(-1))), "i64 -1");
  EXPECT_EQ(text(value(1.5f)), "float 1.5");
  EXPECT_EQ(text(value(2.5)), "double 2.5");
  EXPECT_EQ(text(value(true)), "true");
  EXPECT_EQ(text(value(false)), "false");
  EXPECT_EQ(text(value(std::vector<float>{})), "float[]");
  EXPECT_EQ(text(value(std::vector<std::uint32_t>{5})), "u32[5]");
  EXPECT_EQ(text(ReportValue(Dictionary())), "{}");
  EXPECT_EQ(text(nested()).find(R"({"N": u16 3, "P": {"A": u32 0, "T": "aaaa)"), 0u);
}

}  // namespace
