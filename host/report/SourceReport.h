// One report as an input gave it: its bytes, what it is, and where it was found.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace vesk::host {

/// In the plug-in's numbers. On the wire each is one more.
enum class ReportType : std::uint8_t { kInput = 0, kOutput = 1, kFeature = 2 };

constexpr std::string_view typeName(ReportType type) {
  constexpr std::string_view kNames[] = {"input", "output", "feature"};
  return kNames[static_cast<std::size_t>(type)];
}

/// Where in an input something stands, counted as its tools count: lines and packets from 1, offsets from 0.
struct Place {
  enum class Kind : std::uint8_t { kNone, kLine, kPacket, kOffset };
  Kind kind = Kind::kNone;
  std::uint64_t number = 0;

  static constexpr Place line(std::uint64_t number) { return {Kind::kLine, number}; }
  static constexpr Place packet(std::uint64_t number) { return {Kind::kPacket, number}; }
  static constexpr Place offset(std::uint64_t number) { return {Kind::kOffset, number}; }

  /// "12", "packet 17", "offset 792"; empty for none.
  std::string text() const;

  friend bool operator==(const Place &, const Place &) = default;
};

/// Borrows everything: the views live as long as the call that hands it over.
struct SourceReport {
  std::string_view bytes;  // the report ID first
  std::uint32_t id = 0;    // what was asked for; the first byte where nothing says otherwise
  ReportType type = ReportType::kFeature;
  bool typeGuessed = false;  // nothing in the input said the type, so the ID chose it
  std::string_view file;     // as the user named it
  Place place;
  std::uint64_t index = 0;             // of the report in its file, from 0
  std::optional<std::int64_t> timeNs;  // nanoseconds since the input's own zero
  std::string_view device;  // "1.7" for bus and address, "0" for a recording's device index; empty where unknown
  std::optional<std::uint32_t> vendorProduct;  // vendor << 16 | product, where the input tells
  std::uint32_t bus = kUsb;                    // in the kernel's numbers; all but recordings hold USB traffic

  static constexpr std::uint32_t kUsb = 3;
};

}  // namespace vesk::host
