// A deque behind a lock.
#include "host/device/LiveQueue.h"

namespace vesk::host {

void LiveQueue::push(LiveEvent event) {
  {
    const std::lock_guard lock(mutex_);
    if (events_.size() >= capacity_ && !std::holds_alternative<Message>(event)) {
      ++dropped_;
      return;
    }
    events_.push_back(std::move(event));
  }
  changed_.notify_one();
}

void LiveQueue::close() {
  {
    const std::lock_guard lock(mutex_);
    closed_ = true;
  }
  changed_.notify_one();
}

std::optional<LiveEvent> LiveQueue::pop(std::chrono::milliseconds patience) {
  std::unique_lock lock(mutex_);
  changed_.wait_for(lock, patience, [this] { return closed_ || !events_.empty(); });
  if (events_.empty()) return {};
  std::optional<LiveEvent> event = std::move(events_.front());
  events_.pop_front();
  return event;
}

bool LiveQueue::isDone() const {
  const std::lock_guard lock(mutex_);
  return closed_ && events_.empty();
}

std::uint64_t LiveQueue::dropped() const {
  const std::lock_guard lock(mutex_);
  return dropped_;
}

}  // namespace vesk::host
