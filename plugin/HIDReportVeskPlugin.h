// The plug-in: decodes the Vesk controller's vendor reports into display lines or into a tree of values.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "plugin/PaddedReport.h"
#include "values/DisplayLines.h"
#include "values/PluginError.h"
#include "values/ReportValue.h"

/// What a decoder returns: nothing, the lines of string mode, or the value of object mode. The caller owns it.
using ReportResult = std::variant<std::monostate, DisplayLines, ReportValue>;

/// The names of the ten configuration blobs.
extern "C" __attribute__((visibility("default"))) const char *const blob_names[10];

/// One object decodes one report at a time; it must not be used from two threads at once, but any number of objects
/// may.
///
/// THE READING CONTRACT. Only the two input reports look at the length that comes with them (0x76 is exactly 792 bytes
/// long, 0x77 exactly 2064, and nothing else is decoded). Every feature decoder reads its fixed offsets whatever the
/// length. So behind the pointer that a host hands over, kReadableBytes bytes must be readable, and the text of a
/// version report must end in a zero byte within what is readable. PaddedReport keeps both promises.
///
/// Exceptions: std::out_of_range where an extended version has fewer than six lines, std::invalid_argument where a text
/// is not UTF-8 or a table names a decoder that does not exist, std::bad_alloc. No partial result escapes, and nothing
/// is printed then.
class __attribute__((visibility("default"))) HIDReportVeskPlugin {
 public:
  /// Report ID to decoder name.
  using ReportTable = std::map<std::uint32_t, std::string>;
  /// Configuration keys ("Decimal", "UseStrings") to switches.
  using Configuration = std::map<std::string, bool>;

  enum ReportType : std::uint32_t { kInputReport = 0, kOutputReport = 1, kFeatureReport = 2 };

  /// The initialised object, both flags false; empty where memory for its tables could not be had.
  static std::unique_ptr<HIDReportVeskPlugin> init() noexcept;
  HIDReportVeskPlugin(const HIDReportVeskPlugin &) = delete;
  HIDReportVeskPlugin &operator=(const HIDReportVeskPlugin &) = delete;
  ~HIDReportVeskPlugin();

  // Entry points.

  /// Takes the options of a command line, every argument of it; true when all were accepted. Otherwise the flags stay
  /// as they were and the error's description is printed as one line on standard output.
  bool parseArgs(std::int32_t argc, const char *const *argv);
  /// Decodes and prints; true when something was printed. Leaves the object in string mode.
  bool parseReport(const char *report, std::uint32_t reportID, std::int32_t type, std::int64_t length);
  /// Decodes in whatever mode the object is in. The result does not refer to `report`.
  ReportResult reportToObject(const char *report, std::uint32_t reportID, std::int32_t type, std::int64_t length);
  ReportResult runParser(const char *report, std::uint32_t reportID, std::int32_t type, std::int64_t length);

  // Options.

  /// Null where an argument is no option; `error`, where there is a place for one, then says which.
  std::optional<Configuration> argsToConfig(const std::vector<std::string> &arguments, PluginError *error) const;
  /// Sets both flags from the dictionary, a missing key being false. Always true; `error` is never written.
  bool configParser(const Configuration &configuration, PluginError *error);

  // Output helpers. `data` points to `dataLength` little-endian numbers at any address; `format` is a printf format
  // with one conversion for such a number.

  /// Appends lines of eight values each, the last one of what is left; one empty line for no values at all.
  void addArrayUint32(DisplayLines &lines, const void *data, std::uint32_t dataLength, const char *format) const;
  void addArrayInt32(DisplayLines &lines, const void *data, std::uint32_t dataLength, const char *format) const;
  void addArrayFloat(DisplayLines &lines, const void *data, std::uint32_t dataLength, const char *format) const;
  ReportValue arrayWithUint32Array(const void *data, std::uint32_t length) const;
  ReportValue arrayWithInt32Array(const void *data, std::uint32_t length) const;
  ReportValue arrayWithFloatArray(const void *data, std::uint32_t length) const;
  /// Writes an empty line, the lines and another empty line to stdout; for null nothing, and returns false.
  bool printStrings(const DisplayLines *lines) const;

  // Decoders of the current report, by the names that the tables use.

  ReportResult parseVersion() const;
  ReportResult parseVersionExtended() const;
  ReportResult parseVeskImage() const;
  ReportResult parseAdcDumpPacket() const;
  ReportResult parseAdcDumpConfig() const;
  ReportResult parseAdcDumpState() const;
  ReportResult parseBlackBoxSummary() const;
  ReportResult parseBlackBoxFullReport() const;
  ReportResult parseBlackBoxConfig() const;
  ReportResult parseOpenShortTest() const;
  ReportResult parseOpenShortData() const;
  ReportResult parserVeskAlgBaselineRequest() const;
  ReportResult parserNoisyPixelThresholdsRequest() const;
  ReportResult parseWatchDogReport() const;
  ReportResult parsePowerModeStats() const;

  // Pieces of the black-box and open/short reports that stand for themselves. Texts end in a zero and are never null.

  /// Stores the name of a severity level, a constant; "UNKNOWN" above 5.
  void errorLevelToString(std::uint8_t level, const char **levelStr) const;
  /// One display line for an event option byte.
  std::string blackBoxOptionToString(std::uint8_t option, const char *eventName, bool printLevel) const;
  /// The dictionary "ERROR_LEVEL", "OPTIONS_RAW" for an event option byte.
  ReportValue blackBoxOptionToDict(std::uint8_t option) const;
  /// One display line for a fault mask: bits 47 to 0 in groups of eight.
  std::string printOSTResult(const char *label, std::uint64_t result) const;

  // Fields: the two flags, the tables, and the report that was handed over last, even one that nothing decodes.

  bool displayDecimal() const { return displayDecimal_; }
  void setDisplayDecimal(bool value) { displayDecimal_ = value; }
  bool useStrings() const { return useStrings_; }
  void setUseStrings(bool value) { useStrings_ = value; }
  std::uint32_t report_type() const { return report_type_; }
  void setReport_type(std::uint32_t value) { report_type_ = value; }
  std::uint32_t report_id() const { return report_id_; }
  void setReport_id(std::uint32_t value) { report_id_ = value; }
  /// Short names of the feature reports, made by init.
  const ReportTable &reportIdNames() const { return reportIdNames_; }
  /// Borrowed for the length of one entry-point call; never copied, never freed.
  const char *report_buf() const { return report_buf_; }
  void setReport_buf(const char *value) { report_buf_ = value; }
  std::int64_t report_len() const { return report_len_; }
  void setReport_len(std::int64_t value) { report_len_ = value; }
  const ReportTable &inputReportIds() const { return inputReportIds_; }
  void setInputReportIds(ReportTable value) { inputReportIds_ = std::move(value); }
  const ReportTable &reportIds() const { return reportIds_; }
  void setReportIds(ReportTable value) { reportIds_ = std::move(value); }

 private:
  HIDReportVeskPlugin();

  bool displayDecimal_ = false;
  bool useStrings_ = false;
  std::uint32_t report_type_ = 0;
  std::uint32_t report_id_ = 0;
  ReportTable reportIdNames_;
  const char *report_buf_ = nullptr;
  std::int64_t report_len_ = 0;
  ReportTable inputReportIds_;
  ReportTable reportIds_;
};
