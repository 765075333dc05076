// Reads feature reports from a device and judges what it answers.
#pragma once

#include <algorithm>
#include <optional>
#include <string>

#include "host/decode/Decoder.h"
#include "host/device/HidNode.h"
#include "host/device/Stop.h"

namespace vesk::host {

inline constexpr MessageKind kRequestFailed{"request-failed", Severity::kError, kExitFindings};
inline constexpr MessageKind kRequestTimeout{"request-timeout", Severity::kError, kExitFindings};
inline constexpr MessageKind kEmptyAnswer{"empty-answer", Severity::kError, kExitFindings};
inline constexpr MessageKind kWrongAnswer{"wrong-answer", Severity::kError, kExitFindings};

class FeatureReader {
 public:
  /// Kernels give up after this time themselves.
  static constexpr milliseconds kKernelTimeout{5000};

  struct Answer {
    std::string_view bytes;          // empty where something is wrong; good until the next call
    std::optional<Finding> problem;  // why there are none, unless:
    bool gone = false;               // the device has left
    bool stopped = false;            // a signal ended the wait
  };

  FeatureReader(HidNode &node, milliseconds timeout, const Stop &stop)
      : node_(node), timeout_(timeout), stop_(stop), buffer_(HidNode::kFullBuffer, '\0') {}

  /// To be called on the thread to which signals come: one of them ends a wait that lasts too long.
  Answer get(std::uint32_t id);

 private:
  Answer judgeFailure(int error, milliseconds elapsed);
  milliseconds timeLimit() const { return std::min(timeout_, kKernelTimeout); }

  HidNode &node_;
  milliseconds timeout_;
  const Stop &stop_;
  std::string buffer_;
};

}  // namespace vesk::host
