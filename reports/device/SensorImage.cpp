// Sensor image, input 0x76: one frame of samples of both scans, and the temperature.
#include <array>
#include <cstddef>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr std::uint32_t kSamples = 48;
using Samples = std::array<I32, kSamples>;

struct Layout {
  U8 reportId;
  U8 cookie;
  U16 flags;
  U32 frameNumber;
  U32 frameParams;
  U32 timestampMs;
  Samples dScanI, dScanQ, pScanI, pScanQ;
  U32 tmonParams;
  F32 tmonDegC;
};
static_assert(sizeof(Layout) == 792);
static_assert(offsetof(Layout, dScanI) == 16 && offsetof(Layout, pScanI) == 400 && offsetof(Layout, tmonParams) == 784);

struct Block {
  std::string_view heading;
  Key key;
  Samples Layout::*samples;
};
constexpr Block kBlocks[] = {
    {"[D-SCAN I]", "D_SCAN_I", &Layout::dScanI},
    {"[D-SCAN Q]", "D_SCAN_Q", &Layout::dScanQ},
    {"[P-SCAN I]", "P_SCAN_I", &Layout::pScanI},
    {"[P-SCAN Q]", "P_SCAN_Q", &Layout::pScanQ},
};

DisplayLines toLines(const HIDReportVeskPlugin &plugin, const Layout &r) {
  const char *format = plugin.displayDecimal() ? "%14d " : "%08x ";
  DisplayLines out(40, 5120);
  out.line<"[Frame # = %u]">(r.frameNumber);
  out.line<"[Frame Params = 0x%08x]">(r.frameParams);
  out.line<"[Timestamp = %u ms]">(r.timestampMs);
  out.line<"[TMON = %f degC]">(r.tmonDegC);
  out.line<"[TMON Params = 0x%08x]">(r.tmonParams);
  out.line<"[Cookie = 0x%02x]">(r.cookie);
  out.line<"[Flags = 0x%04x]">(r.flags);
  out.add("");
  for (const Block &block : kBlocks) {
    out.add(block.heading);
    plugin.addArrayInt32(out, (r.*block.samples).data(), kSamples, format);
    out.add("");
  }
  return out;
}

ReportValue toValue(const HIDReportVeskPlugin &plugin, const Layout &r) {
  Dictionary out(11);
  out.add("FRAME_NUMBER", u32(r.frameNumber));
  out.add("FRAME_PARAMS", u32(r.frameParams));
  out.add("TIMESTAMP_MS", u32(r.timestampMs));
  out.add("TMON_DEG_C", float(r.tmonDegC));
  out.add("TMON_PARAMS", u32(r.tmonParams));
  out.add("COOKIE", u8(r.cookie));
  out.add("FLAGS", u16(r.flags));
  for (const Block &block : kBlocks)
    out.add(block.key, plugin.arrayWithInt32Array((r.*block.samples).data(), kSamples));
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

ReportResult HIDReportVeskPlugin::parseVeskImage() const {
  if (report_len_ != sizeof(vesk::Layout)) return {};
  const auto report = vesk::read<vesk::Layout>(report_buf_);
  if (useStrings_) return vesk::toLines(*this, report);
  return vesk::toValue(*this, report);
}
