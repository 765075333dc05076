// A complete small host: reads one raw report from a file, prints its lines, and walks through its value.
//
// Usage: host FILE [-decimal]
#include <cstdio>
#include <exception>
#include <fstream>
#include <iterator>
#include <string>

#include "plugin/HIDReportVeskPlugin.h"

namespace {

void show(const ReportValue &value, const std::string &path) {
  if (value.is<vesk::Dictionary>()) {
    for (const auto &[key, entry] : value.as<vesk::Dictionary>()) show(entry, path + "/" + std::string(key.text()));
  } else if (value.is<std::uint8_t>() || value.is<std::uint16_t>() || value.is<std::uint32_t>()) {
    const unsigned long number = value.is<std::uint8_t>()    ? value.as<std::uint8_t>()
                                 : value.is<std::uint16_t>() ? value.as<std::uint16_t>()
                                                             : value.as<std::uint32_t>();
    std::printf("%s = %lu\n", path.c_str(), number);
  } else if (value.is<vesk::Text>()) {
    std::printf("%s = \"%s\"\n", path.c_str(), std::string(value.as<vesk::Text>().view()).c_str());
  } else if (value.size() != 0) {
    std::printf("%s: %zu numbers\n", path.c_str(), value.size());
  } else {
    std::printf("%s\n", path.c_str());  // 64 bits, a float or a truth value: as<T>() in the same way
  }
}

int decode(const std::string &bytes, int optionCount, const char *const *options) {
  const std::unique_ptr<HIDReportVeskPlugin> plugin = HIDReportVeskPlugin::init();
  if (plugin == nullptr || !plugin->parseArgs(optionCount, options)) return 2;

  const PaddedReport report(bytes);  // keeps the promise of readable bytes, whatever the report's length
  const auto id = static_cast<unsigned char>(report.data()[0]);
  const int type = id == 0x76 || id == 0x77 ? HIDReportVeskPlugin::kInputReport : HIDReportVeskPlugin::kFeatureReport;

  const ReportResult result = plugin->reportToObject(report.data(), id, type, report.length());
  if (const auto *value = std::get_if<ReportValue>(&result)) show(*value, "");

  if (plugin->parseReport(report.data(), id, type, report.length())) return 0;
  std::fprintf(stderr, "nothing decodes report 0x%02X of %zu bytes\n", unsigned{id}, bytes.size());
  return 4;
}

}  // namespace

int main(int argc, char **argv) {
  if (argc < 2) return 2;
  std::ifstream file(argv[1], std::ios::binary);
  const std::string bytes{std::istreambuf_iterator<char>(file), {}};
  if (bytes.empty()) return 3;
  try {
    return decode(bytes, argc - 2, argv + 2);
  } catch (const std::exception &raised) {  // a version that is no text, or has lines missing
    std::fprintf(stderr, "%s\n", raised.what());
    return 4;
  }
}
