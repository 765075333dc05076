// Text output, with a header line before each report where it is asked for.
#include "host/output/TextFormatter.h"

#include "host/output/ReportHeading.h"

namespace vesk::host {

namespace {

class TextFormatter : public Formatter {
 public:
  explicit TextFormatter(bool headers) : headers_(headers) {}

  bool wantsLines() const override { return true; }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &decoded, bool,
              std::vector<Finding> &) override {
    if (headers_) appendHeading(out, report);
    if (!decoded.lines) return;
    out.append('\n');
    out.append(decoded.lines->text());
    out.append('\n');
  }

 private:
  bool headers_;
};

}  // namespace

std::unique_ptr<Formatter> makeTextFormatter(const FormatOptions &options) {
  return std::make_unique<TextFormatter>(options.headers);
}

}  // namespace vesk::host
