// A handful of rows, looked through each time.
#include "host/device/PollSchedule.h"

#include <algorithm>

namespace vesk::host {

std::optional<PollSchedule::Time> PollSchedule::nextDue() const {
  const auto next = std::ranges::min_element(rows_, {}, &Row::due);
  if (next == rows_.end()) return {};
  return next->due;
}

std::optional<std::uint32_t> PollSchedule::take(Time now) {
  const auto next = std::ranges::min_element(rows_, {}, &Row::due);
  if (next == rows_.end() || next->due > now) return {};
  const auto missed = (now - next->due) / next->poll.interval;
  next->due += (missed + 1) * next->poll.interval;
  return next->poll.id;
}

}  // namespace vesk::host
