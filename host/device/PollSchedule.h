// When which feature report is to be asked for again.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <vector>

namespace vesk::host {

struct FeaturePoll {
  std::uint32_t id;
  std::chrono::milliseconds interval;
};

class PollSchedule {
 public:
  using Time = std::chrono::steady_clock::time_point;

  /// All are due at once, in this order.
  PollSchedule(const std::vector<FeaturePoll> &polls, Time now) {
    for (const FeaturePoll &poll : polls) rows_.push_back({poll, now});
  }

  /// When the next one is due; nothing where there are none.
  std::optional<Time> nextDue() const;
  /// The ID that has been due the longest, if one is. Its next turn is one interval later, and where that has passed
  /// too, the ones that were missed are left out.
  std::optional<std::uint32_t> take(Time now);

 private:
  struct Row {
    FeaturePoll poll;
    Time due;
  };

  std::vector<Row> rows_;
};

}  // namespace vesk::host
