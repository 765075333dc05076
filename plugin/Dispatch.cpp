// From report ID to decoder: the two tables, the names in them, and the entry points that use them.
#include <array>
#include <new>
#include <stdexcept>
#include <string_view>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

using Decoder = ReportResult (HIDReportVeskPlugin::*)() const;

struct NamedDecoder {
  std::string_view name;
  Decoder decoder;
};

// One row a decoder, made so that its name and its function cannot disagree.
#define VESK_DECODER(name)            \
  NamedDecoder {                      \
#name, &HIDReportVeskPlugin::name \
  }
constexpr std::array kDecoders = {
    VESK_DECODER(parseVersion),
    VESK_DECODER(parseVersionExtended),
    VESK_DECODER(parseVeskImage),
    VESK_DECODER(parseAdcDumpPacket),
    VESK_DECODER(parseAdcDumpConfig),
    VESK_DECODER(parseAdcDumpState),
    VESK_DECODER(parseBlackBoxSummary),
    VESK_DECODER(parseBlackBoxFullReport),
    VESK_DECODER(parseBlackBoxConfig),
    VESK_DECODER(parseOpenShortTest),
    VESK_DECODER(parseOpenShortData),
    VESK_DECODER(parserVeskAlgBaselineRequest),
    VESK_DECODER(parserNoisyPixelThresholdsRequest),
    VESK_DECODER(parseWatchDogReport),
    VESK_DECODER(parsePowerModeStats),
};
#undef VESK_DECODER

struct TableRow {
  std::uint32_t reportId;
  std::string_view decoder;
};

constexpr TableRow kFeatureReports[] = {
    {0xD0, "parseVersion"},
    {0xD2, "parseVersionExtended"},
    {0xDC, "parseAdcDumpConfig"},
    {0xDE, "parseAdcDumpState"},
    {0xE0, "parseBlackBoxSummary"},
    {0xE1, "parseBlackBoxFullReport"},
    {0xEA, "parseBlackBoxFullReport"},
    {0xE2, "parseBlackBoxConfig"},
    {0xE3, "parseOpenShortTest"},
    {0xE4, "parseOpenShortData"},
    {0xE5, "parseOpenShortData"},
    {0xA2, "parserVeskAlgBaselineRequest"},
    {0xEC, "parserNoisyPixelThresholdsRequest"},
    {0xDF, "parseWatchDogReport"},
    {0xA9, "parsePowerModeStats"},
};

constexpr TableRow kInputReports[] = {
    {0x76, "parseVeskImage"},
    {0x77, "parseAdcDumpPacket"},
};

/// Null for a name that no decoder has. The row, not its function: g++ 12 cannot compare that one at compile time under
/// -fsanitize=undefined.
constexpr const NamedDecoder *resolve(std::string_view name) {
  for (const NamedDecoder &row : kDecoders)
    if (row.name == name) return &row;
  return nullptr;
}

template <std::size_t Size>
consteval bool allResolve(const TableRow (&table)[Size]) {
  for (const TableRow &row : table)
    if (resolve(row.decoder) == nullptr) return false;
  return true;
}
static_assert(allResolve(kFeatureReports) && allResolve(kInputReports));

template <std::size_t Size>
HIDReportVeskPlugin::ReportTable makeTable(const TableRow (&rows)[Size]) {
  HIDReportVeskPlugin::ReportTable table;
  for (const TableRow &row : rows) table.emplace(row.reportId, row.decoder);
  return table;
}

}  // namespace
}  // namespace vesk

HIDReportVeskPlugin::HIDReportVeskPlugin()
    : inputReportIds_(vesk::makeTable(vesk::kInputReports)), reportIds_(vesk::makeTable(vesk::kFeatureReports)) {
  // Six characters go, whatever the prefix: "parse" takes the first letter of the name with it, "parser" does not.
  for (const auto &[id, decoder] : reportIds_) reportIdNames_.emplace(id, decoder.substr(6));
}

HIDReportVeskPlugin::~HIDReportVeskPlugin() = default;

std::unique_ptr<HIDReportVeskPlugin> HIDReportVeskPlugin::init() noexcept {
  try {
    return std::unique_ptr<HIDReportVeskPlugin>(new HIDReportVeskPlugin);
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

ReportResult HIDReportVeskPlugin::runParser(const char *report, std::uint32_t reportID, std::int32_t type,
                                            std::int64_t length) {
  report_type_ = static_cast<std::uint32_t>(type);
  report_buf_ = report;
  report_id_ = reportID;
  report_len_ = length;

  if (report_type_ != kFeatureReport && report_type_ != kInputReport) return {};
  const ReportTable &table = report_type_ == kFeatureReport ? reportIds_ : inputReportIds_;
  const auto row = table.find(reportID);
  if (row == table.end()) return {};

  const vesk::NamedDecoder *named = vesk::resolve(row->second);
  if (named == nullptr) throw std::invalid_argument("HIDReportVeskPlugin: no decoder is named " + row->second);
  return (this->*named->decoder)();
}

bool HIDReportVeskPlugin::parseReport(const char *report, std::uint32_t reportID, std::int32_t type,
                                      std::int64_t length) {
  useStrings_ = true;  // and it stays true: only parseArgs returns the object to object mode
  const ReportResult result = runParser(report, reportID, type, length);
  return printStrings(std::get_if<DisplayLines>(&result));
}

ReportResult HIDReportVeskPlugin::reportToObject(const char *report, std::uint32_t reportID, std::int32_t type,
                                                 std::int64_t length) {
  return runParser(report, reportID, type, length);
}
