// The option -decimal, the configuration dictionary, and everything that is no option.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "plugin/HIDReportVeskPlugin.h"
#include "tests/CaptureStdout.h"

namespace {

using test::captureStdout;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Pair;
using testing::ThrowsMessage;

using Arguments = std::vector<const char *>;

/// parseArgs, and what it printed.
bool parse(HIDReportVeskPlugin &plugin, const Arguments &arguments, std::string &printed) {
  bool accepted = false;
  printed = captureStdout(
      [&] { accepted = plugin.parseArgs(static_cast<std::int32_t>(arguments.size()), arguments.data()); });
  return accepted;
}

struct Row {
  Arguments arguments;
  const char *rejected;  // the argument that the message names; null where all are accepted
  bool decimal;          // of an object that had both flags set before
  bool strings;
};

const Row kRows[] = {
    {{}, nullptr, false, false},
    {{"-decimal"}, nullptr, true, false},
    {{"-decimal", "-decimal"}, nullptr, true, false},
    {{"-Decimal"}, "-Decimal", true, true},
    {{"--decimal"}, "--decimal", true, true},
    {{"-decimal "}, "-decimal ", true, true},
    {{"-decima"}, "-decima", true, true},
    {{"decimal"}, "decimal", true, true},
    {{""}, "", true, true},
    {{"-x"}, "-x", true, true},
    {{"vesk-report", "-decimal"}, "vesk-report", true, true},
    {{"-decimal", "-y", "-z"}, "-y", true, true},
    {{"-decimal", "\xC3\xA4"}, "\xC3\xA4", true, true},
};

TEST(Options, Table) {
  for (const Row &row : kRows) {
    const auto plugin = HIDReportVeskPlugin::init();
    plugin->setDisplayDecimal(true);
    plugin->setUseStrings(true);
    std::string printed;
    EXPECT_EQ(parse(*plugin, row.arguments, printed), row.rejected == nullptr);
    EXPECT_EQ(plugin->displayDecimal(), row.decimal);
    EXPECT_EQ(plugin->useStrings(), row.strings);
    if (row.rejected == nullptr) {
      EXPECT_EQ(printed, "");
      continue;
    }
    EXPECT_EQ(std::count(printed.begin(), printed.end(), '\n'), 1) << printed;
    EXPECT_EQ(printed.back(), '\n');
    EXPECT_THAT(printed, HasSubstr("HIDReportVeskPlugin"));
    EXPECT_THAT(printed, HasSubstr("-536870206"));
    EXPECT_THAT(printed, HasSubstr(std::string("Invalid option: ") + row.rejected + "\n"));
  }
}

TEST(Options, RejectedArgumentsLeaveClearFlagsClear) {
  const auto plugin = HIDReportVeskPlugin::init();
  std::string printed;
  EXPECT_FALSE(parse(*plugin, {"-decimal", "-x"}, printed));
  EXPECT_FALSE(plugin->displayDecimal());
  EXPECT_FALSE(plugin->useStrings());
}

TEST(Options, ALaterCallSetsTheFlagAnew) {
  const auto plugin = HIDReportVeskPlugin::init();
  const char *arguments[] = {"-decimal"};
  EXPECT_TRUE(plugin->parseArgs(1, arguments));
  EXPECT_TRUE(plugin->displayDecimal());
  EXPECT_TRUE(plugin->parseArgs(0, arguments));
  EXPECT_FALSE(plugin->displayDecimal());
}

TEST(Options, NoArgumentsAreLookedAtWhereTheCountIsNotPositive) {
  const auto plugin = HIDReportVeskPlugin::init();
  EXPECT_TRUE(plugin->parseArgs(0, nullptr));
  EXPECT_TRUE(plugin->parseArgs(-1, nullptr));
}

TEST(Options, TextThatIsNotUtf8RaisesBeforeAnyOptionIsTested) {
  for (const char *bad : {"\xFF", "-decimal\x80", "\xC0\xAF", "\xED\xA0\x80"}) {
    const auto plugin = HIDReportVeskPlugin::init();
    const char *arguments[] = {"-x", "-decimal", bad};
    std::exception_ptr raised;
    EXPECT_EQ(captureStdout([&] { plugin->parseArgs(3, arguments); }, &raised), "");
    ASSERT_TRUE(raised);
    EXPECT_THROW(std::rethrow_exception(raised), std::invalid_argument);
    EXPECT_FALSE(plugin->displayDecimal());
    EXPECT_TRUE(plugin->parseArgs(1, arguments + 1));
    EXPECT_TRUE(plugin->displayDecimal());
  }
}

TEST(Options, WhatIsRaisedSaysWhichArgument) {
  const auto plugin = HIDReportVeskPlugin::init();
  const char *arguments[] = {"-decimal", "\xFF", nullptr};
  EXPECT_THAT([&] { plugin->parseArgs(2, arguments); },
              ThrowsMessage<std::invalid_argument>("HIDReportVeskPlugin: argument 1 is not UTF-8 text"));
  EXPECT_THAT([&] { plugin->parseArgs(1, arguments + 2); },
              ThrowsMessage<std::invalid_argument>("HIDReportVeskPlugin: argument 0 is not UTF-8 text"));
}

TEST(Options, AbsentArgumentRaises) {
  const auto plugin = HIDReportVeskPlugin::init();
  const char *arguments[] = {"-decimal", nullptr};
  EXPECT_THROW(plugin->parseArgs(2, arguments), std::invalid_argument);
  EXPECT_FALSE(plugin->displayDecimal());
}

TEST(Options, LineFeedInAnArgumentKeepsTheDescriptionOnOneLine) {
  const auto plugin = HIDReportVeskPlugin::init();
  std::string printed;
  EXPECT_FALSE(parse(*plugin, {"-x\n-y"}, printed));
  EXPECT_EQ(std::count(printed.begin(), printed.end(), '\n'), 1) << printed;
}

TEST(Options, ArgumentsToConfiguration) {
  const auto plugin = HIDReportVeskPlugin::init();
  PluginError error;
  EXPECT_THAT(plugin->argsToConfig({}, &error).value(), ElementsAre());
  EXPECT_THAT(plugin->argsToConfig({"-decimal", "-decimal"}, &error).value(), ElementsAre(Pair("Decimal", true)));
  EXPECT_EQ(error.code, 0);  // untouched so far

  EXPECT_EQ(plugin->argsToConfig({"-decimal", "-x", "-y"}, &error), std::nullopt);
  EXPECT_EQ(error.domain, "HIDReportVeskPlugin");
  EXPECT_EQ(error.code, -536870206);
  EXPECT_THAT(error.userInfo, ElementsAre(Pair(PluginError::kLocalizedDescription, "Invalid option: -x")));
  EXPECT_EQ(error.localizedDescription(), "Invalid option: -x");
  EXPECT_THAT(error.description(), HasSubstr("HIDReportVeskPlugin"));
  EXPECT_THAT(error.description(), HasSubstr("-536870206"));
  EXPECT_THAT(error.description(), HasSubstr("Invalid option: -x"));

  EXPECT_EQ(plugin->argsToConfig({"-x"}, nullptr), std::nullopt);
}

TEST(Options, ConfigurationSetsBothFlags) {
  const auto plugin = HIDReportVeskPlugin::init();
  PluginError error;
  for (const bool decimal : {false, true})
    for (const bool strings : {false, true}) {
      EXPECT_TRUE(plugin->configParser({{"Decimal", decimal}, {"UseStrings", strings}}, &error));
      EXPECT_EQ(plugin->displayDecimal(), decimal);
      EXPECT_EQ(plugin->useStrings(), strings);
    }
  EXPECT_TRUE(plugin->configParser({{"decimal", true}, {"Other", true}}, nullptr));
  EXPECT_FALSE(plugin->displayDecimal());
  EXPECT_FALSE(plugin->useStrings());
  EXPECT_EQ(error.description(), PluginError().description());  // never written
}

}  // namespace
