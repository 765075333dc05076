// Option bytes to words and to a dictionary.
#include "reports/blackbox/OptionByte.h"

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr std::uint8_t kMasked = 0x08, kGpio = 0x30, kMessage = 0x40, kBreakpoint = 0x80;
constexpr std::string_view kGpioWords[] = {"", "GPIO_0 ", "GPIO_1 ", "GPIO_2 "};  // a number, not two flags

/// The words stand in this order, which is not that of their bits.
constexpr FlagText flagText(unsigned option) {
  FlagText text;
  text.append((option & kMasked) != 0 ? "MASKED " : "");
  text.append((option & kMessage) != 0 ? "MESSAGE " : "");
  text.append(kGpioWords[(option & kGpio) >> 4]);
  text.append((option & kBreakpoint) != 0 ? "BREAKPOINT " : "");
  if (text.size == 0) text.append("(no options set)");
  return text;
}

}  // namespace

constexpr std::array<TextBlock<16>, kLevelMask + 1> kLevelTexts = []() {
  std::array<TextBlock<16>, kLevelMask + 1> texts;
  for (std::size_t level = 0; level < texts.size(); ++level) {
    texts[level].append(levelName(static_cast<std::uint8_t>(level)).text());
    texts[level].append(" ");
  }
  return texts;
}();

constexpr std::array<FlagText, 32> kFlagTexts = []() {
  std::array<FlagText, 32> texts;
  for (unsigned flags = 0; flags < texts.size(); ++flags) texts[flags] = flagText(flags << kFlagShift);
  return texts;
}();

}  // namespace vesk

void HIDReportVeskPlugin::errorLevelToString(std::uint8_t level, const char **levelStr) const {
  *levelStr = vesk::levelName(level).text().data();  // of a literal, so a zero ends it
}

std::string HIDReportVeskPlugin::blackBoxOptionToString(std::uint8_t option, const char *eventName,
                                                        bool printLevel) const {
  if (printLevel)
    return vesk::formatted<"%40s: %s%s">(eventName, vesk::kLevelTexts[option & vesk::kLevelMask],
                                         vesk::kFlagTexts[option >> vesk::kFlagShift]);
  return vesk::formatted<"%40s:  %s">(eventName, vesk::kFlagTexts[option >> vesk::kFlagShift]);
}

ReportValue HIDReportVeskPlugin::blackBoxOptionToDict(std::uint8_t option) const {
  vesk::Dictionary out(2);
  vesk::addOption(out, option);
  return ReportValue(std::move(out));
}
