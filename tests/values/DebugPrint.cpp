// The one-line print of a value shows every text on that line.
#include <gtest/gtest.h>

#include <sstream>

#include "values/ReportValue.h"

namespace {

std::string printed(const ReportValue &value) {
  std::ostringstream out;
  out << value;
  return out.str();
}

TEST(DebugPrint, TextsAreEscaped) {
  EXPECT_EQ(printed(ReportValue(vesk::Text(std::string_view("a\"b\\c")))), R"("a\"b\\c")");
  EXPECT_EQ(printed(ReportValue(vesk::Text(std::string_view("\n\x1f\x7f ~")))), R"("\x0a\x1f\x7f ~")");
  EXPECT_EQ(printed(ReportValue(vesk::Text(std::string_view("\xC3\xA4")))), "\"\xC3\xA4\"");
}

}  // namespace
