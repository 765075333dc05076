// Captures made in memory, byte by byte, for the tests of the capture input; and what the reader makes of them.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "host/input/Capture.h"

namespace test {

using Bytes = std::string;

/// Appends numbers in one byte order.
class Writer {
 public:
  explicit Writer(bool bigEndian) : bigEndian_(bigEndian) {}
  Writer &number(std::uint64_t value, std::size_t width) {
    for (std::size_t i = 0; i < width; ++i)
      bytes_ += static_cast<char>(value >> 8 * (bigEndian_ ? width - 1 - i : i) & 0xFF);
    return *this;
  }
  Writer &u8(std::uint64_t value) { return number(value, 1); }
  Writer &u16(std::uint64_t value) { return number(value, 2); }
  Writer &u32(std::uint64_t value) { return number(value, 4); }
  Writer &u64(std::uint64_t value) { return number(value, 8); }
  Writer &bytes(std::string_view more) {
    bytes_ += more;
    return *this;
  }
  Writer &pad(std::size_t multiple) {
    while (bytes_.size() % multiple != 0) bytes_ += '\0';
    return *this;
  }
  const Bytes &done() const { return bytes_; }

 private:
  bool bigEndian_;
  Bytes bytes_;
};

/// One event of a USB transfer, before it is put into the form of a link type.
struct Event {
  bool complete = false;
  int transfer = 2;  // 1 interrupt, 2 control
  std::uint8_t endpoint = 0x80;
  std::uint64_t id = 0xFFFF888100000001;
  std::uint16_t bus = 1, device = 7;
  std::int32_t status = 0;
  Bytes setup;  // 8 bytes on a control submit
  Bytes data;
  std::uint32_t transferred = 0;  // when more was transferred than `data` holds
  int stage = -1;                 // USBPcap: when it is not the usual one
  char event = 0;                 // usbmon: when it is neither S nor C
  std::uint32_t requested = 7;    // usbmon: bytes that a submit asks for
  std::uint32_t microseconds = 1000;
};

inline Bytes setupBytes(unsigned type, unsigned request, unsigned value, unsigned index, unsigned length) {
  return Writer(false).u8(type).u8(request).u16(value).u16(index).u16(length).done();
}

/// GET_REPORT with the type as it is on the wire: 1 input, 3 feature.
inline Event getReport(unsigned wireType, unsigned id, unsigned length, std::uint64_t transferId = 0xFFFF888100000001) {
  Event event;
  event.id = transferId;
  event.setup = setupBytes(0xA1, 0x01, wireType << 8 | id, 0, length);
  return event;
}

inline Event answer(Bytes data, std::uint64_t transferId = 0xFFFF888100000001) {
  Event event;
  event.complete = true;
  event.id = transferId;
  event.data = std::move(data);
  return event;
}

inline Event inputData(Bytes data, std::uint8_t endpoint = 0x81) {
  Event event;
  event.complete = true;
  event.transfer = 1;
  event.endpoint = endpoint;
  event.id = 0xFFFF888100000002;
  event.data = std::move(data);
  return event;
}

inline Bytes usbmonRecord(const Event &event, bool mmapped, bool bigEndian) {
  const auto size = static_cast<std::uint32_t>(event.data.size());
  const std::uint32_t whole = event.transferred != 0 ? event.transferred : size;
  const bool in = (event.endpoint & 0x80) != 0;
  Writer out(bigEndian);
  out.u64(event.id).u8(static_cast<unsigned char>(event.event != 0 ? event.event : event.complete ? 'C' : 'S'));
  out.u8(static_cast<unsigned>(event.transfer)).u8(event.endpoint).u8(event.device).u16(event.bus);
  out.u8(event.setup.empty() ? '-' : 0);
  out.u8(size != 0 ? 0 : in ? '<' : '>');
  out.u64(1700000000).u32(event.microseconds).u32(static_cast<std::uint32_t>(event.complete ? event.status : -115));
  out.u32(event.complete ? whole : event.requested).u32(size);
  out.bytes(event.setup.empty() ? Bytes(8, '\0') : event.setup);
  if (mmapped) out.u32(0).u32(0).u32(in ? 0x200 : 0).u32(0);
  return out.bytes(event.data).done();
}

inline Bytes usbpcapRecord(const Event &event) {
  const bool control = event.transfer == 2;
  const auto size = event.setup.size() + (event.transferred != 0 ? event.transferred : event.data.size());
  Writer out(false);
  out.u16(control ? 28 : 27).u64(event.id).u32(static_cast<std::uint32_t>(event.status));
  out.u16(control ? event.complete ? 0x0008 : 0x001B : 0x0009).u8(event.complete ? 1 : 0);
  out.u16(event.bus).u16(event.device).u8(event.endpoint).u8(static_cast<unsigned>(event.transfer));
  out.u32(size);
  if (control) out.u8(static_cast<unsigned>(event.stage >= 0 ? event.stage : event.complete ? 3 : 0));
  return out.bytes(event.setup).bytes(event.data).done();
}

inline Bytes record(const Event &event, unsigned linkType, bool bigEndian) {
  return linkType == 249 ? usbpcapRecord(event) : usbmonRecord(event, linkType == 220, bigEndian);
}

/// How a capture is written.
struct Form {
  unsigned linkType = 220;
  bool bigEndian = false;
  bool nanoseconds = false;
  bool pcapng = false;

