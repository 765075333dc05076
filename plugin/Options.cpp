// The option -decimal: from arguments to a configuration, and from a configuration to the two flags.
#include <cstdio>
#include <stdexcept>

#include "plugin/HIDReportVeskPlugin.h"
#include "values/Utf8.h"

namespace vesk {
namespace {

constexpr const char *kDecimal = "Decimal";
constexpr const char *kUseStrings = "UseStrings";

constexpr std::int64_t kInvalidArgument = static_cast<std::int32_t>(0xE00002C2);  // -536870206

PluginError invalidOption(const std::string &argument) {
  return {
      "HIDReportVeskPlugin", kInvalidArgument, {{PluginError::kLocalizedDescription, "Invalid option: " + argument}}};
}

bool isOn(const HIDReportVeskPlugin::Configuration &configuration, const char *key) {
  const auto entry = configuration.find(key);
  return entry != configuration.end() && entry->second;
}

}  // namespace
}  // namespace vesk

bool HIDReportVeskPlugin::parseArgs(std::int32_t argc, const char *const *argv) {
  std::vector<std::string> arguments;
  for (std::int32_t i = 0; i < argc; ++i) {
    if (argv[i] == nullptr || !vesk::isUtf8(argv[i]))
      throw std::invalid_argument("HIDReportVeskPlugin: argument " + std::to_string(i) + " is not UTF-8 text");
    arguments.emplace_back(argv[i]);
  }

  PluginError error;
  const auto configuration = argsToConfig(arguments, &error);
  if (!configuration || !configParser(*configuration, &error)) {
    std::puts(error.description().c_str());
    return false;
  }
  return true;
}

std::optional<HIDReportVeskPlugin::Configuration> HIDReportVeskPlugin::argsToConfig(
    const std::vector<std::string> &arguments, PluginError *error) const {
  Configuration configuration;
  for (const std::string &argument : arguments) {
    if (argument != "-decimal") {
      if (error != nullptr) *error = vesk::invalidOption(argument);
      return std::nullopt;
    }
    configuration[vesk::kDecimal] = true;
  }
  return configuration;
}

bool HIDReportVeskPlugin::configParser(const Configuration &configuration, PluginError * /*error*/) {
  useStrings_ = vesk::isOn(configuration, vesk::kUseStrings);  // no option sets it, so every parseArgs clears it
  displayDecimal_ = vesk::isOn(configuration, vesk::kDecimal);
  return true;
}
