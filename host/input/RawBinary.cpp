// Reading of raw binary, and the last word on what no reader takes.
#include "host/input/RawBinary.h"

#include <algorithm>

#include "host/input/FoundReports.h"
#include "host/input/PlainText.h"
#include "host/input/ReportBorders.h"

namespace vesk::host {

namespace {

unsigned idAt(std::string_view bytes) {
  return static_cast<unsigned char>(bytes[0]);
}

std::uint64_t skipRest(ByteSource &source) {
  const std::uint64_t begin = source.offset();
  for (std::size_t size = 0; (size = source.peek().size()) != 0;) source.skip(size);
  return source.offset() - begin;
}

void readSplit(ByteSource &source, FoundReports &found) {
  for (;;) {
    const std::string_view bytes = source.peek(kMostReportBytes).substr(0, kMostReportBytes);
    if (bytes.empty()) return;
    const Place place = Place::offset(source.offset());
    const std::size_t length = reportLength(bytes);
    if (length == 0) {
      const unsigned id = idAt(bytes);
      const std::uint64_t rest = skipRest(source);
      found.say(kRawNoReportId, place,
                "no report of the controller has this ID, so its length is unknown; " + std::to_string(rest) +
                    (rest == 1 ? " byte was not read" : " bytes were not read"),
                id);
      return;
    }
    if (length == kMostReportBytes) {
      found.say(kRawTooLong, place, "the text does not end within 65536 bytes; the rest was not read", idAt(bytes));
      skipRest(source);
      return;
    }
    if (length == bytes.size()) source.checkEnd();  // it may be a part only
    found.addUntyped(bytes.substr(0, length), place);
    source.skip(length);
  }
}

void readOne(ByteSource &source, FoundReports &found) {
  const std::string_view bytes = source.peek(kMostReportBytes + 1);
  source.checkEnd();
  const Place place = Place::offset(0);
  if (bytes.empty()) return;
  if (bytes.size() > kMostReportBytes) {
    found.say(kRawTooLong, place,
              "more than 65536 bytes are no single report; --split reads reports that follow one another");
    skipRest(source);
    return;
  }
  if (const std::size_t count = countReports(bytes); count > 1)
    found.say(kRawManyReports, place,
              "read as one report; its bytes would make " + std::to_string(count) +
                  " reports one behind the other, as --split reads them");
  found.addUntyped(bytes, place);
  source.skip(bytes.size());
}

/// As some systems' shells write text into files. No report has an ID of these bytes.
bool isUtf16(std::string_view head) {
  return head.starts_with("\xFF\xFE") || head.starts_with("\xFE\xFF");
}

void read(ByteSource &source, const ReadOptions &options, ReadSink &sink) {
  FoundReports found(source, options, sink);
  if (!options.kindForced && isUtf16(source.peek(2))) {
    found.say(kUnknownInput, {}, "text in UTF-16, which is not read; save it as UTF-8");
    return;
  }
  if (!options.kindForced && isText(source.peek(kHeadSize).substr(0, kHeadSize))) {
    found.say(kUnknownInput, {},
              "a text of no known kind; accepted are hex text (as from xxd, hexdump -C, od -An -v -tx1), HID "
              "recordings, usbhid-dump output and usbmon text; --input-format names one");
    return;
  }
  if (options.split)
    readSplit(source, found);
  else
    readOne(source, found);
  found.finish("the bytes of a report, its ID first");
}

}  // namespace

// It stands at the end of the list of kinds and takes what nobody else does.
constinit const InputKind kRawBinary{"raw", "raw binary", [](std::string_view) { return true; }, read};

}  // namespace vesk::host
