// The lines of all reports but the black box's, written out with the conversions that printf gives them.
#include "fuzz/PrintedValue.h"

#include "fuzz/Printer.h"

namespace fuzz {

template <class Number>
void Printer::words(const std::vector<Number> &numbers, bool decimal) {
  char buffer[64];
  for (std::size_t i = 0; i < numbers.size(); ++i) {
    if (i != 0 && i % 8 == 0) text_ += '\n';
    if (decimal)
      std::snprintf(buffer, sizeof(buffer), "%14d ", static_cast<int>(numbers[i]));
    else
      std::snprintf(buffer, sizeof(buffer), "%08x ", static_cast<unsigned>(numbers[i]));
    text_ += buffer;
  }
  text_ += '\n';
}

void Printer::mask(const char *label, std::uint64_t mask) {
  std::string drawn;
  for (int i = 1; i <= 48; ++i, mask >>= 1) {
    drawn.insert(0, (mask & 1) != 0 ? "X" : ".");
    if (i % 8 == 0) drawn.insert(0, " ");
  }
  line("%s %s", label, drawn.c_str());
}

void Printer::image() {
  line("[Frame # = %u]", u32("FRAME_NUMBER"));
  line("[Frame Params = 0x%08x]", u32("FRAME_PARAMS"));
  line("[Timestamp = %u ms]", u32("TIMESTAMP_MS"));
  line("[TMON = %f degC]", double{get<float>("TMON_DEG_C")});
  line("[TMON Params = 0x%08x]", u32("TMON_PARAMS"));
  line("[Cookie = 0x%02x]", unsigned{get<std::uint8_t>("COOKIE")});
  line("[Flags = 0x%04x]", unsigned{get<std::uint16_t>("FLAGS")});
  line("%s", "");
  const char *blocks[][2] = {
      {"[D-SCAN I]", "D_SCAN_I"}, {"[D-SCAN Q]", "D_SCAN_Q"}, {"[P-SCAN I]", "P_SCAN_I"}, {"[P-SCAN Q]", "P_SCAN_Q"}};
  for (const auto &[heading, key] : blocks) {
    line("%s", heading);
    words(get<std::vector<std::int32_t>>(key), decimal_);
    line("%s", "");
  }
}

void Printer::packet() {
  line("[ADC Packet #    = %u]", u32("PACKET_ID"));
  line("[Magic Value     = 0x%02x%02x%02x]", byte(1), byte(2), byte(3));
  line("[Payload Size    = %u]", u32("PAYLOAD_SIZE"));
  line("[Total Dump Size = %u]", u32("TOTAL_DUMP_SIZE"));
  line("%s", "");
  line("[Packet Payload Data]");
  words(get<std::vector<std::uint32_t>>("PAYLOAD_DATA"), false);
}

void Printer::dumpConfig() {
  const auto channels = get<std::uint64_t>("CHANNEL_ENABLE_MASK");
  line("--ADC Dump Configuration--");
  line("%s", "");
  line("Start Address       = 0x%08x", u32("START_ADDRESS"));
  line("Channel Enable Mask = %04x%08x", static_cast<unsigned>(channels >> 32), static_cast<unsigned>(channels));
  line("Sample Count        = %u", u32("SAMPLE_COUNT"));
  line("Stim Timer Compare  = %u", u32("STIM_TIMER_COMPARE"));
  line("Trigger Source      = %s", std::string(get<vesk::Text>("TRIGGER_SOURCE").view()).c_str());
}

void Printer::openShortTest() {
  line("Open/Short Test Results:");
  line("%s", "");
  line("\t                  40       32       24       16        8        0");
  const char *faults[][2] = {{"\tShort TX+ ", "SHORT_TX_POS"}, {"\tShort TX- ", "SHORT_TX_NEG"},
                             {"\tShort BOTH", "SHORT_BOTH"},   {"\tOpen  TX+ ", "OPEN_TX_POS"},
                             {"\tOpen  TX- ", "OPEN_TX_NEG"},  {"\tOpen  BOTH", "OPEN_BOTH"},
                             {"\tWeak  O/S ", "WEAK_OS"}};
  for (const auto &[label, key] : faults) mask(label, get<std::uint64_t>(key));
}

void Printer::openShortData(const char *scan) {
  line("Open/Short Test %s Data:", scan);
  line("%s", "");
  line("                       40       32       24       16        8        0");
  mask("ADC Saturation ", get<std::uint64_t>("SATURATION_DATA"));
  line("%s", "");
  line("Brownout: %s", get<std::uint8_t>("BROWNOUT") == 1 ? "YES" : "NO");
  line("%s", "");
  line("[%s I]", scan);
  words(get<std::vector<std::uint32_t>>("SCAN_DATA_I"), decimal_);
  line("%s", "");
  line("[%s Q]", scan);
  words(get<std::vector<std::uint32_t>>("SCAN_DATA_Q"), decimal_);
}

void Printer::parameters(const char *title, const char *key) {
  line("%s", title);
  const auto &values = get<std::vector<float>>(key);
  char buffer[128];
  for (std::size_t i = 0; i < values.size(); ++i) {
    if (i % 8 == 0) text_ += '\n';
    std::snprintf(buffer, sizeof(buffer), "% -13.3f ", double{values[i]});
    text_ += buffer;
  }
  text_ += "\n\n";
}

void Printer::watchdog() {
  line("Watchdog Data:");
  line("    Feed Count:%u", u32("Count"));
  line("Feed Timestamp:0x%016llX", static_cast<unsigned long long>(get<std::int64_t>("Timestamp")));
  line("Feed Wallclock:%15.3f", get<double>("Wallclock"));
  line("      Register:0x%08X", u32("Register"));
  line("          Wake:%u", u32("Wake"));
  line("         Sleep:%u", u32("Idle"));
}

void Printer::powerModes() {
  const char *modes[] = {"INIT", "ACTIVE", "TIMEOUT", "READY", "LIGHT_SLEEP_EXITING", "LIGHT_SLEEP"};
  line("Power Mode Statistics - Total Time:");
  for (const char *mode : modes) line("%-20s: %12u ms", mode, u32((std::string(mode) + " time ms").c_str()));
  line("%s", "");
  line("Power Mode Statistics - Number of Times Entered:");
  for (const char *mode : modes) line("%-20s: %u", mode, u32((std::string(mode) + " times entered").c_str()));
}

std::string printedValue(unsigned id, const ReportValue &value, std::string_view report, bool decimal) {
  Printer printer(value, report, decimal);
  switch (id) {
    case 0x76:
      printer.image();
      break;
    case 0x77:
      printer.packet();
      break;
    case 0xA2:
      printer.parameters("Vesk Algorithms Baseline:", "BASELINE");
      break;
    case 0xA9:
      printer.powerModes();
      break;
    case 0xD0:
      printer.version();
      break;
    case 0xDC:
      printer.dumpConfig();
      break;
    case 0xDE:
      printer.dumpState();
      break;
    case 0xDF:
      printer.watchdog();
      break;
    case 0xE0:
      printer.summary();
      break;
    case 0xE1:
    case 0xEA:
      printer.fullReport();
      break;
    case 0xE2:
      printer.configuration();
      break;
    case 0xE3:
      printer.openShortTest();
      break;
    case 0xE4:
      printer.openShortData("D-SCAN");
      break;
    case 0xE5:
      printer.openShortData("P-SCAN");
      break;
    case 0xEC:
      printer.parameters("Noisy Pixel Thresholds:", "NOISY_PIXEL_THRESHOLDS");
      break;
    default:
      std::abort();
  }
  return printer.take();
}

std::string printedVersion(std::string_view report) {
  std::string text(report.substr(std::min<std::size_t>(1, report.size())));
  text.resize(std::min(text.find('\0'), text.size()));
  return text + "\n";
}

}  // namespace fuzz
