// Reads a device until it is told to stop: input reports as they come, feature reports at their intervals.
#pragma once

#include <memory>
#include <optional>
#include <vector>

#include "host/device/HidNode.h"
#include "host/device/LiveQueue.h"
#include "host/device/PollSchedule.h"
#include "host/device/Stop.h"

namespace vesk::host {

inline constexpr MessageKind kDeviceAway{"device-away", Severity::kWarning, kExitOk};
inline constexpr MessageKind kDeviceShut{"device-shut", Severity::kWarning, kExitOk};
inline constexpr MessageKind kDeviceBack{"device-back", Severity::kWarning, kExitOk};

/// Input reports have a thread of their own, because a feature request can wait for seconds, and the kernel keeps no
/// more than 63 input reports meanwhile.
class LiveReader {
 public:
  struct Options {
    bool inputs = true;
    std::vector<FeaturePoll> features;
    milliseconds timeout{5000};
    std::optional<milliseconds> duration;
    bool reconnect = false;
  };

  LiveReader(HidSystem &system, std::unique_ptr<HidNode> node, const Options &options, Stop &stop, LiveQueue &queue);

  /// Fills the queue until a stop is requested, the duration is over, or the device has gone and is not waited for.
  /// To be called on the thread to which signals come; closes the queue at the end. Throws where the machine gives no
  /// thread or no memory.
  void run();

 private:
  using Clock = std::chrono::steady_clock;

  /// Returns 0 where the device has gone or nothing more is wanted, or the errno of a device that cannot be read.
  int readUntilGone();
  /// Returns 0, or the errno that ended it.
  int readInputs(Stop &gone);
  void pollFeatures(const Stop &gone);
  bool waitForReturn();
  bool openAgain(std::string &problem);
  std::int64_t elapsedNs() const;
  bool isOver() const;
  /// Until the time has come, or the end; false at the end.
  bool sleepUntil(Clock::time_point time, const Stop &gone) const;

  HidSystem &system_;
  std::unique_ptr<HidNode> node_;
  Options options_;
  Stop &stop_;
  LiveQueue &queue_;
  DeviceIdentity identity_;
  Clock::time_point begin_;
};

}  // namespace vesk::host
