// Reading of usbmon text: finding the answer to each request.
#include "host/input/UsbmonText.h"

#include <map>
#include <set>

#include "host/input/FoundReports.h"
#include "host/input/HidRecording.h"
#include "host/input/PlainText.h"
#include "host/input/UsbFindings.h"
#include "host/input/UsbmonTextEvent.h"
#include "host/report/KnownReports.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr std::size_t kMostRequests = 4096;  // that may wait for an answer; hardly ever are there two
constexpr std::size_t kMostDevices = 1024;

class UsbmonReader {
 public:
  UsbmonReader(ByteSource &source, const ReadOptions &options, ReadSink &sink)
      : source_(source), options_(options), found_(source, options, sink) {}

  void read() {
    std::string_view line;
    while (source_.nextLine(line)) {
      if (++number_ == 1) line = withoutMark(line);
      takeLine(line);
    }
    for (const auto &[key, request] : requests_) unanswered(request);
    if (others_ + written_ != 0)
      found_.say(kUsbmonSummary, {},
                 std::to_string(others_) + " transfers hold no report of the controller, " + std::to_string(written_) +
                     " sent one, which is not decoded");
    found_.finish("answers to GET_REPORT");
  }

 private:
  Place here() const { return Place::line(number_); }

  void takeLine(std::string_view line) {
    std::string_view words = line;
    if (const std::string_view word = takeWord(words); word.empty() || word[0] == '#') return;
    const auto event = parseUsbmonEvent(line);
    if (!event)
      return found_.say(kUnknownLine, here(),
                        "no event of usbmon, which has a tag, a time, S, C or E, and an address as Ci:1:007:0");
    followClock(event->microseconds);
    if (event->step == 'S')
      submit(*event);
    else
      complete(*event);
  }

  /// The clock may also go back a little, where events come from two processors.
  void followClock(std::uint32_t microseconds) {
    if (lastMicroseconds_) elapsed_ += static_cast<std::int32_t>(microseconds - *lastMicroseconds_);
    lastMicroseconds_ = microseconds;
  }

  void submit(const UsbmonEvent &event) {
    const Key key{event.bus, event.tag};
    if (const auto old = requests_.find(key); old != requests_.end()) {  // tags are used again
      unanswered(old->second);
      requests_.erase(old);
    }
    if (event.transfer != 'C') return;
    auto request = parseUsbmonRequest(event.rest);
    if (!request) return;
    request->line = number_;
    if (request->kind == UsbRequest::kSetReport) ++written_;
    if (request->kind != UsbRequest::kGetReport && request->kind != UsbRequest::kGetDescriptor) return;
    if (requests_.size() == kMostRequests) {
      for (const auto &[other, waiting] : requests_) unanswered(waiting);
      requests_.clear();
    }
    requests_[key] = *request;
  }

  void unanswered(const UsbRequest &request) {
    if (request.kind == UsbRequest::kGetReport)
      found_.say(kUnansweredRead, Place::line(request.line), "asked for, but no answer follows", request.reportId());
  }

  void complete(const UsbmonEvent &event) {
    std::optional<UsbRequest> request;
    if (const auto stored = requests_.find({event.bus, event.tag}); stored != requests_.end()) {
      request = stored->second;
      requests_.erase(stored);
    }
    if (!event.in) return;
    if (event.transfer != 'C' && event.transfer != 'I') {
      ++others_;
      return;
    }

    std::string_view rest = event.rest;
    std::string_view statusWord = takeWord(rest);
    const std::string_view status = takeUsbmonPart(statusWord);
    const auto length = parseNumber(takeWord(rest), 10);
    const bool isReport = request && request->kind == UsbRequest::kGetReport;
    if (status != "0" || event.step == 'E') {
      if (isReport)
        found_.say(kFailedRead, here(),
                   "the device did not give this report: status " + std::string(status.substr(0, 12)),
                   request->reportId());
      return;
    }
    if (!length) return found_.say(kBadInput, here(), "the length of the data was expected behind the status");
    bytes_.clear();
    const bool shown = takeWord(rest) == "=";
    if (shown && !takeData(rest)) return found_.say(kBadInput, here(), "the data are no pairs of hexadecimal digits");
    if (bytes_.size() > *length)
      return found_.say(kBadInput, here(),
                        "the line says " + std::to_string(*length) + " bytes and has " + std::to_string(bytes_.size()));
    if (isReport)
      takeReport(event, *request, *length);
    else if (request)
      takeDescriptor(event, *request);
    else
      takeUnasked(event, *length);
  }

  bool takeData(std::string_view rest) {
    for (std::string_view word = takeWord(rest); !word.empty(); word = takeWord(rest)) {
      if (word.size() % 2 != 0) return false;
      for (; !word.empty(); word.remove_prefix(2))
        if (!takeBytes(word.substr(0, 2), bytes_).empty()) return false;
    }
    return true;
  }

