// Gaps in the controller's frame and packet numbers.
#include "host/report/LossCounter.h"

#include <utility>

#include "host/report/KnownReports.h"
#include "values/LittleEndian.h"

namespace vesk::host {

namespace {

constexpr std::uint32_t kSensorImage = 0x76, kAdcDumpPacket = 0x77;
constexpr std::size_t kCounterOffset = 4;  // the same in both

}  // namespace

std::optional<std::uint32_t> counterOf(const SourceReport &report) {
  if (report.type != ReportType::kInput || (report.id != kSensorImage && report.id != kAdcDumpPacket)) return {};
  if (report.bytes.size() != findReport(report.id)->layoutSize) return {};
  return read<U32>(report.bytes.data() + kCounterOffset);
}

std::optional<LossCounter::Gap> LossCounter::observe(const SourceReport &report) {
  const auto counter = counterOf(report);
  if (!counter) return {};
  // The device's name is copied once for each device, not for each report.
  auto entry = last_.begin();
  while (entry != last_.end() && !(entry->first.second == report.id && entry->first.first == report.device)) ++entry;
  if (entry == last_.end()) {
    last_.emplace(std::pair(std::string(report.device), report.id), *counter);
    return {};
  }
  const std::uint32_t before = std::exchange(entry->second, *counter);
  const std::uint32_t step = *counter - before;
  if (step == 1) return {};
  if (step == 0 || step > UINT32_MAX / 2) {
    ++total_.restarts;
    return {};
  }
  ++total_.gaps;
  total_.lost += step - 1;
  return Gap{before, *counter, step - 1};
}

}  // namespace vesk::host
