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
  EXPECT_EQ(printed(ReportValue(std::string("a\"b\\c"))), R"("a\"b\\c")");
  EXPECT_EQ(printed(ReportValue(std::string("\n\x1f\x7f ~"))), R"("\x0a\x1f\x7f ~")");
  EXPECT_EQ(printed(ReportValue(std::string("\xC3\xA4"))), "\"\xC3\xA4\"");
}

}  // namespace
