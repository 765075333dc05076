// A comment with what is known of a report, its bytes in lines of sixteen, and an empty line.
#include "host/output/HexFormatter.h"

#include "host/output/JsonText.h"
#include "host/output/ReportHeading.h"

namespace vesk::host {

namespace {

constexpr std::size_t kBytesALine = 16;

/// "# feature 0xE3 open-short-result, 57 bytes, 3.000412 s, device 1.7"
void appendComment(OutputBuffer &out, const SourceReport &report) {
  out.append("# ");
  appendReportName(out, report);
  if (report.timeNs) {
    out.append(", ");
    appendSeconds(out, *report.timeNs);
    out.append(" s");
  }
  if (!report.device.empty()) {
    out.append(", device ");
    out.append(report.device);
  }
  out.append('\n');
}

class HexFormatter : public Formatter {
 public:
  void report(OutputBuffer &out, const SourceReport &report, const Decoded &, bool, std::vector<Finding> &) override {
    appendComment(out, report);
    for (std::size_t at = 0; at < report.bytes.size(); at += kBytesALine)
      appendLine(out, report.bytes.substr(at, kBytesALine));
    out.append('\n');
  }

 private:
  static void appendLine(OutputBuffer &out, std::string_view bytes) {
    char *end = out.room(3 * bytes.size());
    for (const char byte : bytes) {
      end = writeHex(end, static_cast<unsigned char>(byte), 2, true);
      *end++ = ' ';
    }
    end[-1] = '\n';
    out.advanceTo(end);
  }
};

}  // namespace

std::unique_ptr<Formatter> makeHexFormatter(const FormatOptions &) {
  return std::make_unique<HexFormatter>();
}

}  // namespace vesk::host
