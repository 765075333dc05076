// What a report is, and where it was found.
#include "host/output/ReportHeading.h"

#include "host/report/KnownReports.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

void appendReportName(OutputBuffer &out, const SourceReport &report) {
  out.append(typeName(report.type));
  out.append(formatted<" 0x%02X">(report.id));
  if (const KnownReport *known = findReport(report.id)) {
    out.append(' ');
    out.append(known->name);
  }
  out.append(formatted<", %llu ">(std::uint64_t{report.bytes.size()}));
  out.append(report.bytes.size() == 1 ? "byte" : "bytes");
}

void appendHeading(OutputBuffer &out, const SourceReport &report) {
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
  appendReportName(out, report);
  out.append('\n');
}

}  // namespace vesk::host
