// Black box summary, feature 0xE0: severity, module count, and one bit per module that has something recorded.
#include <array>
#include <cstddef>

#include "plugin/HIDReportVeskPlugin.h"
#include "reports/blackbox/Catalogue.h"
#include "reports/blackbox/OptionByte.h"

namespace vesk {
namespace {

struct Layout {
  U8 reportId;
  U8 severity;
  U16 moduleCount;
  std::array<U8, 3> presence;  // bit n of byte k is the module with index 8 * k + n; the last two bits are no module's
};
static_assert(sizeof(Layout) == 7 && offsetof(Layout, presence) == 4);

std::uint8_t isPresent(const Layout &r, ModuleIndex module) {
  return u8(r.presence[module / 8] >> module % 8 & 1);
}

DisplayLines toLines(const Layout &r) {
  DisplayLines out(26, 2048);
  out.add("--Black Box Summary--");
  out.line<"Severity Level: %s">(levelName(r.severity & kLevelMask).text());
  out.line<"Module Count:   %i">(r.moduleCount);
  out.add("");
  for (const ModuleIndex module : kSummaryOrder)
    out.line<"%20s: %i">(kCatalogue[module].name.text(), isPresent(r, module));
  return out;
}

ReportValue toValue(const Layout &r) {
  Dictionary out(2 + kModules);
  out.add("SEVERITY_LEVEL", u8(r.severity));  // whole, where the line shows its three low bits
  out.add("MODULE_COUNT", u16(r.moduleCount));
  for (const ModuleIndex module : kSummaryOrder) out.add(kCatalogue[module].name, isPresent(r, module));
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseBlackBoxSummary() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}
