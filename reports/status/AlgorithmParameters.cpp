// Algorithm parameters: the baseline (feature 0xA2) and the noisy-pixel thresholds (feature 0xEC), 48 floats each.
#include <array>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr std::uint32_t kValues = 48;

struct Layout {
  U8 reportId;
  std::array<F32, kValues> values;
};
static_assert(sizeof(Layout) == 193);

DisplayLines toLines(const HIDReportVeskPlugin &plugin, const Layout &r, std::string_view title) {
  DisplayLines out(9, 18432);
  out.add(title);
  out.add("");
  plugin.addArrayFloat(out, r.values.data(), kValues, "% -13.3f ");
  out.add("");
  return out;
}

ReportValue toValue(const HIDReportVeskPlugin &plugin, const Layout &r, Key key) {
  Dictionary out(1);
  out.add(key, plugin.arrayWithFloatArray(r.values.data(), kValues));
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parserVeskAlgBaselineRequest() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(*this, report, "Vesk Algorithms Baseline:");
  return vesk::toValue(*this, report, "BASELINE");
}

ReportResult HIDReportVeskPlugin::parserNoisyPixelThresholdsRequest() const {
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(*this, report, "Noisy Pixel Thresholds:");
  return vesk::toValue(*this, report, "NOISY_PIXEL_THRESHOLDS");
}
