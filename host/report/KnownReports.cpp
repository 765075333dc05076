// The controller's seventeen reports.
#include "host/report/KnownReports.h"

#include <charconv>

namespace vesk::host {

namespace {

using enum ReportType;
using enum KnownReport::Length;

constexpr KnownReport kReports[] = {
    {0x76, kInput, "sensor-image", 792, kExact, "parseVeskImage", "Sensor image"},
    {0x77, kInput, "adc-dump-packet", 2064, kExact, "parseAdcDumpPacket", "ADC dump packet"},
    {0xA2, kFeature, "algorithm-baseline", 193, kAtLeast, "parserVeskAlgBaselineRequest", "Algorithm baseline"},
    {0xA9, kFeature, "power-modes", 49, kAtLeast, "parsePowerModeStats", "Power mode statistics"},
    {0xD0, kFeature, "version", 2, kText, "parseVersion", "Version"},
    {0xD2, kFeature, "version-extended", 2, kText, "parseVersionExtended", "Extended version"},
    {0xDC, kFeature, "adc-dump-config", 25, kAtLeast, "parseAdcDumpConfig", "ADC dump configuration"},
    {0xDE, kFeature, "adc-dump-state", 2, kAtLeast, "parseAdcDumpState", "ADC dump state"},
    {0xDF, kFeature, "watchdog", 25, kAtLeast, "parseWatchDogReport", "Watchdog"},
    {0xE0, kFeature, "black-box-summary", 7, kAtLeast, "parseBlackBoxSummary", "Black box summary"},
    {0xE1, kFeature, "black-box-report", 1023, kAtLeast, "parseBlackBoxFullReport", "Black box full report"},
    {0xE2, kFeature, "black-box-config", 241, kAtLeast, "parseBlackBoxConfig", "Black box configuration"},
    {0xE3, kFeature, "open-short-result", 57, kAtLeast, "parseOpenShortTest", "Open/short test result"},
    {0xE4, kFeature, "open-short-data-d", 401, kAtLeast, "parseOpenShortData", "Open/short test data, D-SCAN"},
    {0xE5, kFeature, "open-short-data-p", 401, kAtLeast, "parseOpenShortData", "Open/short test data, P-SCAN"},
    {0xEA, kFeature, "black-box-report-2", 1023, kAtLeast, "parseBlackBoxFullReport",
     "Black box full report, second ID"},
    {0xEC, kFeature, "noisy-pixel-thresholds", 193, kAtLeast, "parserNoisyPixelThresholdsRequest",
     "Noisy-pixel thresholds"},
};

}  // namespace

std::span<const KnownReport> knownReports() {
  return kReports;
}

const KnownReport *findReport(std::uint32_t id) {
  for (const KnownReport &report : kReports)
    if (report.id == id) return &report;
  return nullptr;
}

const KnownReport *findReport(std::string_view idOrName) {
  for (const KnownReport &report : kReports)
    if (report.name == idOrName) return &report;
  const bool hex = idOrName.starts_with("0x") || idOrName.starts_with("0X");
  const std::string_view digits = idOrName.substr(hex ? 2 : 0);
  std::uint32_t id = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), id, hex ? 16 : 10);
  if (error != std::errc() || end != digits.data() + digits.size()) return nullptr;
  return findReport(id);
}

}  // namespace vesk::host