  void takeReport(const UsbmonEvent &event, const UsbRequest &request, std::uint64_t length) {
    const std::uint32_t id = request.reportId();
    const std::uint64_t wireType = request.value >> 8;  // one more than the plug-in's
    if (wireType < 1 || wireType > 3)
      return found_.say(kBadInput, here(),
                        "a report of type " + std::to_string(wireType) + " was asked for; 1, 2 and 3 exist", id);
    if (length == 0) return found_.say(kEmptyRead, here(), "asked for, answered with 0 bytes", id);
    if (!bytes_.empty() && static_cast<unsigned char>(bytes_[0]) != id)
      found_.say(kWrongReportId, here(),
                 "the answer begins with " + formatted<"0x%02X">(unsigned{static_cast<unsigned char>(bytes_[0])}) +
                     ", not with this ID; its bytes are decoded as what was asked for",
                 id);
    else if (findReport(id) != nullptr && ours_.size() < kMostDevices)
      ours_.insert({event.bus, event.device});
    hand(event, id, static_cast<ReportType>(wireType - 1), false, length);
  }

  /// Data without a request that was seen: an input report, or an answer to what was asked before the recording began.
  void takeUnasked(const UsbmonEvent &event, std::uint64_t length) {
    const KnownReport *known = bytes_.empty() ? nullptr : findReport(static_cast<unsigned char>(bytes_[0]));
    const bool input = event.transfer == 'I';
    if (input && known != nullptr && known->type == ReportType::kInput && length < known->layoutSize &&
        (length >= kLargePiece || ours_.contains({event.bus, event.device}))) {
      ++others_;
      return found_.say(
          kIncompleteReport, here(),
          std::to_string(length) + " of " + std::to_string(known->layoutSize) +
              " bytes came in this transfer; reports in pieces are put together from a pcap alone, as from "
              "'tcpdump -i usbmon" +
              std::to_string(event.bus) + " -w FILE'",
          known->id);
    }
    if (known == nullptr || length < known->layoutSize || (input && known->type != ReportType::kInput)) {
      if (length != 0) ++others_;
      return;
    }
    hand(event, known->id, input ? ReportType::kInput : typeOf(known->id, options_), !input && !options_.forcedType,
         length);
  }

  void hand(const UsbmonEvent &event, std::uint32_t id, ReportType type, bool guessed, std::uint64_t length) {
    if (bytes_.size() < length)
      return found_.say(kCutData, here(),
                        "truncated by usbmon's text interface: " + std::to_string(bytes_.size()) + " of " +
                            std::to_string(length) +
                            " bytes, as it shows no more than 32; not decoded; use a pcap, as from "
                            "'tcpdump -i usbmon" +
                            std::to_string(event.bus) + " -w FILE'",
                        id);
    device_ = (event.bus == 0 ? "" : std::to_string(event.bus) + ".") + std::to_string(event.device);
    SourceReport report;
    report.bytes = bytes_;
    report.id = id;
    report.type = type;
    report.typeGuessed = guessed;
    report.place = here();
    report.timeNs = elapsed_ * 1000;
    report.device = device_;
    if (const auto ids = ids_.find({event.bus, event.device}); ids != ids_.end()) report.vendorProduct = ids->second;
    found_.add(report);
  }

  /// The device descriptor tells vendor and product.
  void takeDescriptor(const UsbmonEvent &event, const UsbRequest &request) {
    constexpr std::uint64_t kDeviceDescriptor = 0x0100;
    if (request.value != kDeviceDescriptor || bytes_.size() < 12 || ids_.size() == kMostDevices) return;
    const auto byte = [&](std::size_t at) {
      return static_cast<std::uint32_t>(static_cast<unsigned char>(bytes_[at]));
    };
    ids_[{event.bus, event.device}] = byte(9) << 24 | byte(8) << 16 | byte(11) << 8 | byte(10);
  }

  using Key = std::pair<std::uint64_t, std::uint64_t>;

  ByteSource &source_;
  const ReadOptions &options_;
  FoundReports found_;
  std::map<Key, UsbRequest> requests_;  // by bus and tag
  std::map<Key, std::uint32_t> ids_;    // vendor and product by bus and device
  std::set<Key> ours_;                  // the devices that have answered as the controller does
  std::string bytes_, device_;
  std::optional<std::uint32_t> lastMicroseconds_;
  std::int64_t elapsed_ = 0;  // microseconds since the first event
  std::uint64_t number_ = 0;
  std::uint64_t others_ = 0, written_ = 0;
};

bool matches(std::string_view head) {
  if (!isText(head)) return false;
  head = withoutMark(head);
  for (std::string_view line; takeLine(head, line);)
    if (parseUsbmonEvent(line)) return true;
  return false;
}

void read(ByteSource &source, const ReadOptions &options, ReadSink &sink) {
  UsbmonReader(source, options, sink).read();
}

}  // namespace

constinit const InputKind kUsbmonText{"usbmon-text", "usbmon text", matches, read};

}  // namespace vesk::host
