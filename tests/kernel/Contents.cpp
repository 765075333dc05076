// Contents of the emulated controller: plausible, different in every field, and the same at every run.
#include "Contents.h"

#include <array>
#include <bit>
#include <stdexcept>
#include <string_view>

namespace vesk::bench {
namespace {

constexpr std::size_t kChannels = 48;

// Events per black box module, in the order of the modules in the report.
constexpr std::array<std::uint8_t, 22> kEventCounts = {5, 10, 6, 1,  4,  7, 7, 7,  7, 7, 7,
                                                       7, 7,  7, 17, 79, 2, 9, 26, 3, 1, 7};

class Writer {
 public:
  explicit Writer(std::uint8_t id) : bytes_{id} {}

  Writer &u8(std::uint8_t v) {
    bytes_.push_back(v);
    return *this;
  }
  Writer &u16(std::uint16_t v) { return u8(std::uint8_t(v & 0xff)).u8(std::uint8_t(v >> 8)); }
  Writer &u32(std::uint32_t v) { return u16(std::uint16_t(v & 0xffff)).u16(std::uint16_t(v >> 16)); }
  Writer &u64(std::uint64_t v) { return u32(std::uint32_t(v & 0xffffffff)).u32(std::uint32_t(v >> 32)); }
  Writer &f32(float v) { return u32(std::bit_cast<std::uint32_t>(v)); }
  Writer &text(std::string_view text) {
    bytes_.insert(bytes_.end(), text.begin(), text.end());
    return *this;
  }

  // Zeros up to the report's own size; a report that has become longer is a mistake in this file.
  Bytes done(std::size_t size) {
    if (bytes_.size() > size) throw std::logic_error("emulated report longer than its size");
    bytes_.resize(size);
    return std::move(bytes_);
  }

