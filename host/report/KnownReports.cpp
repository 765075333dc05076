// The controller's seventeen reports and what they consist of.
#include "host/report/KnownReports.h"

#include <charconv>

namespace vesk::host {

namespace {

using enum FieldType;
using enum ReportType;
using enum KnownReport::Length;

constexpr FieldRow kSensorImage[] = {
    {1, kU8, 1, "Cookie", "/COOKIE"},
    {2, kU16, 1, "Flags", "/FLAGS"},
    {4, kU32, 1, "Frame #", "/FRAME_NUMBER"},
    {8, kU32, 1, "Frame Params", "/FRAME_PARAMS"},
    {12, kU32, 1, "Timestamp", "/TIMESTAMP_MS", "ms"},
    {16, kI32, 48, "[D-SCAN I]", "/D_SCAN_I", {}, "in-phase; hexadecimal on screen unless --decimal"},
    {208, kI32, 48, "[D-SCAN Q]", "/D_SCAN_Q", {}, "quadrature; hexadecimal on screen unless --decimal"},
    {400, kI32, 48, "[P-SCAN I]", "/P_SCAN_I", {}, "in-phase; hexadecimal on screen unless --decimal"},
    {592, kI32, 48, "[P-SCAN Q]", "/P_SCAN_Q", {}, "quadrature; hexadecimal on screen unless --decimal"},
    {784, kU32, 1, "TMON Params", "/TMON_PARAMS"},
    {788, kF32, 1, "TMON", "/TMON_DEG_C", "degC", "six decimals on screen"},
};

constexpr FieldRow kAdcDumpPacket[] = {
    {1,
     kBytes,
     3,
     "Magic Value",
     "/MAGIC_VALUE",
     {},
     "side by side on screen; the value shifts them by 2, 1 and 0 bits and joins them, as the firmware's tools do"},
    {4, kU32, 1, "ADC Packet #", "/PACKET_ID"},
    {8, kU32, 1, "Payload Size", "/PAYLOAD_SIZE", "bytes", "as the device states it; limits nothing"},
    {12, kU32, 1, "Total Dump Size", "/TOTAL_DUMP_SIZE", "bytes"},
    {16,
     kU32,
     512,
     "[Packet Payload Data]",
     "/PAYLOAD_DATA",
     {},
     "a memory dump: all words, always hexadecimal on screen"},
};

constexpr FieldRow kBaseline[] = {
    {1, kF32, 48, "Vesk Algorithms Baseline", "/BASELINE", {}, "three decimals on screen, --decimal or not"},
};

constexpr FieldRow kThresholds[] = {
    {1,
     kF32,
     48,
     "Noisy Pixel Thresholds",
     "/NOISY_PIXEL_THRESHOLDS",
     {},
     "three decimals on screen, --decimal or not"},
};

constexpr std::string_view kInterleaved = "both forms list all times first, then all counts";
constexpr FieldRow kPowerModes[] = {
    {1, kU32, 1, "INIT", "/INIT time ms", "ms", kInterleaved},
    {5, kU32, 1, "INIT", "/INIT times entered"},
    {9, kU32, 1, "ACTIVE", "/ACTIVE time ms", "ms"},
    {13, kU32, 1, "ACTIVE", "/ACTIVE times entered"},
    {17, kU32, 1, "TIMEOUT", "/TIMEOUT time ms", "ms"},
    {21, kU32, 1, "TIMEOUT", "/TIMEOUT times entered"},
    {25, kU32, 1, "READY", "/READY time ms", "ms"},
    {29, kU32, 1, "READY", "/READY times entered"},
    {33, kU32, 1, "LIGHT_SLEEP_EXITING", "/LIGHT_SLEEP_EXITING time ms", "ms"},
    {37, kU32, 1, "LIGHT_SLEEP_EXITING", "/LIGHT_SLEEP_EXITING times entered"},
    {41, kU32, 1, "LIGHT_SLEEP", "/LIGHT_SLEEP time ms", "ms"},
    {45, kU32, 1, "LIGHT_SLEEP", "/LIGHT_SLEEP times entered"},
};

constexpr FieldRow kVersion[] = {
    {1, kString, 1, "", "", {}, "to the first zero; the value is the text itself"},
};

constexpr FieldRow kVersionExtended[] = {
    {1,
     kString,
     1,
     "",
     "",
     {},
     "to the first zero; the value names six lines: PROJECT, SDK, TOOLCHAIN, KORVO, VENDOR, ALGS; fewer are an error "
     "there, more are shown on screen only"},
};

constexpr FieldRow kAdcDumpConfig[] = {
    {1, kU32, 1, "Start Address", "/START_ADDRESS"},
    {5,
     kU64,
     1,
     "Channel Enable Mask",
     "/CHANNEL_ENABLE_MASK",
     {},
     "on screen the high part has at least four hexadecimal digits, enough for 48 channels"},
    {13, kU32, 1, "Sample Count", "/SAMPLE_COUNT"},
    {17, kU32, 1, "Stim Timer Compare", "/STIM_TIMER_COMPARE"},
    {21, kU32, 1, "Trigger Source", "/TRIGGER_SOURCE", {}, "0 is RX_EN, all else STIM_TIMER"},
};

constexpr FieldRow kAdcDumpState[] = {
    {1,
     kU8,
     1,
     "ADC Dump State",
     "",
     {},
     "0 STANDBY, 1 SINGLE, 2 CONTINUOUS, all else INVALID; the value is the word itself"},
};

constexpr FieldRow kWatchdog[] = {
    {1, kU32, 1, "Feed Count", "/Count"},
    {5, kU64, 1, "Feed Timestamp", "/Timestamp", "us", "unsigned on screen, signed in the value"},
    {5, kU64, 1, "Feed Wallclock", "/Wallclock", "s",
     "the timestamp times 0.000001 in single precision, as the firmware's tools compute it: seven digits"},
    {13, kU32, 1, "Register", "/Register"},
    {17, kU32, 1, "Wake", "/Wake"},
    {21, kU32, 1, "Sleep", "/Idle", {}, "named differently in the two forms"},
};

constexpr FieldRow kBlackBoxSummary[] = {
    {1,
     kU8,
     1,
     "Severity Level",
     "/SEVERITY_LEVEL",
     {},
     "on screen the name of the three low bits, in the value the whole byte"},
    {2, kU16, 1, "Module Count", "/MODULE_COUNT", {}, "limits nothing"},
    {4, kModules, 3, "", "", {}, "a bit for each module that has something recorded; bits 22 and 23 are nobody's"},
};

constexpr FieldRow kBlackBoxReport[] = {
    {1, kU16, 1, "Module Count", "/MODULE_COUNT", {}, "limits nothing"},
    {3,
     kModules,
     1020,
     "",
     "",
     {},
     "module by module its ID, its number of events and a counter for each; counters are signed on screen and "
     "unsigned in the value"},
};

constexpr FieldRow kBlackBoxConfig[] = {
    {1,
     kModules,
     240,
     "",
     "",
     {},
     "an option byte for each severity level and event: level in bits 0 to 2, then masked, GPIO (2 bits), message, "
     "breakpoint; words on screen, level and whole byte in the value"},
};

constexpr std::string_view kMask = "positions 47 to 0 on screen, all 64 bits in the value";
constexpr FieldRow kOpenShortResult[] = {
    {1, kU64, 1, "Short TX+", "/SHORT_TX_POS", {}, kMask}, {9, kU64, 1, "Short TX-", "/SHORT_TX_NEG", {}, kMask},
    {17, kU64, 1, "Short BOTH", "/SHORT_BOTH", {}, kMask}, {25, kU64, 1, "Open  TX+", "/OPEN_TX_POS", {}, kMask},
    {33, kU64, 1, "Open  TX-", "/OPEN_TX_NEG", {}, kMask}, {41, kU64, 1, "Open  BOTH", "/OPEN_BOTH", {}, kMask},
    {49, kU64, 1, "Weak  O/S", "/WEAK_OS", {}, kMask},
};

constexpr std::string_view kTestSamples = "under --decimal signed on screen, to be read beside sensor-image";
constexpr std::string_view kBrownout = "bit 0; the others mean nothing";
constexpr FieldRow kOpenShortDataD[] = {
    {1, kU64, 1, "ADC Saturation", "/SATURATION_DATA", {}, kMask},
    {9, kU32, 48, "[D-SCAN I]", "/SCAN_DATA_I", {}, kTestSamples},
    {201, kU32, 48, "[D-SCAN Q]", "/SCAN_DATA_Q", {}, kTestSamples},
    {393, kU8, 1, "Brownout", "/BROWNOUT", {}, kBrownout},
    {394, kUnused, 7, kNotShown, kNotShown},
};
constexpr FieldRow kOpenShortDataP[] = {
    {1, kU64, 1, "ADC Saturation", "/SATURATION_DATA", {}, kMask},
    {9, kU32, 48, "[P-SCAN I]", "/SCAN_DATA_I", {}, kTestSamples},
    {201, kU32, 48, "[P-SCAN Q]", "/SCAN_DATA_Q", {}, kTestSamples},
    {393, kU8, 1, "Brownout", "/BROWNOUT", {}, kBrownout},
    {394, kUnused, 7, kNotShown, kNotShown},
};

constexpr KnownReport known(std::uint8_t id, ReportType type, std::string_view name, KnownReport::Length length,
                            std::string_view decoder, std::string_view title, std::span<const FieldRow> fields) {
  return {id, type, name, layoutSize(fields), length, decoder, title, fields};
}

constexpr KnownReport kReports[] = {
    known(0x76, kInput, "sensor-image", kExact, "parseVeskImage", "Sensor image", kSensorImage),
    known(0x77, kInput, "adc-dump-packet", kExact, "parseAdcDumpPacket", "ADC dump packet", kAdcDumpPacket),
    known(0xA2, kFeature, "algorithm-baseline", kAtLeast, "parserVeskAlgBaselineRequest", "Algorithm baseline",
          kBaseline),
    known(0xA9, kFeature, "power-modes", kAtLeast, "parsePowerModeStats", "Power mode statistics", kPowerModes),
    known(0xD0, kFeature, "version", kText, "parseVersion", "Version", kVersion),
    known(0xD2, kFeature, "version-extended", kText, "parseVersionExtended", "Extended version", kVersionExtended),
    known(0xDC, kFeature, "adc-dump-config", kAtLeast, "parseAdcDumpConfig", "ADC dump configuration", kAdcDumpConfig),
    known(0xDE, kFeature, "adc-dump-state", kAtLeast, "parseAdcDumpState", "ADC dump state", kAdcDumpState),
    known(0xDF, kFeature, "watchdog", kAtLeast, "parseWatchDogReport", "Watchdog", kWatchdog),
    known(0xE0, kFeature, "black-box-summary", kAtLeast, "parseBlackBoxSummary", "Black box summary", kBlackBoxSummary),
    known(0xE1, kFeature, "black-box-report", kAtLeast, "parseBlackBoxFullReport", "Black box full report",
          kBlackBoxReport),
    known(0xE2, kFeature, "black-box-config", kAtLeast, "parseBlackBoxConfig", "Black box configuration",
          kBlackBoxConfig),
    known(0xE3, kFeature, "open-short-result", kAtLeast, "parseOpenShortTest", "Open/short test result",
          kOpenShortResult),
    known(0xE4, kFeature, "open-short-data-d", kAtLeast, "parseOpenShortData", "Open/short test data, D-SCAN",
          kOpenShortDataD),
    known(0xE5, kFeature, "open-short-data-p", kAtLeast, "parseOpenShortData", "Open/short test data, P-SCAN",
          kOpenShortDataP),
    known(0xEA, kFeature, "black-box-report-2", kAtLeast, "parseBlackBoxFullReport", "Black box full report, second ID",
          kBlackBoxReport),
    known(0xEC, kFeature, "noisy-pixel-thresholds", kAtLeast, "parserNoisyPixelThresholdsRequest",
          "Noisy-pixel thresholds", kThresholds),
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
