// Reading of usbhid-dump's output, and putting together the reports that are longer than a transfer.
#include "host/input/UsbhidDump.h"

#include <map>
#include <tuple>
#include <utility>

#include "host/input/FoundReports.h"
#include "host/input/HidRecording.h"
#include "host/input/InputAssembly.h"
#include "host/input/PlainText.h"
#include "host/input/UsbFindings.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

constexpr std::size_t kMostInterfaces = 256;

struct Header {
  std::uint64_t bus, device, interface;
  bool stream;  // else the report descriptor
  std::string_view time;
};

/// "002:003:000:STREAM             1290272185.210022"
std::optional<Header> parseHeader(std::string_view line) {
  constexpr std::size_t kAddress = 12;  // "002:003:000:"
  if (line.size() <= kAddress || line[3] != ':' || line[7] != ':' || line[11] != ':') return {};
  const auto bus = parseNumber(line.substr(0, 3), 10), device = parseNumber(line.substr(4, 3), 10),
             interface = parseNumber(line.substr(8, 3), 10);
  std::string_view rest = line.substr(kAddress);
  const std::string_view entity = takeWord(rest), time = takeWord(rest);
  if (!bus || !device || !interface || (entity != "STREAM" && entity != "DESCRIPTOR") || !parseSeconds(time) ||
      time.find('.') == std::string_view::npos || !takeWord(rest).empty())
    return {};
  return Header{*bus, *device, *interface, entity == "STREAM", time};
}

struct Interface {
  std::string device;      // "2.3"
  InputAssembly assembly;  // the report that is under way
};

class DumpReader {
 public:
  DumpReader(ByteSource &source, const ReadOptions &options, ReadSink &sink)
      : source_(source), found_(source, options, sink) {}

  void read() {
    std::string_view line;
    while (source_.nextLine(line)) {
      if (++number_ == 1) line = withoutMark(line);
      takeLine(line);
    }
    endChunk();
    for (auto &[address, interface] : interfaces_) giveUp(interface, "the input ends");
    if (others_ != 0)
      found_.say(kOtherTransfers, {},
                 std::to_string(others_) + " transfers begin with no input report ID of the controller");
    found_.finish("STREAM chunks that begin with an input report ID of the controller");
  }

 private:
  void takeLine(std::string_view line) {
    if (line.empty()) return;
    if (const auto header = parseHeader(line)) {
      endChunk();
      beginChunk(*header);
    } else if (isBlank(line[0])) {
      takeData(line);
    } else {  // what the program says while it runs lands in the file of those who copy the screen
      found_.say(kUnknownLine, Place::line(number_),
                 "a line that is neither a chunk's header nor its data was passed over");
    }
  }

  void beginChunk(const Header &header) {
    inChunk_ = true;
    stream_ = header.stream;
    chunk_.clear();
    chunkLine_ = number_;
    if (!stream_) return;
    const std::int64_t time = *parseSeconds(header.time);
    if (!zero_) zero_ = time;
    chunkTime_ = time - *zero_;
    const auto [interface, isNew] = interfaces_.try_emplace({header.bus, header.device, header.interface});
    interface_ = &interface->second;
    if (isNew) interface_->device = std::to_string(header.bus) + "." + std::to_string(header.device);
    if (interfaces_.size() > kMostInterfaces) {
      found_.say(kTooManyDevices, Place::line(number_), "more than 256 interfaces; this one is left out");
      interfaces_.erase(interface);
      stream_ = false;
    }
  }

  void takeData(std::string_view line) {
    if (!inChunk_)
      return found_.say(kUnknownLine, Place::line(number_), "data without a header before them were passed over");
    if (!stream_) return;
    const std::string_view wrong = takeBytes(line, chunk_);
    if (wrong.empty() && chunk_.size() <= kMostReportBytes) return;
    found_.say(kBadInput, Place::line(number_),
               wrong.empty() ? "the chunk has more than 65536 bytes; not decoded"
                             : "\"" + std::string(wrong.substr(0, 24)) +
                                   "\" is no byte of two hexadecimal digits; the chunk is not decoded");
    giveUp(*interface_, "a damaged chunk follows");
    inChunk_ = stream_ = false;
  }

  void endChunk() {
    if (std::exchange(inChunk_, false) && stream_) takeChunk(*interface_);
  }

  /// A chunk goes on with the report that is under way, unless its length says that it cannot.
  void takeChunk(Interface &interface) {
    InputAssembly &assembly = interface.assembly;
    if (assembly.isActive()) {
      if (assembly.append(chunk_)) {
        if (!assembly.isWhole()) return;
        hand(interface, assembly.bytes(), assembly.packet(), assembly.timeNs());
        return assembly.end();
      }
      giveUp(interface, "the next chunk has " + std::to_string(chunk_.size()) + " bytes, so it is no continuation");
    }
    if (chunk_.empty()) return;
    const KnownReport *known = findReport(static_cast<unsigned char>(chunk_[0]));
    if (known == nullptr || known->type != ReportType::kInput)
      ++others_;
    else if (chunk_.size() >= known->layoutSize)
      hand(interface, chunk_, chunkLine_, chunkTime_);
    else
      assembly.begin(*known, chunk_, chunkLine_, chunkTime_);
  }

  void hand(const Interface &interface, std::string_view bytes, std::uint64_t line,
            std::optional<std::int64_t> timeNs) {
    SourceReport report;
    report.bytes = bytes;
    report.id = static_cast<unsigned char>(bytes[0]);
    report.type = ReportType::kInput;
    report.place = Place::line(line);
    report.timeNs = timeNs;
    report.device = interface.device;
    found_.add(report);
  }

  void giveUp(Interface &interface, const std::string &why) {
    InputAssembly &assembly = interface.assembly;
    if (!assembly.isActive()) return;
    found_.say(kIncompleteReport, Place::line(assembly.packet()),
               std::to_string(assembly.bytes().size()) + " bytes came, " +
                   std::to_string(assembly.report().layoutSize) + " expected: " + why + "; not decoded",
               assembly.report().id);
    assembly.end();
  }

  ByteSource &source_;
  FoundReports found_;
  std::map<std::tuple<std::uint64_t, std::uint64_t, std::uint64_t>, Interface> interfaces_;
  Interface *interface_ = nullptr;  // the one that the chunk is of, where it is a stream
  bool inChunk_ = false, stream_ = false;
  std::string chunk_;
  std::uint64_t chunkLine_ = 0;
  std::int64_t chunkTime_ = 0;
  std::optional<std::int64_t> zero_;
  std::uint64_t number_ = 0;
  std::uint64_t others_ = 0;
};

bool matches(std::string_view head) {
  if (!isText(head)) return false;
  head = withoutMark(head);
  for (std::string_view line; takeLine(head, line);)
    if (parseHeader(line)) return true;
  return false;
}

void read(ByteSource &source, const ReadOptions &options, ReadSink &sink) {
  DumpReader(source, options, sink).read();
}

}  // namespace

constinit const InputKind kUsbhidDump{"usbhid-dump", "usbhid-dump text", matches, read};

}  // namespace vesk::host
