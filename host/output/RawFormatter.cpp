// Raw output, which tells nothing but bytes, so that a reader has to know where each report ends.
#include "host/output/RawFormatter.h"

#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

/// More than one report, and a reader that goes by the IDs will not find where this one ends.
constexpr MessageKind kNoBorder{"raw-border", Severity::kWarning, kExitOk};

bool hasBorder(const SourceReport &report) {
  const KnownReport *known = findReport(report.id);
  if (known == nullptr || report.bytes.empty() || static_cast<unsigned char>(report.bytes[0]) != report.id)
    return false;
  return known->length != KnownReport::Length::kText && report.bytes.size() == known->layoutSize;
}

class RawFormatter : public Formatter {
 public:
  void report(OutputBuffer &out, const SourceReport &report, const Decoded &, bool,
              std::vector<Finding> &findings) override {
    out.append(report.bytes);
    if (!hasBorder(report))
      findings.push_back({&kNoBorder, kNoBorder.severity,
                          "its ID does not tell its length, so where more reports follow, --split will not find its "
                          "end; -o recording keeps it"});
  }
};

}  // namespace

std::unique_ptr<Formatter> makeRawFormatter(const FormatOptions &) {
  return std::make_unique<RawFormatter>();
}

}  // namespace vesk::host
