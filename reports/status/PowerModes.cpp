// Power mode statistics, feature 0xA9: time spent in each power mode and how often it was entered.
#include <array>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

struct Record {
  U32 timeMs;
  U32 timesEntered;
};

/// The modes' records lie one behind the other, time and count together, though both forms list all times first.
struct Layout {
  U8 reportId;
  std::array<Record, 6> modes;
};
static_assert(sizeof(Layout) == 49);

struct Mode {
  const char *column;  // the name in 20 columns
  Key timeKey;
  Key countKey;
};
constexpr std::array<Mode, 6> kModes = {{
    {"INIT                ", "INIT time ms", "INIT times entered"},
    {"ACTIVE              ", "ACTIVE time ms", "ACTIVE times entered"},
    {"TIMEOUT             ", "TIMEOUT time ms", "TIMEOUT times entered"},
    {"READY               ", "READY time ms", "READY times entered"},
    {"LIGHT_SLEEP_EXITING ", "LIGHT_SLEEP_EXITING time ms", "LIGHT_SLEEP_EXITING times entered"},
    {"LIGHT_SLEEP         ", "LIGHT_SLEEP time ms", "LIGHT_SLEEP times entered"},
}};

DisplayLines toLines(const Layout &r) {
  DisplayLines out(15, 768);
  out.add("Power Mode Statistics - Total Time:");
  for (std::size_t m = 0; m < kModes.size(); ++m) out.line<"%s: %12u ms">(kModes[m].column, r.modes[m].timeMs);
  out.add("");
  out.add("Power Mode Statistics - Number of Times Entered:");
  for (std::size_t m = 0; m < kModes.size(); ++m) out.line<"%s: %u">(kModes[m].column, r.modes[m].timesEntered);
  return out;
}

ReportValue toValue(const Layout &r) {
  Dictionary out(2 * kModes.size());
  for (std::size_t m = 0; m < kModes.size(); ++m) out.add(kModes[m].timeKey, u32(r.modes[m].timeMs));
  for (std::size_t m = 0; m < kModes.size(); ++m) out.add(kModes[m].countKey, u32(r.modes[m].timesEntered));
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parsePowerModeStats() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}
