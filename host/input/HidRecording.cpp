// Reading of HID recordings, line by line, as any of the recorders writes them.
#include "host/input/HidRecording.h"

#include <map>

#include "host/input/FoundReports.h"
#include "host/input/PlainText.h"

namespace vesk::host {

namespace {

constexpr std::size_t kMostDevices = 256;

struct Device {
  std::string name = "0";
  std::optional<std::uint32_t> vendorProduct;
  std::uint32_t bus = SourceReport::kUsb;
  std::int64_t lastNs = 0;
};

class RecordingReader {
 public:
  RecordingReader(ByteSource &source, const ReadOptions &options, ReadSink &sink)
      : source_(source), found_(source, options, sink), device_(&devices_[0]) {}

  void read() {
    std::string_view line;
    while (source_.nextLine(line)) {
      if (++number_ == 1) line = withoutMark(line);
      takeLine(line);
    }
    found_.finish("lines E: with input reports or F: with feature reports");
  }

 private:
  Place here() const { return Place::line(number_); }

  void takeLine(std::string_view line) {
    std::string_view word = line;
    word = takeWord(word);
    if (word.empty() || word[0] == '#') return;
    const char record = word.size() >= 2 && word[1] == ':' ? line[line.find(word)] : '\0';
    const std::string_view rest = line.substr(line.find(word) + std::min<std::size_t>(word.size(), 2));
    switch (record) {
      case 'E':
        return takeReport(rest, ReportType::kInput);
      case 'F':
        return takeReport(rest, ReportType::kFeature);
      case 'D':
        return takeDevice(rest);
      case 'I':
        return takeIds(rest);
      case 'B':
        return found_.say(kBeforeFilter, here(), "a report before a filter program changed it is not decoded");
      case 'R':  // the report descriptor, the name and the place: nothing that decoding needs
      case 'N':
      case 'P':
        return;
      default:
        return found_.say(kUnknownLine, here(),
                          "a line of no known kind was passed over; D, R, N, P, I, E, F and B are known");
    }
  }

  void bad(std::string text) { found_.say(kBadInput, here(), std::move(text)); }

  void takeDevice(std::string_view rest) {
    const auto index = parseNumber(takeWord(rest), 10);
    if (!index || *index > 0xFFFF) return bad("D: the index of a device was expected");
    if (devices_.size() == kMostDevices && !devices_.contains(*index)) {
      found_.say(kTooManyDevices, here(), "more than 256 devices; what follows is taken as of device " + device_->name);
      return;
    }
    device_ = &devices_[*index];
    device_->name = std::to_string(*index);
  }

  void takeIds(std::string_view rest) {
    const auto bus = parseNumber(takeWord(rest), 16), vendor = parseNumber(takeWord(rest), 16),
               product = parseNumber(takeWord(rest), 16);
    if (!bus || !vendor || !product || *bus > 0xFFFF || *vendor > 0xFFFF || *product > 0xFFFF)
      return bad("I: bus, vendor and product as hexadecimal numbers were expected");
    device_->bus = static_cast<std::uint32_t>(*bus);
    device_->vendorProduct = static_cast<std::uint32_t>(*vendor << 16 | *product);
  }

  void takeReport(std::string_view rest, ReportType type) {
    const std::string_view time = takeWord(rest), length = takeWord(rest);
    const auto count = parseNumber(length, 10);
    if (!count || time.find('.') == std::string_view::npos)
      return bad("the time in seconds and the length were expected, as in \"E: 000000.004120 7 e0 0d\"");
    bytes_.clear();
    const std::string_view wrong = takeBytes(rest, bytes_);
    if (!wrong.empty()) return bad("\"" + std::string(wrong.substr(0, 24)) + "\" is no byte of two hexadecimal digits");
    if (bytes_.size() != *count)
      return found_.say(kLengthMismatch, here(),
                        "the line says " + std::string(length.substr(0, 24)) + " bytes and has " +
                            std::to_string(bytes_.size()) + "; not decoded");
    if (bytes_.empty()) return bad("the report has no bytes");
    if (bytes_.size() > kMostReportBytes) return bad("the report has more than 65536 bytes");
    SourceReport report;
    report.bytes = bytes_;
    report.id = static_cast<unsigned char>(bytes_[0]);
    report.type = type;
    report.place = here();
    report.timeNs = parseSeconds(time);
    report.device = device_->name;
    report.vendorProduct = device_->vendorProduct;
    report.bus = device_->bus;
    judgeTime(report, time);
    found_.add(report);
  }

  void judgeTime(const SourceReport &report, std::string_view time) {
    if (!report.timeNs)
      return found_.say(kBadTime, here(), "\"" + std::string(time.substr(0, 24)) + "\" is no time; the report has none",
                        report.id);
    if (*report.timeNs < device_->lastNs)
      found_.say(kTimeBackwards, here(), "the time goes back; the clock may have started again", report.id);
    device_->lastNs = *report.timeNs;
  }

  ByteSource &source_;
  FoundReports found_;
  std::map<std::uint64_t, Device> devices_;
  Device *device_;  // what the lines are about
  std::string bytes_;
  std::uint64_t number_ = 0;
};

/// A recording begins with one of its records, or with a report descriptor in comments, which may fill the head.
bool matches(std::string_view head) {
  if (!isText(head)) return false;
  head = withoutMark(head);
  bool descriptor = false;
  for (std::string_view line; takeLine(head, line);) {
    std::string_view rest = line;
    const std::string_view word = takeWord(rest);
    if (word.empty()) continue;
    if (word[0] != '#')
      return word.size() == 2 && word[1] == ':' && std::string_view("RDNIEFB").find(word[0]) != std::string_view::npos;
    descriptor = descriptor || (line.starts_with("# 0x") && line.find(" // ") != std::string_view::npos);
  }
  return descriptor;
}

void read(ByteSource &source, const ReadOptions &options, ReadSink &sink) {
  RecordingReader(source, options, sink).read();
}

}  // namespace

constinit const InputKind kHidRecording{"hid-recording", "HID recording", matches, read};

}  // namespace vesk::host