  Bytes head() const;
  Bytes packet(std::string_view bytes, std::uint64_t nanosecondsOfTime, std::uint64_t original = 0) const;
};

inline Bytes block(std::uint32_t type, std::string_view body, bool bigEndian) {
  const Bytes padded = Writer(bigEndian).bytes(body).pad(4).done();
  return Writer(bigEndian).u32(type).u32(padded.size() + 12).bytes(padded).u32(padded.size() + 12).done();
}

inline Bytes sectionBlock(bool bigEndian) {
  return block(0x0A0D0D0A, Writer(bigEndian).u32(0x1A2B3C4D).u16(1).u16(0).u64(UINT64_MAX).done(), bigEndian);
}

inline Bytes interfaceBlock(unsigned linkType, bool bigEndian, bool nanoseconds, std::uint32_t snapLength = 262144) {
  Writer body(bigEndian);
  body.u16(linkType).u16(0).u32(snapLength);
  if (nanoseconds) body.u16(9).u16(1).u8(9).pad(4).u16(0).u16(0);  // if_tsresol, end of options
  return block(1, body.done(), bigEndian);
}

inline Bytes packetBlock(unsigned interface, std::uint64_t time, std::string_view bytes, bool bigEndian) {
  Writer body(bigEndian);
  body.u32(interface).u32(time >> 32).u32(time & 0xFFFFFFFF).u32(bytes.size()).u32(bytes.size()).bytes(bytes);
  return block(6, body.done(), bigEndian);
}

inline Bytes Form::head() const {
  if (pcapng) return sectionBlock(bigEndian) + interfaceBlock(linkType, bigEndian, nanoseconds);
  Writer out(bigEndian);
  out.u32(nanoseconds ? 0xA1B23C4D : 0xA1B2C3D4).u16(2).u16(4).u32(0).u32(0).u32(262144).u32(linkType);
  return out.done();
}

inline Bytes Form::packet(std::string_view bytes, std::uint64_t time, std::uint64_t original) const {
  const std::uint64_t units = nanoseconds ? time : time / 1000;
  if (pcapng) return packetBlock(0, units, bytes, bigEndian);
  const std::uint64_t second = nanoseconds ? 1'000'000'000 : 1'000'000;
  Writer out(bigEndian);
  out.u32(units / second).u32(units % second).u32(bytes.size()).u32(original != 0 ? original : bytes.size());
  return out.bytes(bytes).done();
}

constexpr std::uint64_t kStartNs = 1'700'000'000'001'000'000;  // the first event
constexpr std::uint64_t kStepNs = 500'000;                     // from one to the next

inline Bytes capture(const std::vector<Event> &events, const Form &form = {}) {
  Bytes file = form.head();
  std::uint64_t time = kStartNs;
  for (const Event &event : events) {
    file += form.packet(record(event, form.linkType, form.bigEndian), time);
    time += kStepNs;
  }
  return file;
}

/// A report as it was handed over, with bytes of its own.
struct HandedOver {
  Bytes bytes;
  std::uint32_t id = 0;
  vesk::host::ReportType type{};
  bool typeGuessed = false;
  std::uint64_t packet = 0, index = 0;
  std::int64_t timeNs = -1;
  std::string device;
  std::uint32_t vendorProduct = 0;
};

struct Outcome : vesk::host::ReadSink {
  std::vector<HandedOver> reports;
  std::vector<vesk::host::Message> messages;

  void report(const vesk::host::SourceReport &given) override {
    EXPECT_EQ(given.file, "f");
    EXPECT_EQ(given.place.kind, vesk::host::Place::Kind::kPacket);
    reports.push_back({Bytes(given.bytes), given.id, given.type, given.typeGuessed, given.place.number, given.index,
                       given.timeNs.value_or(-1), std::string(given.device), given.vendorProduct.value_or(0)});
  }
  void message(vesk::host::Message given) override {
    EXPECT_EQ(given.file, "f");
    EXPECT_FALSE(given.text.empty());
    messages.push_back(std::move(given));
  }

  /// The codes of all messages but the summary, in order.
  std::vector<std::string> codes() const {
    std::vector<std::string> found;
    for (const auto &message : messages)
      if (message.kind->code != "capture-summary") found.emplace_back(message.kind->code);
    return found;
  }
  std::string summary() const {
    for (const auto &message : messages)
      if (message.kind->code == "capture-summary") return message.text;
    return {};
  }
  std::vector<Bytes> bytes() const {
    std::vector<Bytes> found;
    for (const HandedOver &found_ : reports) found.push_back(found_.bytes);
    return found;
  }
};

inline Outcome readBytes(Bytes file) {
  Outcome outcome;
  vesk::host::ByteSource source("f", std::move(file));
  vesk::host::readCapture(source, {}, outcome);
  return outcome;
}

inline Bytes hexBytes(std::string_view digits) {
  Bytes bytes;
  std::string pair;
  for (const char c : digits) {
    if (c == ' ' || c == '\n') continue;
    pair += c;
    if (pair.size() < 2) continue;
    bytes += static_cast<char>(std::stoi(pair, nullptr, 16));
    pair.clear();
  }
  return bytes;
}

/// A report of this ID and length, no two bytes in a row alike.
inline Bytes pattern(unsigned id, std::size_t length, unsigned seed = 0) {
  Bytes bytes(length, '\0');
  for (std::size_t i = 0; i < length; ++i) bytes[i] = static_cast<char>((i * 7 + i / 256 + seed) & 0xFF);
  bytes[0] = static_cast<char>(id);
  return bytes;
}

inline const Bytes kSummary = hexBytes("e00d0500214024");

}  // namespace test
