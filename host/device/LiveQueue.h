// What a device sends, on its way from the threads that read to the one that writes.
#pragma once

#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <optional>
#include <string>
#include <variant>

#include "host/decode/Decoder.h"

namespace vesk::host {

/// A report that came. Owns its bytes.
struct LiveReport {
  std::string bytes;
  std::uint32_t id = 0;
  ReportType type = ReportType::kInput;
  std::int64_t timeNs = 0;  // since the device was opened first
};

/// A report that was asked for in vain.
struct LiveFailure {
  std::uint32_t id = 0;
  Finding problem;
};

using LiveEvent = std::variant<LiveReport, LiveFailure, Message>;

/// Takes so much and no more: who writes may be slow for a while, but memory is bounded and reading never waits.
class LiveQueue {
 public:
  static constexpr std::size_t kCapacity = 8192;  // eight seconds at 1000 reports a second, 17 MB of ADC packets

  explicit LiveQueue(std::size_t capacity = kCapacity) : capacity_(capacity) {}

  /// Takes a report or failure, or counts it as dropped where the queue is full. Messages are always taken.
  void push(LiveEvent event);
  /// No more will come.
  void close();
  /// The next one; nothing after `patience`, or once the queue is closed and empty.
  std::optional<LiveEvent> pop(std::chrono::milliseconds patience);
  bool isDone() const;
  std::uint64_t dropped() const;

 private:
  std::size_t capacity_;
  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::deque<LiveEvent> events_;
  bool closed_ = false;
  std::uint64_t dropped_ = 0;
};

}  // namespace vesk::host
