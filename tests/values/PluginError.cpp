// The error value's words.
#include "values/PluginError.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

using testing::HasSubstr;

TEST(PluginError, DescriptionHoldsDomainCodeAndMessageOnOneLine) {
  const PluginError error{"Domain", -536870206, {{PluginError::kLocalizedDescription, "Invalid option: -x"}}};
  EXPECT_EQ(error.localizedDescription(), "Invalid option: -x");
  EXPECT_EQ(error.description(), "Domain error -536870206: Invalid option: -x");
}

TEST(PluginError, KeyThatOtherProgramsLookUp) {
  EXPECT_STREQ(PluginError::kLocalizedDescription, "LocalizedDescription");
}

TEST(PluginError, ControlCharactersOfTheMessageStayOffTheTerminal) {
  const PluginError error{"D", 1, {{PluginError::kLocalizedDescription, "a\nb\x1B[2J\r\x7F\xC3\xA4"}}};
  EXPECT_EQ(error.localizedDescription(), "a\nb\x1B[2J\r\x7F\xC3\xA4");
  for (const char control : {'\n', '\r', '\x1B', '\x7F'})
    EXPECT_EQ(error.description().find(control), std::string::npos) << int{control};
  EXPECT_THAT(error.description(), HasSubstr("\xC3\xA4"));
}

TEST(PluginError, CharactersThatOtherEncodingsCallControlAreWrittenOutByteByByte) {
  const auto shown = [](const char *message) {
    return PluginError{"D", 1, {{PluginError::kLocalizedDescription, message}}}.description();
  };
  EXPECT_THAT(shown("a\xC2\x80"  // U+0080
                    "b"),
              HasSubstr("a\\xc2\\x80b"));
  EXPECT_THAT(shown("\xC2\x9F"), HasSubstr("\\xc2\\x9f"));
  EXPECT_THAT(shown("\xC2\xA0"), HasSubstr("\xC2\xA0"));  // a blank that does not break
  EXPECT_THAT(shown("\xE2\x80\xA8\xE2\x80\xA9"), HasSubstr("\\xe2\\x80\\xa8\\xe2\\x80\\xa9"));
  EXPECT_EQ(shown("\xE2\x80\xA9-"), "D error 1: \\xe2\\x80\\xa9-");  // three bytes, not what follows
  EXPECT_THAT(shown("\xE2\x80\xAA"), HasSubstr("\xE2\x80\xAA"));
  EXPECT_THAT(shown("\xC2"), HasSubstr("\xC2"));  // cut off: nothing is read behind the end
}

TEST(PluginError, WithoutAMessage) {
  EXPECT_EQ(PluginError().localizedDescription(), "");
  EXPECT_EQ(PluginError().code, 0);
  EXPECT_THAT((PluginError{"D", 7, {}}).description(), HasSubstr("7"));
}

}  // namespace
