// A recording as HID recorders write it, and our own line F: for feature reports, which their readers pass over.
#include "host/output/RecordingFormatter.h"

#include <map>

#include "host/output/JsonText.h"
#include "host/output/RecordingLine.h"
#include "host/report/KnownReports.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr MessageKind kNotRecordable{"not-recordable", Severity::kError, kExitFindings};
constexpr MessageKind kNegativeTime{"negative-time", Severity::kWarning, kExitOk};

void appendBytes(std::string &out, std::initializer_list<unsigned> bytes) {
  for (const unsigned byte : bytes) out += static_cast<char>(byte);
}

/// A report descriptor that declares the controller's reports, for those who replay the recording: most inputs do not
/// tell the device's own.
std::string reportDescriptor() {
  std::string descriptor;
  appendBytes(descriptor, {0x06, 0x00, 0xFF});                          // usage page: vendor-defined
  appendBytes(descriptor, {0x09, 0x01, 0xA1, 0x01});                    // usage, collection: application
  appendBytes(descriptor, {0x15, 0x00, 0x26, 0xFF, 0x00, 0x75, 0x08});  // bytes of 0 to 255
  for (const KnownReport &report : knownReports()) {
    const std::uint32_t count = report.length == KnownReport::Length::kText ? 255 : report.layoutSize - 1;
    appendBytes(descriptor, {0x85, report.id, 0x09, report.id, 0x96, count & 0xFF, count >> 8});
    appendBytes(descriptor, {report.type == ReportType::kInput ? 0x81u : 0xB1u, 0x02});
  }
  appendBytes(descriptor, {0xC0});
  return descriptor;
}

class RecordingFormatter : public Formatter {
 public:
  bool isStateless() const override { return false; }

  void begin(OutputBuffer &) override {
    devices_.clear();
    current_ = 0;
    lastMicroseconds_ = 0;
  }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &, bool,
              std::vector<Finding> &findings) override {
    if (report.type == ReportType::kOutput) {
      findings.push_back({&kNotRecordable, kNotRecordable.severity, "a recording has no line for output reports"});
      return;
    }
    turnTo(out, report);
    moveTime(report, findings);
    appendRecordingLine(out, report.type, lastMicroseconds_, report.bytes);
  }

 private:
  /// Says which device the next line is about, where it is not the same one as before. The first one needs no word
  /// unless others follow, and each is introduced when it first turns up.
  void turnTo(OutputBuffer &out, const SourceReport &report) {
    const auto [device, isNew] =
        devices_.try_emplace({std::string(report.device), report.vendorProduct}, devices_.size());
    if (device->second != current_) {
      out.append("D: ");
      appendNumber(out, std::uint64_t{device->second});
      out.append('\n');
    }
    current_ = device->second;
    if (isNew) appendHeader(out, report);
  }

  static void appendHeader(OutputBuffer &out, const SourceReport &report) {
    appendDescriptorLine(out, reportDescriptor());
    out.append("N: Vesk controller");
    if (!report.device.empty()) {
      out.append(", device ");
      out.append(report.device);
    }
    const std::uint32_t ids = report.vendorProduct.value_or(0);
    out.append(formatted<"\nI: %x %04x %04x\n">(report.bus, ids >> 16, ids & 0xFFFF));
  }

  /// A report without a time has that of the one before it, so that the order stays what it was.
  void moveTime(const SourceReport &report, std::vector<Finding> &findings) {
    if (!report.timeNs) return;
    if (*report.timeNs < 0)
      findings.push_back(
          {&kNegativeTime, kNegativeTime.severity, "its time is before the start of the input; recorded at the start"});
    lastMicroseconds_ = roundedMicroseconds(std::max<std::int64_t>(*report.timeNs, 0));
  }

  std::map<std::pair<std::string, std::optional<std::uint32_t>>, std::size_t> devices_;  // to their indexes
  std::size_t current_ = 0;
  std::int64_t lastMicroseconds_ = 0;
};

}  // namespace

std::unique_ptr<Formatter> makeRecordingFormatter(const FormatOptions &) {
  return std::make_unique<RecordingFormatter>();
}

}  // namespace vesk::host
