// Open/short test of the sensor panel: the fault masks (feature 0xE3) and the data behind them (features 0xE4, 0xE5).
#include <array>
#include <cstddef>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr int kPositions = 48;  // of the panel; the masks are wider, and what is above is not drawn
constexpr std::uint32_t kSamples = 48;

struct TestLayout {
  U8 reportId;
  U64 shortTxPos, shortTxNeg, shortBoth;
  U64 openTxPos, openTxNeg, openBoth;
  U64 weakOs;
};
static_assert(sizeof(TestLayout) == 57);

struct DataLayout {
  U8 reportId;
  U64 saturation;
  std::array<U32, kSamples> samplesI, samplesQ;
  U8 brownoutFlags;  // bit 0: a brownout occurred
  std::array<U8, 7> unused;
};
static_assert(sizeof(DataLayout) == 401 && offsetof(DataLayout, samplesQ) == 201 &&
              offsetof(DataLayout, brownoutFlags) == 393);

struct Fault {
  const char *label;  // a tab and ten columns
  Key key;
  U64 TestLayout::*mask;
};
constexpr Fault kFaults[] = {
    {"\tShort TX+ ", "SHORT_TX_POS", &TestLayout::shortTxPos},
    {"\tShort TX- ", "SHORT_TX_NEG", &TestLayout::shortTxNeg},
    {"\tShort BOTH", "SHORT_BOTH", &TestLayout::shortBoth},
    {"\tOpen  TX+ ", "OPEN_TX_POS", &TestLayout::openTxPos},
    {"\tOpen  TX- ", "OPEN_TX_NEG", &TestLayout::openTxNeg},
    {"\tOpen  BOTH", "OPEN_BOTH", &TestLayout::openBoth},
    {"\tWeak  O/S ", "WEAK_OS", &TestLayout::weakOs},
};

/// The mask as "X" and ".", position 47 first, a blank before every eight.
std::array<char, kPositions / 8 * 9> drawMask(std::uint64_t mask) {
  std::array<char, kPositions / 8 * 9> drawn;
  char *out = drawn.data();
  for (int position = kPositions; position-- > 0;) {
    if (position % 8 == 7) *out++ = ' ';
    *out++ = (mask >> position & 1) != 0 ? 'X' : '.';
  }
  return drawn;
}

void addMask(DisplayLines &lines, const char *label, std::uint64_t mask) {
  const auto drawn = drawMask(mask);
  lines.line<"%s %s">(label, std::string_view(drawn.data(), drawn.size()));
}

DisplayLines toLines(const TestLayout &r) {
  DisplayLines out(10, 768);
  out.add("Open/Short Test Results:");
  out.add("");
  out.add("\t                  40       32       24       16        8        0");
  for (const Fault &fault : kFaults) addMask(out, fault.label, r.*fault.mask);
  return out;
}

ReportValue toValue(const TestLayout &r) {
  Dictionary out(std::size(kFaults));
  for (const Fault &fault : kFaults) out.add(fault.key, u64(r.*fault.mask));
  return ReportValue(std::move(out));
}

DisplayLines toLines(const HIDReportVeskPlugin &plugin, const DataLayout &r) {
  const char *scan = plugin.report_id() == 0xE4 ? "D-SCAN" : "P-SCAN";
  const char *format = plugin.displayDecimal() ? "%14d " : "%08x ";
  DisplayLines out(22, 2560);
  out.line<"Open/Short Test %s Data:">(scan);
  out.add("");
  out.add("                       40       32       24       16        8        0");
  addMask(out, "ADC Saturation ", r.saturation);
  out.add("");
  out.line<"Brownout: %s">((r.brownoutFlags & 1) != 0 ? "YES" : "NO");
  out.add("");
  out.line<"[%s I]">(scan);
  plugin.addArrayUint32(out, r.samplesI.data(), kSamples, format);
  out.add("");
  out.line<"[%s Q]">(scan);
  plugin.addArrayUint32(out, r.samplesQ.data(), kSamples, format);
  return out;
}

/// Without the scan's name: a consumer knows it from the report ID that it asked for.
ReportValue toValue(const HIDReportVeskPlugin &plugin, const DataLayout &r) {
  Dictionary out(4);
  out.add("SATURATION_DATA", u64(r.saturation));
  out.add("BROWNOUT", u8(r.brownoutFlags & 1));
  out.add("SCAN_DATA_I", plugin.arrayWithUint32Array(r.samplesI.data(), kSamples));
  out.add("SCAN_DATA_Q", plugin.arrayWithUint32Array(r.samplesQ.data(), kSamples));
  return ReportValue(std::move(out));
}

}  // namespace
}  // namespace vesk

std::string HIDReportVeskPlugin::printOSTResult(const char *label, std::uint64_t result) const {
  const auto drawn = vesk::drawMask(result);
  return vesk::formatted<"%s %s">(label, std::string_view(drawn.data(), drawn.size()));
}

ReportResult HIDReportVeskPlugin::parseOpenShortTest() const {
  const auto report = vesk::read<vesk::TestLayout>(report_buf_);
  if (useStrings_) return vesk::toLines(report);
  return vesk::toValue(report);
}

ReportResult HIDReportVeskPlugin::parseOpenShortData() const {
  const auto report = vesk::read<vesk::DataLayout>(report_buf_);
  if (useStrings_) return vesk::toLines(*this, report);
  return vesk::toValue(*this, report);
}
