// Option bytes to words and to a dictionary.
#include "reports/blackbox/OptionByte.h"

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr std::uint8_t kMasked = 0x08, kGpio = 0x30, kMessage = 0x40, kBreakpoint = 0x80;
constexpr std::uint8_t kFlags = kMasked | kGpio | kMessage | kBreakpoint;
constexpr std::string_view kGpioWords[] = {"", "GPIO_0 ", "GPIO_1 ", "GPIO_2 "};  // a number, not two flags

/// What "%s %s%s%s%s%s" makes of the level's name and the words, or "%s%s%s%s%s" of the words alone. The words stand in
/// this order, which is not that of their bits, and each flag's ends in a blank.
constexpr OptionText optionText(std::uint8_t option, bool withLevel) {
  OptionText text;
  if (withLevel) {
    text.append(levelName(option & kLevelMask));
    text.append(" ");
  }
  text.append((option & kMasked) != 0 ? "MASKED " : "");
  text.append((option & kMessage) != 0 ? "MESSAGE " : "");
  text.append(kGpioWords[(option & kGpio) >> 4]);
  text.append((option & kBreakpoint) != 0 ? "BREAKPOINT " : "");
  text.append((option & kFlags) == 0 ? "(no options set)" : "");
  return text;
}

consteval std::array<OptionText, 256> optionTexts(bool withLevel) {
  std::array<OptionText, 256> texts;
  for (unsigned option = 0; option < texts.size(); ++option)
    texts[option] = optionText(static_cast<std::uint8_t>(option), withLevel);
  return texts;
}

}  // namespace

constexpr std::array<OptionText, 256> kOptionWithLevel = optionTexts(true);
constexpr std::array<OptionText, 256> kOptionWithoutLevel = optionTexts(false);

void addOption(EntryAdder out, std::uint8_t option) {
  out.addText("ERROR_LEVEL", levelName(option & kLevelMask));
  out.add("OPTIONS_RAW", i32(option));  // whole: a consumer takes the flags out of it
}

}  // namespace vesk

void HIDReportVeskPlugin::errorLevelToString(std::uint8_t level, const char **levelStr) const {
  *levelStr = vesk::levelName(level).data();  // of a literal, so a zero ends it
}

std::string HIDReportVeskPlugin::blackBoxOptionToString(std::uint8_t option, const char *eventName,
                                                        bool printLevel) const {
  if (printLevel) return vesk::formatted<"%40s: %s">(eventName, vesk::kOptionWithLevel[option]);
  return vesk::formatted<"%40s:  %s">(eventName, vesk::kOptionWithoutLevel[option]);
}

ReportValue HIDReportVeskPlugin::blackBoxOptionToDict(std::uint8_t option) const {
  vesk::Dictionary out(2);
  vesk::addOption(out, option);
  return ReportValue(std::move(out));
}
