// Raw output, which tells nothing but bytes, so that a reader has to know where each report ends.
#include "host/output/RawFormatter.h"

#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

/// More than one report, and a reader that goes by the IDs will not find where this one ends.
constexpr MessageKind kNoBorder{"raw-border", Severity::kWarning, kExitOk};

bool hasBorder(const SourceReport &report) {
  const KnownReport *known = findReport(report.id);
  const std::string_view bytes = report.bytes;
  if (known == nullptr || bytes.empty() || static_cast<unsigned char>(bytes[0]) != report.id) return false;
  if (known->length != KnownReport::Length::kText) return bytes.size() == known->layoutSize;
  const std::size_t textEnd = bytes.find('\0', 1);  // a text ends with its zero and those that pad it
  return textEnd != std::string_view::npos && bytes.find_first_not_of('\0', textEnd) == std::string_view::npos;
}

class RawFormatter : public Formatter {
 public:
  void report(OutputBuffer &out, const SourceReport &report, const Decoded &, bool,
              std::vector<Finding> &findings) override {
    out.append(report.bytes);
    if (!hasBorder(report))
      findings.push_back({&kNoBorder, kNoBorder.severity,
                          "where another report follows it, --split will not find its end; -o recording keeps it"});
  }
};

}  // namespace

std::unique_ptr<Formatter> makeRawFormatter(const FormatOptions &) {
  return std::make_unique<RawFormatter>();
}

}  // namespace vesk::host
