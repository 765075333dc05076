// The device's own header in place of the one that is made up where an input does not tell the device.
#include "host/device/DeviceRecording.h"

#include <unistd.h>

#include "host/device/OpenDevice.h"
#include "host/device/UdevRule.h"
#include "host/output/RecordingLine.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

std::string hostName() {
  char name[256] = {};
  return ::gethostname(name, sizeof(name) - 1) == 0 ? name : "";
}

std::string timeText(std::time_t time) {
  char text[32] = {};
  std::tm parts{};
  ::gmtime_r(&time, &parts);
  std::strftime(text, sizeof(text), "%Y-%m-%dT%H:%M:%SZ", &parts);
  return text;
}

class DeviceRecordingFormatter : public Formatter {
 public:
  /// Not to be written, but what does not decode is to be told while the device is still there.
  bool wantsValue() const override { return true; }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &, bool, std::vector<Finding> &) override {
    appendRecordingLine(out, report.type, roundedMicroseconds(report.timeNs.value_or(0)), report.bytes);
  }
};

}  // namespace

std::string recordingHeader(const DeviceIdentity &device, bool identity, std::time_t now) {
  std::string header = "# vesk-report " VESK_REPORT_VERSION ", " + timeText(now);
  if (identity) header += ", on " + printable(hostName());
  header += "\n# Bus " + busName(device.bus) + ", device " + idsText(device);
  if (identity && !device.serial.empty()) header += ", serial " + printable(device.serial);
  header += '\n';

  OutputBuffer descriptor;
  appendDescriptorLine(descriptor, device.descriptor);
  header += descriptor.text();
  header += "N: " + printable(device.name) + "\n";
  if (identity && !device.physicalPath.empty()) header += "P: " + printable(device.physicalPath) + "\n";
  header += formatted<"I: %x %04x %04x\n">(device.bus, std::uint32_t{device.vendor}, std::uint32_t{device.product});
  return header;
}

std::string failureComment(std::uint32_t id, const Finding &problem) {
  return formatted<"# F 0x%02X ">(id) + std::string(severityName(problem.severity)) + " " +
         std::string(problem.kind->code) + ": " + printable(problem.text) + "\n";
}

std::unique_ptr<Formatter> makeDeviceRecordingFormatter() {
  return std::make_unique<DeviceRecordingFormatter>();
}

}  // namespace vesk::host
