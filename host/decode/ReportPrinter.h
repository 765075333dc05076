// One thread's decoder and the formatter that it feeds.
#pragma once

#include <vector>

#include "host/decode/Decoder.h"
#include "host/output/Formatter.h"

namespace vesk::host {

class ReportPrinter {
 public:
  ReportPrinter(Formatter &formatter, bool decimal, bool lenient)
      : formatter_(formatter), decoder_({formatter.wantsLines(), formatter.wantsValue(), decimal, lenient}) {}

  /// Appends the report to `out` in the formatter's form, and what there is to say about it to `messages`.
  void print(const SourceReport &report, bool first, OutputBuffer &out, std::vector<Message> &messages) {
    const Decoded &decoded = decoder_.decode(report);
    findings_.clear();
    formatter_.report(out, report, decoded, first, findings_);
    for (const Finding &finding : decoded.findings) messages.push_back(about(report, finding));
    for (const Finding &finding : findings_) messages.push_back(about(report, finding));
  }

 private:
  static Message about(const SourceReport &report, const Finding &finding) {
    return {finding.kind, std::string(report.file), report.place, report.id, finding.text};
  }

  Formatter &formatter_;
  Decoder decoder_;
  std::vector<Finding> findings_;  // the form's own
};

}  // namespace vesk::host
