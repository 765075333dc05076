// Every line of every report, written out with the conversions that printf gives them.
#include "fuzz/PrintedValue.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <vector>

namespace fuzz {

namespace {

using vesk::Dictionary;

class Printer {
 public:
  Printer(const ReportValue &value, std::string_view report, bool decimal)
      : value_(value), report_(report), decimal_(decimal) {}

  __attribute__((format(printf, 2, 3))) void line(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    addFormatted(format, arguments);
    va_end(arguments);
    text_ += '\n';
  }
  std::string take() { return std::move(text_); }

  void version() { line("%s", std::string(value_.as<vesk::Text>().view()).c_str()); }
  void image();
  void packet();
  void dumpConfig();
  void dumpState() { line("ADC Dump State: %s", std::string(value_.as<vesk::Text>().view()).c_str()); }
  void summary();
  void fullReport();
  void configuration();
  void openShortTest();
  void openShortData(const char *scan);
  void parameters(const char *title, const char *key);
  void watchdog();
  void powerModes();

 private:
  // Without the attribute: g++ judges the format where line() is called.
  void addFormatted(const char *format, va_list arguments) {
    char buffer[1024];
    const int size = std::vsnprintf(buffer, sizeof(buffer), format, arguments);
    if (size < 0 || static_cast<std::size_t>(size) >= sizeof(buffer)) std::abort();
    text_.append(buffer, static_cast<std::size_t>(size));
  }
  template <class T>
  const T &get(const char *key) const {
    return value_.at(std::string_view(key)).as<T>();
  }
  unsigned u32(const char *key) const { return get<std::uint32_t>(key); }
  unsigned byte(std::size_t at) const { return static_cast<unsigned char>(report_.at(at)); }
  template <class Number>
  void words(const std::vector<Number> &numbers, bool decimal);
  void mask(const char *label, std::uint64_t mask);
  void option(const char *label, bool isGlobal, const ReportValue &option);

  const ReportValue &value_;
  std::string_view report_;
  bool decimal_;
  std::string text_;
};

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

void Printer::option(const char *label, bool isGlobal, const ReportValue &option) {
  const int bits = option.at(std::string_view("OPTIONS_RAW")).as<std::int32_t>();
  const std::string level(option.at(std::string_view("ERROR_LEVEL")).as<vesk::Text>().view());
  const char *gpio[] = {"", "GPIO_0 ", "GPIO_1 ", "GPIO_2 "};
  const char *masked = (bits & 0x08) != 0 ? "MASKED " : "", *message = (bits & 0x40) != 0 ? "MESSAGE " : "",
             *breakpoint = (bits & 0x80) != 0 ? "BREAKPOINT " : "",
             *none = (bits & 0xF8) == 0 ? "(no options set)" : "";
  if (isGlobal)
    line("%40s:  %s%s%s%s%s", label, masked, message, gpio[bits / 16 % 4], breakpoint, none);
  else
    line("%40s: %s %s%s%s%s%s", label, level.c_str(), masked, message, gpio[bits / 16 % 4], breakpoint, none);
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

void Printer::summary() {
  const char *levels[] = {"TRACE", "DEBUG", "INFO", "WARNING", "ERROR", "CRITICAL", "UNKNOWN", "UNKNOWN"};
  line("--Black Box Summary--");
  line("Severity Level: %s", levels[get<std::uint8_t>("SEVERITY_LEVEL") % 8]);
  line("Module Count:   %i", int{get<std::uint16_t>("MODULE_COUNT")});
  line("%s", "");
  for (const char *module : {"BLACK_BOX",    "PSE",       "OPEN_SHORT_TEST",
                             "SCAN_LOGGER",  "SVC_SMGR",  "BLOB_LAFE",
                             "BLOB_LFCL",    "BLOB_LPMp", "BLOB_LSPR",
                             "BLOB_LSSp",    "BLOB_LSSC", "BLOB_LSRx",
                             "BLOB_LSPM",    "BLOB_LRTC", "HIDSPI_MASTER",
                             "HIDSPI_SLAVE", "ALGS",      "SYS",
                             "QOR",          "OTP",       "PMGR",
                             "BLOB_LSFN"})
    line("%20s: %i", module, int{get<std::uint8_t>(module)});
}

void Printer::fullReport() {
  line("---Black Box Full Report---");
  line("%s", "");
  line("%40s: %i", "Module Count", int{get<std::uint16_t>("MODULE_COUNT")});
  line("%s", "");
  for (const auto &[key, module] : value_.as<Dictionary>()) {
    if (key.text() == "MODULE_COUNT") continue;
    const std::string name(key.text());
    const bool isBlob = name.starts_with("BLOB_");
    const unsigned id = module.at(name + "_MODULE_ID").as<std::uint16_t>();
    if (isBlob)
      line("%30s Module ID: 0x%04X", name.c_str(), id);
    else
      line("%40s: 0x%04X", (name + " Module ID").c_str(), id);
    const int events = name == "PMGR" ? static_cast<int>(byte(985) | byte(986) << 8)
                                      : int{module.at(name + "_NUM_EVENTS").as<std::uint16_t>()};
    line("%40s: %i", (isBlob ? "BLOB # Events" : name + " # Events").c_str(), events);
    for (const auto &[event, count] : module.as<Dictionary>()) {
      if (!count.is<std::uint32_t>()) continue;
      const std::string label =
          isBlob ? "BLOB" + std::string(event.text().substr(name.size())) : std::string(event.text());
      line("%40s: %i", label.c_str(), static_cast<int>(count.as<std::uint32_t>()));
    }
    line("%s", "");
  }
}

void Printer::configuration() {
  const char *globals[] = {"Trace", "Debug", "Info", "Warning", "Error", "Critical"};
  const int moduleEvents[] = {5, 10, 6, 1, 4, 17, 26, 79, 2, 9, 3, 1, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7};
  const auto &options = value_.as<Dictionary>();
  auto entry = options.begin();
  for (const char *global : globals) {
    option(("Global " + std::string(global) + " Config").c_str(), true, entry->value);
    ++entry;
  }
  for (const int events : moduleEvents) {
    line("%s", "");
    const std::string first(entry->key.text());
    const bool isBlob = first.starts_with("BLOB_");
    const std::size_t nameSize = isBlob ? first.find("_EVENT_") : 0;
    if (isBlob) line("%40s", first.substr(0, nameSize).c_str());
    for (int i = 0; i < events; ++i, ++entry) {
      const std::string key(entry->key.text());
      const ReportValue &shown = key == "OPEN_SHORT_EVENT_SINGLE_OPEN"
                                     ? value_.at(std::string_view("OPEN_SHORT_EVENT_DOUBLE_OPEN"))
                                     : entry->value;
      option((isBlob ? "BLOB" + key.substr(nameSize) : key).c_str(), false, shown);
    }
  }
  line("%s", "");
  if (entry != options.end()) std::abort();
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

}  // namespace

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
