// Watchdog report, feature 0xDF: how often and when the watchdog was fed.
#include <cstddef>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

struct Layout {
  U8 reportId;
  U32 feedCount;
  U64 feedTimestamp;
  U32 registerValue;
  U32 wake;
  U32 sleep;
};
static_assert(sizeof(Layout) == 25 && offsetof(Layout, feedTimestamp) == 5 && offsetof(Layout, registerValue) == 13);

/// Seconds, for a timestamp in microseconds. In single precision throughout, as the firmware's own tools compute it, so
/// it carries about seven digits: 1250999896491 gives 1250999.875.
double wallclock(const Layout &r) {
  const float seconds = static_cast<float>(std::uint64_t{r.feedTimestamp}) * 1e-6f;
  return double{seconds};
}

DisplayLines toLines(const Layout &r) {
  DisplayLines out(7, 768);
  out.add("Watchdog Data:");
  out.line<"    Feed Count:%u">(r.feedCount);
  out.line<"Feed Timestamp:0x%016llX">(r.feedTimestamp);
  out.line<"Feed Wallclock:%15.3f">(wallclock(r));
  out.line<"      Register:0x%08X">(r.registerValue);
  out.line<"          Wake:%u">(r.wake);
  out.line<"         Sleep:%u">(r.sleep);
  return out;
}

ReportValue toValue(const Layout &r) {
  Dictionary out(6);
  out.add("Count", u32(r.feedCount));
  out.add("Timestamp",
          i64(static_cast<std::int64_t>(std::uint64_t{r.feedTimestamp})));  // signed here, unsigned on screen
  out.add("Wallclock", wallclock(r));
  out.add("Register", u32(r.registerValue));
  out.add("Wake", u32(r.wake));
  out.add("Idle", u32(r.sleep));  // "Sleep" on screen
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseWatchDogReport() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}
