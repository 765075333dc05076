// Where reports end whose bytes are all that is known of them.
#include "host/input/ReportBorders.h"

#include <gtest/gtest.h>

#include <string>

namespace vesk::host {
namespace {

using namespace std::string_literals;

TEST(ReportBorders, AReportIsWholeAtItsLength) {
  const std::string summary = "\xE0\x0D\x05\x00\x21\x40\x24"s, image = "\x76" + std::string(791, '\1');
  EXPECT_TRUE(isWholeReport(summary));
  EXPECT_FALSE(isWholeReport(summary.substr(0, 6)));
  EXPECT_TRUE(isWholeReport(summary + std::string(57, '\0')));  // padded
  EXPECT_FALSE(isWholeReport(summary + "\0\1"s));
  EXPECT_TRUE(isWholeReport(image));
  EXPECT_FALSE(isWholeReport(image + "\0"s)) << "has one length";
  EXPECT_TRUE(isWholeReport("\xD0v1\0"s));
  EXPECT_FALSE(isWholeReport("\xD0v1"));
  EXPECT_FALSE(isWholeReport("\x55\x01"));
  EXPECT_FALSE(isWholeReport(""));
}

TEST(ReportBorders, TextsAreKnownByTheirId) {
  EXPECT_TRUE(isTextReport("\xD0"));
  EXPECT_TRUE(isTextReport("\xD2v"));
  EXPECT_FALSE(isTextReport("\xE0"));
  EXPECT_FALSE(isTextReport("\x55"));
  EXPECT_FALSE(isTextReport(""));
}

TEST(ReportBorders, CountsWholeReportsAlone) {
  EXPECT_EQ(countReports("\xDE\x01\xD0v1\0\0\xDE\x02"s), 3u);
  EXPECT_EQ(countReports("\xDE\x01\xE0\x0D"s), 0u);
  EXPECT_EQ(countReports("\xDE\x01\x55"s), 0u);
  EXPECT_EQ(countReports(""), 0u);
  EXPECT_EQ(reportLength("\xE0\x0D"), 2u);
  EXPECT_EQ(reportLength("\x55"), 0u);
}

}  // namespace
}  // namespace vesk::host
