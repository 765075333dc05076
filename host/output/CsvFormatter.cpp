// One header for all samples, whatever a run holds: a cell stays empty where its report has no such quantity.
#include "host/output/CsvFormatter.h"

#include "host/output/JsonText.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

constexpr MessageKind kNoCsv{"no-csv", Severity::kError, kExitFindings};

constexpr std::string_view kHeader =
    "file,index,time,device,report,number,channel,d_scan_i,d_scan_q,p_scan_i,p_scan_q,payload,i,q,value\n";
constexpr std::size_t kQuantities = 8;  // the columns behind "channel"

/// The samples of one report: which of its arrays go to which column, and what counts its frames or packets.
struct Samples {
  std::uint32_t id;
  std::string_view number;  // empty for reports that are not counted
  std::size_t firstColumn;  // the arrays fill the columns from there on
  std::array<std::string_view, 4> arrays;
};
constexpr Samples kSamples[] = {
    {0x76, "FRAME_NUMBER", 0, {"D_SCAN_I", "D_SCAN_Q", "P_SCAN_I", "P_SCAN_Q"}},
    {0x77, "PACKET_ID", 4, {"PAYLOAD_DATA"}},
    {0xE4, "", 5, {"SCAN_DATA_I", "SCAN_DATA_Q"}},
    {0xE5, "", 5, {"SCAN_DATA_I", "SCAN_DATA_Q"}},
    {0xA2, "", 7, {"BASELINE"}},
    {0xEC, "", 7, {"NOISY_PIXEL_THRESHOLDS"}},
};

const Samples *findSamples(std::uint32_t id) {
  for (const Samples &samples : kSamples)
    if (samples.id == id) return &samples;
  return nullptr;
}

/// As RFC 4180 has it: in quotes where a comma, a quote or a line end would be taken for its own.
void appendField(OutputBuffer &out, std::string_view text) {
  const std::string clean = asUtf8(text);
  if (clean.find_first_of(",\"\r\n") == std::string::npos) return out.append(clean);
  out.append('"');
  for (const char c : clean) {
    if (c == '"') out.append('"');
    out.append(c);
  }
  out.append('"');
}

/// Element `index` of an array; NaN and the infinities by the names that readers of CSV know.
void appendElement(OutputBuffer &out, const ReportValue &array, std::size_t index) {
  std::visit(
      [&]<class T>(const T &numbers) {
        if constexpr (std::is_same_v<T, std::vector<float>>) {
          char *const begin = out.room(kTextNumberRoom);
          out.advanceTo(std::to_chars(begin, begin + kTextNumberRoom, numbers[index]).ptr);
        } else if constexpr (std::is_same_v<T, std::vector<std::uint32_t>> ||
                             std::is_same_v<T, std::vector<std::int32_t>>) {
          appendNumber(out, numbers[index]);
        }
      },
      array.variant());
}

/// The cells that are the same in every row of a report, from "file" to "number", each with its comma.
void appendPrefix(OutputBuffer &out, const SourceReport &report, const Samples &samples, const ReportValue &value) {
  appendField(out, report.file);
  out.append(',');
  appendNumber(out, report.index);
  out.append(',');
  if (report.timeNs) appendSeconds(out, *report.timeNs);
  out.append(',');
  appendField(out, report.device);
  out.append(',');
  out.append(findReport(report.id)->name);
  out.append(',');
  if (!samples.number.empty()) appendNumber(out, value.at(samples.number).as<std::uint32_t>());
  out.append(',');
}

std::string treeText(const KnownReport &report) {
  std::string text = std::string(report.name) + " is a tree of values, not samples; -o jsonl shows it (csv takes ";
  for (const Samples &samples : kSamples) {
    if (&samples != kSamples) text += ", ";
    text += findReport(samples.id)->name;
  }
  return text + ")";
}

class CsvFormatter : public Formatter {
 public:
  bool wantsValue() const override { return true; }

  void begin(OutputBuffer &out) override { out.append(kHeader); }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &decoded, bool,
              std::vector<Finding> &findings) override {
    if (!decoded.value) return;  // the decoder has said why
    const Samples *samples = findSamples(report.id);
    if (samples == nullptr) {
      findings.push_back({&kNoCsv, kNoCsv.severity, treeText(*findReport(report.id))});
      return;
    }
    OutputBuffer prefix;
    appendPrefix(prefix, report, *samples, *decoded.value);
    rows(out, prefix.text(), *samples, *decoded.value);
  }

 private:
  static void rows(OutputBuffer &out, std::string_view prefix, const Samples &samples, const ReportValue &value) {
    std::array<const ReportValue *, kQuantities> columns{};
    for (std::size_t i = 0; i < samples.arrays.size() && !samples.arrays[i].empty(); ++i)
      columns[samples.firstColumn + i] = &value.at(samples.arrays[i]);
    const std::size_t channels = columns[samples.firstColumn]->size();
    for (std::size_t channel = 0; channel < channels; ++channel) {
      out.append(prefix);
      appendNumber(out, std::uint64_t{channel});
      for (const ReportValue *column : columns) {
        out.append(',');
        if (column != nullptr) appendElement(out, *column, channel);
      }
      out.append('\n');
    }
  }
};

}  // namespace

std::unique_ptr<Formatter> makeCsvFormatter(const FormatOptions &) {
  return std::make_unique<CsvFormatter>();
}

}  // namespace vesk::host
