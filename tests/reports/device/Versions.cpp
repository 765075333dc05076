// Versions, features 0xD0 and 0xD2.
#include "tests/Support.h"

namespace {

using namespace test;
using testing::ElementsAre;
using testing::ThrowsMessage;

Report version(unsigned id, std::string_view text) {
  return Report(id, text.size() + 2).text(1, text);
}
std::string decoded(unsigned id, bool strings, std::string_view text) {
  Decoder decode(strings);
  return outcome(decode, id, version(id, text).bytes());
}

TEST(Version, TextAsItStands) {
  EXPECT_THAT(decodeLines(version(0xD0, "1.2.3")), ElementsAre("1.2.3"));
  EXPECT_EQ(decodeValue(version(0xD0, "1.2.3")).as<vesk::Text>(), "1.2.3");  // a bare string, no dictionary
}

TEST(Version, EmptyText) {
  EXPECT_THAT(decodeLines(version(0xD0, "")), ElementsAre(""));
  EXPECT_EQ(decodeValue(version(0xD0, "")).as<vesk::Text>(), "");
  EXPECT_THAT(decodeLines(version(0xD2, "")), ElementsAre(""));
  EXPECT_EQ(decoded(0xD2, false, ""), "raises out_of_range");
}

TEST(Version, LineFeedsStayInsideTheOneLine) {
  EXPECT_THAT(decodeLines(version(0xD0, "a\nb\n")), ElementsAre("a\nb\n"));
  EXPECT_EQ(decodeValue(version(0xD0, "a\nb\n")).as<vesk::Text>(), "a\nb\n");
}

TEST(Version, TextEndsAtTheFirstZero) {
  const Report report = Report(0xD0, 40).text(1, "one").text(6, "two");
  EXPECT_THAT(decodeLines(report), ElementsAre("one"));
  EXPECT_EQ(decodeValue(report).as<vesk::Text>(), "one");
}

TEST(Version, LengthIsNotConsulted) {
  for (const bool strings : {true, false}) {
    Decoder decode(strings);
    PaddedReport padded(version(0xD0, "1.2.3").bytes());
    for (const std::int64_t length : {std::int64_t{-1}, std::int64_t{0}, std::int64_t{2}, std::int64_t{1} << 40}) {
      const ReportResult result = decode.plugin().reportToObject(padded.data(), 0xD0, 2, length);
      if (strings)
        EXPECT_THAT(linesOf(result), ElementsAre("1.2.3"));
      else
        EXPECT_EQ(std::get<ReportValue>(result).as<vesk::Text>(), "1.2.3");
    }
  }
}

TEST(Version, TextUpToTheEndOfWhatIsReadable) {
  for (const std::size_t size : {1021u, 1022u, 1023u, 5000u}) {
    const std::string text(size, 'v');
    Decoder lines(true), value(false);  // no zero in the report itself: the padding ends the text
    EXPECT_THAT(linesOf(lines(0xD0, "\xD0" + text)), ElementsAre(text));
    EXPECT_EQ(std::get<ReportValue>(value(0xD0, "\xD0" + text)).as<vesk::Text>(), text);
  }
}

/// A letter at every single offset ends up at its place in the text.
TEST(Version, EveryOffset) {
  for (const unsigned id : {0xD0u, 0xD2u})
    for (std::size_t at = 1; at < 300; ++at) {
      const std::string text = std::string(299, '.').replace(at - 1, 1, "X");
      ASSERT_THAT(decodeLines(version(id, text)), ElementsAre(text)) << at;
      if (id == 0xD0) {
        ASSERT_EQ(decodeValue(version(id, text)).as<vesk::Text>(), text) << at;
      }
      ASSERT_THAT(decodeLines(Report(id, 301).text(1, std::string(at - 1, '.')).text(at + 1, "X")),
                  ElementsAre(std::string(at - 1, '.')));
    }
}

TEST(ExtendedVersion, SixComponents) {
  const Report report = version(0xD2, "fw 7\nsdk 1\ngcc\nrtos 3\nvendor\nalgs 2");
  EXPECT_THAT(decodeLines(report), ElementsAre("fw 7", "sdk 1", "gcc", "rtos 3", "vendor", "algs 2"));
  EXPECT_EQ(decodeLeaves(report), (Leaves{{"PROJECT", "string fw 7"},
                                          {"SDK", "string sdk 1"},
                                          {"TOOLCHAIN", "string gcc"},
                                          {"KORVO", "string rtos 3"},
                                          {"VENDOR", "string vendor"},
                                          {"ALGS", "string algs 2"}}));
}

TEST(ExtendedVersion, SevenLines) {
  const Report report = version(0xD2, "1\n2\n3\n4\n5\n6\n7");
  EXPECT_THAT(decodeLines(report), ElementsAre("1", "2", "3", "4", "5", "6", "7"));
  EXPECT_EQ(decodeValue(report).size(), 6u);
  EXPECT_EQ(decodeValue(report).at("ALGS").as<vesk::Text>(), "6");
}

TEST(ExtendedVersion, SplittingKeepsEmptyPieces) {
  EXPECT_THAT(decodeLines(version(0xD2, "one")), ElementsAre("one"));
  EXPECT_THAT(decodeLines(version(0xD2, "one\n")), ElementsAre("one", ""));
  EXPECT_THAT(decodeLines(version(0xD2, "\n")), ElementsAre("", ""));
  EXPECT_THAT(decodeLines(version(0xD2, "\n\na\n\n")), ElementsAre("", "", "a", "", ""));
  EXPECT_THAT(decodeLines(version(0xD2, "a\r\nb\r")), ElementsAre("a\r", "b\r"));
  EXPECT_EQ(decoded(0xD2, false, "\n\n\n\n\n"),
            "PROJECT = string \nSDK = string \nTOOLCHAIN = string \n"
            "KORVO = string \nVENDOR = string \nALGS = string \n");
}

TEST(ExtendedVersion, FewerThanSixLinesRaiseInObjectMode) {
  EXPECT_EQ(decoded(0xD2, false, "1\n2\n3\n4\n5"), "raises out_of_range");
  EXPECT_THAT(decodeLines(version(0xD2, "1\n2\n3\n4\n5")), ElementsAre("1", "2", "3", "4", "5"));
  EXPECT_THAT(decodeLines(version(0xD2, "1\n2\n3\n4\n5\n")), ElementsAre("1", "2", "3", "4", "5", ""));
  EXPECT_NE(decoded(0xD2, false, "1\n2\n3\n4\n5\n"), "raises out_of_range");  // an empty sixth line is a line
}

TEST(Versions, TextThatIsNotUtf8) {
  for (const char *bad :
       {"1\xFF", "\x80", "1\n2\n3\n4\n5\n6\n\xC0\x80", "\xED\xA0\x80\n2\n3\n4\n5\n6", "cut \xE2\x82"}) {
    EXPECT_EQ(decoded(0xD0, true, bad), "raises invalid_argument");
    EXPECT_EQ(decoded(0xD0, false, bad), "nothing");
    EXPECT_EQ(decoded(0xD2, true, bad), "nothing");
    EXPECT_EQ(decoded(0xD2, false, bad), "raises invalid_argument");  // whatever the number of lines
  }
  EXPECT_THAT(decodeLines(version(0xD0, "\xC3\xA4 \xF0\x9F\x98\x80")), ElementsAre("\xC3\xA4 \xF0\x9F\x98\x80"));
  EXPECT_EQ(decoded(0xD0, false, std::string_view("ok\0\xFF", 4)), " = string ok\n");  // behind the end of the text
}

TEST(Versions, WhatIsRaisedSaysWhy) {
  const std::string text = "HIDReportVeskPlugin: the version text is not UTF-8";
  EXPECT_THAT([] { decodeLines(version(0xD0, "\xFF")); }, ThrowsMessage<std::invalid_argument>(text));
  EXPECT_THAT([] { decodeValue(version(0xD2, "\xFF")); }, ThrowsMessage<std::invalid_argument>(text));
  EXPECT_THAT([] { decodeValue(version(0xD2, "1\n2")); },
              ThrowsMessage<std::out_of_range>("HIDReportVeskPlugin: the extended version has fewer than six lines"));
}

TEST(Versions, EveryLength) {
  for (const unsigned id : {0xD0u, 0xD2u}) {
    const std::string full = version(id, "fw 7\nsdk\n\xC3\xA4\nrtos\nvendor\nalgs").bytes();
    for (const bool strings : {true, false}) {
      Decoder decode(strings);
      for (std::size_t length = 0; length <= full.size(); ++length)
        ASSERT_EQ(outcome(decode, id, full.substr(0, length)),
                  outcome(decode, id, full.substr(0, length) + std::string(1000, '\0')));
    }
  }
}

/// Random texts: every way in which the two forms of one text differ, each of them required.
TEST(Versions, FormsAgree) {
  std::mt19937 random(1);
  std::set<std::string> seen;
  for (int i = 0; i < 5000; ++i) {
    std::string text;
    for (auto size = random() % 30; size-- > 0;) text += "ab\n\n\r.\xC3\xA4"[random() % (i % 4 == 0 ? 8 : 6)];
    for (const unsigned id : {0xD0u, 0xD2u}) {
      const std::string lines = decoded(id, true, text), value = decoded(id, false, text);
      const std::string name = id == 0xD0 ? "0xD0: " : "0xD2: ";
      if (lines == "raises invalid_argument" || lines == "nothing") {
        seen.insert(name + "not UTF-8: on screen " + lines + ", as value " + value);
      } else if (id == 0xD0) {
        ASSERT_EQ(value, " = string " + text + "\n");
        ASSERT_EQ(lines, "line " + text + "\n");
      } else {
        const Lines pieces = decodeLines(version(id, text));
        if (value == "raises out_of_range") {
          ASSERT_LT(pieces.size(), 6u);
          seen.insert("0xD2: fewer than six lines raise as value");
          continue;
        }
        if (pieces.size() > 6) seen.insert("0xD2: lines behind the sixth on screen only");
        const Leaves leaves = decodeLeaves(version(id, text));
        ASSERT_EQ(leaves.size(), 6u);
        for (std::size_t k = 0; k < 6; ++k) ASSERT_EQ(leaves[k].second, "string " + pieces.at(k));
      }
    }
  }
  EXPECT_THAT(seen, testing::UnorderedElementsAre(
                        "0xD0: not UTF-8: on screen raises invalid_argument, as value nothing",
                        "0xD2: not UTF-8: on screen nothing, as value raises invalid_argument",
                        "0xD2: fewer than six lines raise as value", "0xD2: lines behind the sixth on screen only"));
}

}  // namespace
