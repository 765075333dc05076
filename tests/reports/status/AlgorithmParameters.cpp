// Algorithm parameters: baseline (feature 0xA2) and noisy-pixel thresholds (feature 0xEC).
#include "tests/Support.h"

namespace {

using namespace test;
using testing::ElementsAre;

struct Subject {
  unsigned id;
  const char *title;
  const char *key;
};
const Subject kSubjects[] = {
    {0xA2, "Vesk Algorithms Baseline:", "BASELINE"},
    {0xEC, "Noisy Pixel Thresholds:", "NOISY_PIXEL_THRESHOLDS"},
};

std::vector<Field> fields(const Subject &subject) {
  std::vector<Field> all;
  addArray<float>(all, 1, 3, subject.key, "% -13.3f ");
  return all;
}

TEST(AlgorithmParameters, AllZero) {
  std::string row;
  for (int i = 0; i < 8; ++i) row += " 0.000        ";
  for (const Subject &subject : kSubjects) {
    for (const bool decimal : {false, true})
      EXPECT_THAT(decodeLines(Report(subject.id, 193), decimal),
                  ElementsAre(subject.title, "", row, row, row, row, row, row, ""));
    const ReportValue value = decodeValue(Report(subject.id, 193));
    EXPECT_THAT(keysOf(value), ElementsAre(subject.key));
    EXPECT_EQ(value.at(subject.key).size(), 48u);
  }
}

TEST(AlgorithmParameters, EveryOffset) {
  for (const Subject &subject : kSubjects)
    for (const bool decimal : {false, true})
      expectEveryOffset(subject.id, 193, fields(subject), decimal, {0x01, 0x3F, 0x7F, 0x80, 0xFF});
}
TEST(AlgorithmParameters, NothingElseIsRead) {
  for (const Subject &subject : kSubjects) expectNothingElseIsRead(subject.id, 193);
}
TEST(AlgorithmParameters, EveryLength) {
  for (const Subject &subject : kSubjects) expectEveryLength(subject.id, 193);
}

TEST(AlgorithmParameters, Examples) {
  for (const Subject &subject : kSubjects) {
    const Report report = Report(subject.id, 193).f32(1, 1.0f).f32(5, -2.5f).f32(189, 1024.0625f);
    EXPECT_EQ(decodeLines(report)[2].substr(0, 28), " 1.000        -2.500        ");
    EXPECT_EQ(decodeLines(report)[7].substr(98), " 1024.062     ");  // a tie, to the even digit
    EXPECT_EQ(decodeValue(report).at(subject.key).at(std::size_t{1}).as<float>(), -2.5f);
  }
}

TEST(AlgorithmParameters, ValuesThatAreNoNumbersPassUnchanged) {
  struct {
    std::uint32_t bits;
    const char *text;
  } const rows[] = {{0x7F800000, " inf          "}, {0xFF800000, "-inf          "}, {0x7FC00001, " nan          "},
                    {0xFFC12345, "-nan          "}, {0x7F800001, " nan          "}, {0x80000000, "-0.000        "},
                    {0x00000001, " 0.000        "}, {0x80000001, "-0.000        "}};
  for (const Subject &subject : kSubjects)
    for (const auto &row : rows) {
      const Report report = Report(subject.id, 193).u32(13, row.bits);
      EXPECT_EQ(decodeLines(report)[2].substr(42, 14), row.text);
      EXPECT_EQ(decodeMap(report).at(std::string(subject.key) + "[3]"), printed("float %08x", row.bits));
    }
}

TEST(AlgorithmParameters, FormsAgree) {
  for (const Subject &subject : kSubjects)
    expectDifferences(
        subject.id, 193, {"three decimals on screen, the whole float as value"},
        [&](const Lines &lines, const std::map<std::string, std::string> &value, std::set<std::string> &seen) {
          for (std::size_t line = 0; line < 6; ++line) {
            const char *at = lines[2 + line].c_str();
            for (std::size_t i = 0; i < 8; ++i) {
              char *end = nullptr;
              const double onScreen = std::strtod(at, &end);
              at = end;
              const std::string kept = value.at(std::string(subject.key) + "[" + std::to_string(8 * line + i) + "]");
              const auto exact =
                  std::bit_cast<float>(static_cast<std::uint32_t>(std::strtoul(digits(kept).c_str(), nullptr, 16)));
              if (leaf(static_cast<float>(onScreen)) == kept) continue;
              seen.insert("three decimals on screen, the whole float as value");
              if (std::isnan(exact))
                ASSERT_TRUE(std::isnan(onScreen));
              else
                ASSERT_LE(std::fabs(onScreen - double{exact}), 0.00050001);
            }
          }
        });
}

}  // namespace
