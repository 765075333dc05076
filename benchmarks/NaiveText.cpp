// The naive reference: offsets into the report, snprintf, and a vector of strings. Labels are the catalogue's.
#include "benchmarks/NaiveText.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "reports/blackbox/Catalogue.h"

namespace vesk::benchmarks {

namespace {

using Lines = std::vector<std::string>;

template <class Number>
Number at(const char *report, std::size_t offset) {
  Number number;
  std::memcpy(&number, report + offset, sizeof number);
  return number;
}

__attribute__((format(printf, 1, 2))) std::string format(const char *pattern, ...) {
  char text[256];  // no line of these reports is longer
  std::va_list arguments;
  va_start(arguments, pattern);
  const int size = std::vsnprintf(text, sizeof text, pattern, arguments);
  va_end(arguments);
  return std::string(text, static_cast<std::size_t>(size));
}

/// Lines of eight values, each made by `text(index)`.
template <class Text>
void addValues(Lines &lines, unsigned count, Text text) {
  std::string line;
  for (unsigned i = 0; i < count; ++i) {
    line += text(i);
    if (i % 8 != 7) continue;
    lines.push_back(line);
    line.clear();
  }
}

Lines image(const char *r, bool decimal) {
  Lines lines;
  lines.push_back(format("[Frame # = %u]", at<std::uint32_t>(r, 4)));
  lines.push_back(format("[Frame Params = 0x%08x]", at<std::uint32_t>(r, 8)));
  lines.push_back(format("[Timestamp = %u ms]", at<std::uint32_t>(r, 12)));
  lines.push_back(format("[TMON = %f degC]", static_cast<double>(at<float>(r, 788))));
  lines.push_back(format("[TMON Params = 0x%08x]", at<std::uint32_t>(r, 784)));
  lines.push_back(format("[Cookie = 0x%02x]", at<std::uint8_t>(r, 1)));
  lines.push_back(format("[Flags = 0x%04x]", at<std::uint16_t>(r, 2)));
  lines.push_back("");
  const char *const headings[] = {"[D-SCAN I]", "[D-SCAN Q]", "[P-SCAN I]", "[P-SCAN Q]"};
  std::size_t offset = 16;
  for (const char *heading : headings) {
    lines.push_back(heading);
    addValues(lines, 48, [&](unsigned i) {
      const auto sample = at<std::int32_t>(r, offset + 4 * i);
      return decimal ? format("%14d ", sample) : format("%08x ", static_cast<unsigned>(sample));
    });
    lines.push_back("");
    offset += 192;
  }
  return lines;
}

Lines packet(const char *r) {
  Lines lines;
  lines.push_back(format("[ADC Packet #    = %u]", at<std::uint32_t>(r, 4)));
  lines.push_back(format("[Magic Value     = 0x%02x%02x%02x]", at<std::uint8_t>(r, 1), at<std::uint8_t>(r, 2),
                         at<std::uint8_t>(r, 3)));
  lines.push_back(format("[Payload Size    = %u]", at<std::uint32_t>(r, 8)));
  lines.push_back(format("[Total Dump Size = %u]", at<std::uint32_t>(r, 12)));
  lines.push_back("");
  lines.push_back("[Packet Payload Data]");
  addValues(lines, 512, [&](unsigned i) { return format("%08x ", at<std::uint32_t>(r, 16 + 4 * i)); });
  return lines;
}

Lines floats(const char *r, const char *title) {
  Lines lines{title, ""};
  addValues(lines, 48, [&](unsigned i) { return format("% -13.3f ", static_cast<double>(at<float>(r, 1 + 4 * i))); });
  lines.push_back("");
  return lines;
}

/// What the two black-box reports know of a module: its texts as strings, and where its part of each report begins.
struct NaiveModule {
  std::string name, idLabel, countLabel;
  std::vector<std::string> events;
  std::size_t counters, options;
};

std::string withoutBlanks(const Label<40> &label) {
  const std::string_view text(label.text, label.size);
  return std::string(text.substr(std::min(text.find_first_not_of(' '), text.size())));
}

const std::vector<NaiveModule> &modules() {
  static const std::vector<NaiveModule> all = [] {
    std::vector<NaiveModule> modules;
    std::size_t counters = 3, options = 7;
    for (std::size_t m = 0; m < kModules; ++m) {
      const Module &module = kCatalogue[m];
      NaiveModule &naive = modules.emplace_back();
      naive = {std::string(module.name.text()),
               withoutBlanks(module.idLabel),
               withoutBlanks(module.countLabel),
               {},
               counters,
               options};
      for (const Event &event : module.events) naive.events.push_back(withoutBlanks(event.label));
      counters += 4 + 4 * module.events.size();
      options += module.events.size() + (m == kQor ? 1 : 0);
    }
    return modules;
  }();
  return all;
}

Lines fullReport(const char *r) {
  Lines lines{"---Black Box Full Report---", ""};
  lines.push_back(format("%40s: %i", "Module Count", at<std::uint16_t>(r, 1)));
  lines.push_back("");
  const auto add = [&](const NaiveModule &module, bool isBlob) {
    if (isBlob)
      lines.push_back(format("%30s Module ID: 0x%04X", module.name.c_str(), at<std::uint16_t>(r, module.counters)));
    else
      lines.push_back(format("%40s: 0x%04X", module.idLabel.c_str(), at<std::uint16_t>(r, module.counters)));
    lines.push_back(format("%40s: %i", module.countLabel.c_str(), at<std::uint16_t>(r, module.counters + 2)));
    for (std::size_t e = 0; e < module.events.size(); ++e)
      lines.push_back(format("%40s: %i", module.events[e].c_str(), at<std::int32_t>(r, module.counters + 4 + 4 * e)));
    lines.push_back("");
  };
  for (const ModuleIndex module : kFunctionalOrder) add(modules()[module], false);
  for (const ModuleIndex module : kBlobOrder) add(modules()[module], true);
  return lines;
}

std::string optionText(unsigned option, const std::string &label, bool withLevel) {
  const char *const levels[] = {"TRACE", "DEBUG", "INFO", "WARNING", "ERROR", "CRITICAL", "UNKNOWN", "UNKNOWN"};
  const char *const pins[] = {"", "GPIO_0 ", "GPIO_1 ", "GPIO_2 "};
  return format("%40s: %s %s%s%s%s%s", label.c_str(), withLevel ? levels[option & 7] : "",
                (option & 0x08) != 0 ? "MASKED " : "", (option & 0x40) != 0 ? "MESSAGE " : "", pins[option >> 4 & 3],
                (option & 0x80) != 0 ? "BREAKPOINT " : "", (option & 0xF8) == 0 ? "(no options set)" : "");
}

Lines configuration(const char *r) {
  Lines lines;
  const char *const globals[] = {"Trace", "Debug", "Info", "Warning", "Error", "Critical"};
  for (std::size_t g = 0; g < std::size(globals); ++g)
    lines.push_back(optionText(at<std::uint8_t>(r, 1 + g), "Global " + std::string(globals[g]) + " Config", false));
  lines.push_back("");
  const auto add = [&](ModuleIndex index) {
    const NaiveModule &module = modules()[index];
    for (std::size_t e = 0; e < module.events.size(); ++e) {
      const std::size_t shown = index == kOpenShortTest && e == 4 ? 3 : index == kQor && e == 8 ? 9 : e;
      lines.push_back(optionText(at<std::uint8_t>(r, module.options + shown), module.events[e], true));
    }
    lines.push_back("");
  };
  for (const ModuleIndex module : kFunctionalOrder) add(module);
  for (const ModuleIndex module : kBlobOrder) {
    lines.push_back(format("%40s", modules()[module].name.c_str()));
    add(module);
  }
  return lines;
}

}  // namespace

std::vector<std::string> naiveLines(const char *report, unsigned id, bool decimal) {
  switch (id) {
    case 0x76:
      return image(report, decimal);
    case 0x77:
      return packet(report);
    case 0xA2:
      return floats(report, "Vesk Algorithms Baseline:");
    case 0xE1:
      return fullReport(report);
    case 0xE2:
      return configuration(report);
    case 0xEC:
      return floats(report, "Noisy Pixel Thresholds:");
    default:
      return {};
  }
}

}  // namespace vesk::benchmarks
