// Counts the reports that were lost on the way, by the controller's own counters.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "host/report/SourceReport.h"

namespace vesk::host {

/// The frame number of a sensor image or the packet number of an ADC dump packet; nothing for all other reports.
std::optional<std::uint32_t> counterOf(const SourceReport &report);

/// Follows the counters of each device and report ID of one input. Nothing else tells of a loss: the kernel drops input
/// reports past its queue without a sign.
class LossCounter {
 public:
  struct Gap {
    std::uint32_t before;  // the last counter that came
    std::uint32_t after;   // the one that came instead of before + 1
    std::uint32_t lost;
  };
  struct Total {
    std::uint64_t lost = 0;
    std::uint64_t gaps = 0;
    std::uint64_t restarts = 0;  // the counter went back, as it does when the controller starts anew
  };

  /// The gap before this report, where there is one. A counter that goes back or stands still is a restart, no gap; one
  /// that wraps at 2^32 is neither.
  std::optional<Gap> observe(const SourceReport &report);
  const Total &total() const { return total_; }

 private:
  std::map<std::pair<std::string, std::uint32_t>, std::uint32_t> last_;  // by device and report ID
  Total total_;
};

}  // namespace vesk::host
