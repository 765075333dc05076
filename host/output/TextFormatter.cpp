// Text output, with a header line before each report where it is asked for.
#include "host/output/TextFormatter.h"

#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

class TextFormatter : public Formatter {
 public:
  explicit TextFormatter(bool headers) : headers_(headers) {}

  bool wantsLines() const override { return true; }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &decoded, bool,
              std::vector<Finding> &) override {
    if (headers_) header(out, report);
    if (!decoded.lines) return;
    out.append('\n');
    out.append(decoded.lines->text());
    out.append('\n');
  }

 private:
  // "== s.pcapng:packet 17 3.000412 s, device 1.7: feature 0xE3 open-short-result, 57 bytes"
  static void header(OutputBuffer &out, const SourceReport &report) {
    out.append("== ");
    out.append(report.file);
    if (const std::string place = report.place.text(); !place.empty()) {
      out.append(':');
      out.append(place);
    }
    if (report.timeNs) out.append(formatted<" %.6f s">(static_cast<double>(*report.timeNs) * 1e-9));
    if (!report.device.empty()) {
      out.append(", device ");
      out.append(report.device);
    }
    out.append(": ");
    out.append(typeName(report.type));
    out.append(formatted<" 0x%02X">(report.id));
    if (const KnownReport *known = findReport(report.id)) {
      out.append(' ');
      out.append(known->name);
    }
    out.append(", " + std::to_string(report.bytes.size()) + (report.bytes.size() == 1 ? " byte\n" : " bytes\n"));
  }

  bool headers_;
};

}  // namespace

std::unique_ptr<Formatter> makeTextFormatter(const FormatOptions &options) {
  return std::make_unique<TextFormatter>(options.headers);
}

}  // namespace vesk::host
