// A live run: reports from the queue through the choice of the user to whatever shows or writes them.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "host/device/ChangeFilter.h"
#include "host/device/LiveReader.h"
#include "host/report/LossCounter.h"

namespace vesk::host {

inline constexpr MessageKind kQueueOverflow{"queue-overflow", Severity::kWarning, kExitOk};

/// Takes what a run brings. All calls come from one thread; what they throw ends the run.
class LiveConsumer {
 public:
  virtual ~LiveConsumer() = default;
  virtual void report(const SourceReport &report, const LossCounter::Total &losses) = 0;
  virtual void failure(std::uint32_t id, const Finding &problem) = 0;
  virtual void message(Message message) = 0;
  /// Nothing has come for a little while.
  virtual void idle() {}
};

struct LiveCounts {
  std::uint64_t inputs = 0, features = 0;  // that reached the consumer
  std::uint64_t lost = 0;                  // by the controller's counters, before any choice
  std::uint64_t dropped = 0;               // because the consumer was too slow
};

class LiveRun {
 public:
  struct Options {
    LiveReader::Options reader;
    std::vector<std::uint32_t> inputIds;  // empty: all
    bool changesOnly = false;
    std::optional<std::uint64_t> count;
    std::size_t queueCapacity = LiveQueue::kCapacity;
  };

  LiveRun(const Options &options, Stop &stop, LiveConsumer &consumer)
      : options_(options), stop_(stop), consumer_(consumer) {}

  /// Until the count is reached, a stop is requested, or the reader ends. Passes on what the consumer throws;
  /// throws DeviceError where the machine has no threads to read with.
  LiveCounts run(HidSystem &system, std::unique_ptr<HidNode> node);

 private:
  LiveCounts runThreads(HidSystem &system, std::unique_ptr<HidNode> node);
  void consume(LiveQueue &queue);
  void take(LiveEvent &event);
  void report(const LiveReport &report);
  bool isWanted(const SourceReport &report);
  bool isEnough() const { return options_.count && counts_.inputs + counts_.features >= *options_.count; }

  Options options_;
  Stop &stop_;
  LiveConsumer &consumer_;
  LossCounter losses_;
  ChangeFilter changes_;
  LiveCounts counts_;
  std::string node_;
};

}  // namespace vesk::host
