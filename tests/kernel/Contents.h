// What the emulated controller holds: its report descriptor, its feature reports and its numbered input reports.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace vesk::bench {

using Bytes = std::vector<std::uint8_t>;

enum class ReportKind { Input, Feature };

struct ReportSize {
  std::uint8_t id;
  ReportKind kind;
  std::size_t bytes;  // with the ID
};

inline constexpr std::uint8_t kImageId = 0x76;
inline constexpr std::uint8_t kPacketId = 0x77;

// All 15 feature reports and the two input reports, in ascending order of ID within each kind.
const std::vector<ReportSize> &reportSizes();

// Every report above on a vendor usage page, in one or in two top-level collections (features apart from inputs).
Bytes controllerDescriptor(bool twoCollections);

// A three-button mouse: a HID device that is none of ours.
Bytes mouseDescriptor();

// The same bytes at every call; REQUIRES: `id` names a feature report of reportSizes().
Bytes featureReport(std::uint8_t id);

// Frame or packet `number`; all other fields follow from the number and the cookie.
Bytes imageReport(std::uint32_t number, std::uint8_t cookie);
Bytes packetReport(std::uint32_t number);

}  // namespace vesk::bench