 private:
  Bytes bytes_;
};

void blackBox(Writer &out) {
  out.u16(std::uint16_t(kEventCounts.size()));
  std::uint32_t seed = 0;
  for (std::size_t module = 0; module < kEventCounts.size(); ++module) {
    out.u16(std::uint16_t(0x0100 + module)).u16(kEventCounts[module]);
    for (unsigned event = 0; event < kEventCounts[module]; ++event, ++seed) out.u32(seed % 3 == 0 ? seed * 17 : 0);
  }
}

void blackBoxOptions(Writer &out) {
  for (unsigned i = 0; i < 240; ++i) {
    const unsigned flags =
        (i % 5 == 0 ? 0x08u : 0u) | (i / 6 % 4) << 4 | (i % 4 == 1 ? 0x40u : 0u) | (i % 11 == 0 ? 0x80u : 0u);
    out.u8(std::uint8_t(i % 6 | flags));
  }
}

void openShortData(Writer &out, std::uint64_t saturated, std::uint32_t base, bool brownout) {
  out.u64(saturated);
  for (std::uint32_t k = 0; k < kChannels; ++k) out.u32(base + k * 37);
  for (std::uint32_t k = 0; k < kChannels; ++k) out.u32(base / 2 + k * 41);
  out.u8(brownout ? 1 : 0);
}

void declare(Bytes &out, const ReportSize &report) {
  const std::size_t count = report.bytes - 1;
  const std::uint8_t main = report.kind == ReportKind::Input ? 0x81 : 0xb1;
  for (const std::size_t byte : {std::size_t{0x85}, std::size_t{report.id}, std::size_t{0x09}, std::size_t{report.id},
                                 std::size_t{0x96}, count & 0xff, count >> 8, std::size_t{main}, std::size_t{0x02}})
    out.push_back(std::uint8_t(byte));
}

}  // namespace

const std::vector<ReportSize> &reportSizes() {
  using enum ReportKind;
  static const std::vector<ReportSize> sizes = {{kImageId, Input, 792}, {kPacketId, Input, 2064}, {0xa2, Feature, 193},
                                                {0xa9, Feature, 49},    {0xd0, Feature, 128},     {0xd2, Feature, 512},
                                                {0xdc, Feature, 25},    {0xde, Feature, 2},       {0xdf, Feature, 25},
                                                {0xe0, Feature, 7},     {0xe1, Feature, 1023},    {0xe2, Feature, 241},
                                                {0xe3, Feature, 57},    {0xe4, Feature, 401},     {0xe5, Feature, 401},
                                                {0xea, Feature, 1023},  {0xec, Feature, 193}};
  return sizes;
}

Bytes controllerDescriptor(bool twoCollections) {
  const Bytes open = {0x06, 0x00, 0xff, 0x09, 0x01, 0xa1, 0x01, 0x15, 0x00, 0x26, 0xff, 0x00, 0x75, 0x08};
  Bytes out = open;
  bool apart = false;
  for (const ReportSize &report : reportSizes()) {
    if (twoCollections && !apart && report.kind == ReportKind::Feature) {
      out.push_back(0xc0);
      out.insert(out.end(), open.begin(), open.end());
      apart = true;
    }
    declare(out, report);
  }
  out.push_back(0xc0);
  return out;
}

Bytes mouseDescriptor() {
  return {0x05, 0x01, 0x09, 0x02, 0xa1, 0x01, 0x09, 0x01, 0xa1, 0x00, 0x05, 0x09, 0x19, 0x01, 0x29, 0x03, 0x15,
          0x00, 0x25, 0x01, 0x95, 0x03, 0x75, 0x01, 0x81, 0x02, 0x95, 0x01, 0x75, 0x05, 0x81, 0x01, 0x05, 0x01,
          0x09, 0x30, 0x09, 0x31, 0x15, 0x81, 0x25, 0x7f, 0x75, 0x08, 0x95, 0x02, 0x81, 0x06, 0xc0, 0xc0};
}

Bytes featureReport(std::uint8_t id) {
  std::size_t size = 0;
  for (const ReportSize &report : reportSizes())
    if (report.id == id && report.kind == ReportKind::Feature) size = report.bytes;
  Writer out(id);
  switch (id) {
    case 0xa2:
      for (unsigned k = 0; k < kChannels; ++k) out.f32(1000.5F - float(k) * 12.25F);
      break;
    case 0xa9:
      for (std::uint32_t mode = 0; mode < 6; ++mode) out.u32(1000 * (mode + 1) + mode).u32(3 + mode);
      break;
    case 0xd0:
      out.text("4.2.1-317");
      break;
    case 0xd2:
      out.text("b2-main 4.2.1-317\nsdk 7.3\nclang 14.0.6\nrtos layer 2.9.0\nvendor 1.14\nalgorithms 5.0.2");
      break;
    case 0xdc:
      out.u32(0x20004000).u32(0x80000001).u32(0x0000a5c3).u32(512).u32(1200).u32(1);
      break;
    case 0xde:
      out.u8(1);
      break;
    case 0xdf:
      out.u32(1234567).u64(1250999896491).u32(0x00000abc).u32(42).u32(41);
      break;
    case 0xe0:
      out.u8(0x0d).u16(5).u8(0x21).u8(0x40).u8(0x24);
      break;
    case 0xe1:
    case 0xea:
      blackBox(out);
      break;
    case 0xe2:
      blackBoxOptions(out);
      break;
    case 0xe3:
      for (unsigned mask = 0; mask < 7; ++mask) out.u64(std::uint64_t{0x8001} << (mask * 5));
      break;
    case 0xe4:
      openShortData(out, 0x0000800000000001, 100000, false);
      break;
    case 0xe5:
      openShortData(out, 0x0000000000f00f00, 200000, true);
      break;
    case 0xec:
      for (unsigned k = 0; k < kChannels; ++k) out.f32(0.5F + float(k) * 0.125F);
      break;
    default:
      throw std::logic_error("no such feature report");
  }
  return out.done(size);
}

Bytes imageReport(std::uint32_t number, std::uint8_t cookie) {
  Writer out(kImageId);
  out.u8(cookie).u16(0x0102).u32(number).u32(0x00300005).u32(number * 16);
  // Four scans: a ridge that wanders over the channels with the frames, on a different level in each scan.
  for (std::uint32_t scan = 0; scan < 4; ++scan)
    for (std::uint32_t k = 0; k < kChannels; ++k) {
      const std::int64_t ridge = std::int64_t((k + number) % kChannels) * 250 - 6000;
      out.u32(std::uint32_t(ridge * (scan % 2 == 0 ? 1 : -1) + std::int64_t{scan} * 100000));
    }
  out.u32(0x00000021).f32(36.5F + float(number % 8) * 0.125F);
  return out.done(792);
}

Bytes packetReport(std::uint32_t number) {
  Writer out(kPacketId);
  out.u8(0x12).u8(0x34).u8(0x56).u32(number).u32(2048).u32(2048 * 64);
  for (std::uint32_t k = 0; k < 512; ++k) out.u32(number * 512 + k);
  return out.done(2064);
}

}  // namespace vesk::bench
