// Value trees as JSON, and the numbers that are told once more.
#include "host/output/JsonValue.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

using namespace vesk::host;
using vesk::Dictionary;
using vesk::Text;

struct Written {
  std::string value;
  std::string exact;  // empty where there is nothing to tell
  friend bool operator==(const Written &, const Written &) = default;
  friend std::ostream &operator<<(std::ostream &out, const Written &w) { return out << w.value << " " << w.exact; }
};

Written written(const ReportValue &value) {
  OutputBuffer out, exact;
  if (appendJsonValue(out, value)) appendExact(exact, value);
  return {std::string(out.text()), std::string(exact.text())};
}

template <class T>
Written written(T value) {
  return written(ReportValue(std::move(value)));
}

TEST(JsonValue, bareValuesStandBare) {
  EXPECT_EQ(written(Text(vesk::Key("SINGLE"))), (Written{R"("SINGLE")", ""}));
  EXPECT_EQ(written(Text(std::string_view("SIN\"GLE"))), (Written{R"("SIN\"GLE")", ""}));
  EXPECT_EQ(written(std::uint8_t{7}), (Written{"7", ""}));
  EXPECT_EQ(written(true), (Written{"true", ""}));
  EXPECT_EQ(written(false), (Written{"false", ""}));
}

TEST(JsonValue, dictionariesKeepTheirOrderAndNesting) {
  Dictionary tree(3, 2);
  tree.add("Z", std::uint16_t{5});
  auto &&inner = tree.addDictionary("INNER", 2);
  inner.add("INIT time ms", std::uint32_t{1});
  inner.add("b", Text(std::string_view("x\ny")));
  tree.add("A", std::vector<std::int32_t>{-1, 0, 1});
  EXPECT_EQ(written(ReportValue(std::move(tree))),
            (Written{R"({"Z":5,"INNER":{"INIT time ms":1,"b":"x\ny"},"A":[-1,0,1]})", ""}));
}

TEST(JsonValue, emptyOnesAreEmpty) {
  EXPECT_EQ(written(Dictionary(0)), (Written{"{}", ""}));
  EXPECT_EQ(written(std::vector<std::uint32_t>{}), (Written{"[]", ""}));
  EXPECT_EQ(written(Text(std::string_view())), (Written{R"("")", ""}));
}

TEST(JsonValue, integersBeyondADoubleAreToldExactly) {
  constexpr std::uint64_t kBorder = 9007199254740992;
  EXPECT_EQ(written(kBorder), (Written{"9007199254740992", ""}));
  EXPECT_EQ(written(kBorder + 1), (Written{"9007199254740993", R"({"":"9007199254740993"})"}));
  EXPECT_EQ(written(-std::int64_t{kBorder}), (Written{"-9007199254740992", ""}));
  EXPECT_EQ(written(-std::int64_t{kBorder} - 1), (Written{"-9007199254740993", R"({"":"-9007199254740993"})"}));
  EXPECT_EQ(written(std::int64_t{kBorder} + 1), (Written{"9007199254740993", R"({"":"9007199254740993"})"}));

  Dictionary masks(3);
  masks.add("SHORT_TX_POS", std::uint64_t{18446744073709551615u});
  masks.add("SHORT_TX_NEG", std::uint64_t{1});
  masks.add("SHORT_BOTH", std::uint64_t{9223372036854775808u});
  EXPECT_EQ(written(ReportValue(std::move(masks))),
            (Written{R"({"SHORT_TX_POS":18446744073709551615,"SHORT_TX_NEG":1,"SHORT_BOTH":9223372036854775808})",
                     R"({"/SHORT_TX_POS":"18446744073709551615","/SHORT_BOTH":"9223372036854775808"})"}));
}

TEST(JsonValue, floatsThatAreNoNumbersAreNamed) {
  constexpr float kNan = std::numeric_limits<float>::quiet_NaN(), kInf = std::numeric_limits<float>::infinity();
  EXPECT_EQ(written(-kNan), (Written{"null", R"({"":"nan"})"}));
  Dictionary tree(2);
  tree.add("T", kNan);
  tree.add("V", std::vector<float>{0.5f, kInf, -kInf});
  EXPECT_EQ(written(ReportValue(std::move(tree))),
            (Written{R"({"T":null,"V":[0.5,null,null]})", R"({"/T":"nan","/V/1":"inf","/V/2":"-inf"})"}));
}

TEST(JsonValue, pointersEscapeTheirOwnSigns) {
  Dictionary tree(1, 1);
  tree.addDictionary("a/b", 1).add("c~d e", std::uint64_t{1} << 60);
  EXPECT_EQ(written(ReportValue(std::move(tree))).exact, R"({"/a~1b/c~0d e":"1152921504606846976"})");
}

}  // namespace
