// Compares copies in which the counters are blanked.
#include "host/device/ChangeFilter.h"

namespace vesk::host {

bool ChangeFilter::isNew(const SourceReport &report) {
  struct Counter {
    std::uint32_t id;
    std::size_t offset, size;
  };
  constexpr Counter kCounters[] = {{0x76, 4, 4}, {0x76, 12, 4}, {0x77, 4, 4}};

  std::string bytes(report.bytes);
  for (const auto &[id, offset, size] : kCounters)
    if (report.type == ReportType::kInput && report.id == id && bytes.size() >= offset + size)
      bytes.replace(offset, size, size, '\0');
  const auto [last, isFirst] = last_.try_emplace({report.type, report.id}, bytes);
  if (isFirst) return true;
  if (last->second == bytes) return false;
  last->second = std::move(bytes);
  return true;
}

}  // namespace vesk::host
