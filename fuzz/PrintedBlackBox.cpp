// The lines of the black box's reports, written out with the conversions that printf gives them.
#include "fuzz/Printer.h"

namespace fuzz {

using vesk::Dictionary;

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

}  // namespace fuzz
