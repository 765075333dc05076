// One request at a time, with an alarm clock beside it.
#include "host/device/FeatureReader.h"

#include <sys/time.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstring>

#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

// Timers tick: a request that ran into a limit may seem to have ended a little before it.
constexpr milliseconds kTimerSlack{20};
// How much earlier than the node a request may know that the device has gone.
constexpr milliseconds kLeaving{50};

/// Interrupts system calls of this thread once the time is over. The kernel has no other way to give a request a time
/// limit. It rings on, because the first signal may come just before the call.
class AlarmClock {
 public:
  explicit AlarmClock(milliseconds time) {
    struct sigaction action {};
    action.sa_handler = [](int) {};
    ::sigaction(SIGALRM, &action, &before_);
    set(time, milliseconds(50));
  }
  ~AlarmClock() {
    set(milliseconds(0), milliseconds(0));
    ::sigaction(SIGALRM, &before_, nullptr);
  }
  AlarmClock(const AlarmClock &) = delete;
  AlarmClock &operator=(const AlarmClock &) = delete;

 private:
  static timeval toTimeval(milliseconds time) { return {time.count() / 1000, time.count() % 1000 * 1000}; }
  static void set(milliseconds first, milliseconds interval) {
    const itimerval timer{toTimeval(interval), toTimeval(first)};
    ::setitimer(ITIMER_REAL, &timer, nullptr);
  }

  struct sigaction before_;
};

FeatureReader::Answer problem(const MessageKind &kind, std::string text) {
  return {{}, Finding{&kind, kind.severity, std::move(text)}};
}

/// "5 s", "0.3 s"
std::string secondsText(milliseconds time) {
  char digits[32];
  const double seconds = static_cast<double>(time.count()) / 1000;
  return std::string(digits, std::to_chars(digits, std::end(digits), seconds).ptr) + " s";
}

}  // namespace

FeatureReader::Answer FeatureReader::get(std::uint32_t id) {
  using Clock = std::chrono::steady_clock;
  const auto begin = Clock::now();
  milliseconds elapsed{0};
  int count = 0;
  do {
    std::memset(buffer_.data(), 0, buffer_.size());
    buffer_[0] = static_cast<char>(id);
    const AlarmClock alarm(timeout_ - elapsed);
    count = node_.getFeature(buffer_);
    elapsed = std::chrono::duration_cast<milliseconds>(Clock::now() - begin);
    // Whoever is stopped and continued may be interrupted by that: the request begins anew.
  } while (count == -EINTR && !stop_.requested() && elapsed < timeLimit() - kTimerSlack);
  if (count < 0) return judgeFailure(-count, elapsed);

  // The kernel hands on whatever comes: it compares neither the ID nor the size with what was declared.
  if (count == 0) return problem(kEmptyAnswer, "the device's answer is empty");
  const std::string_view answer(buffer_.data(), static_cast<std::size_t>(count));
  if (const std::uint32_t first = static_cast<unsigned char>(answer[0]); first != id)
    return problem(kWrongAnswer, formatted<"the device answered with report 0x%02X, ">(first) + std::to_string(count) +
                                     (count == 1 ? " byte long" : " bytes long"));
  return {answer, {}};
}

FeatureReader::Answer FeatureReader::judgeFailure(int error, milliseconds elapsed) {
  // A signal makes the request fail as a broken device would, so the flag is asked before the errno.
  if (stop_.requested()) return {{}, {}, false, true};
  if (error == ENODEV || node_.isGone(kLeaving)) return {{}, {}, true, false};
  if (error == ETIMEDOUT || elapsed >= timeLimit() - kTimerSlack)
    return problem(kRequestTimeout, "no answer within " + secondsText(timeLimit()));
  return problem(kRequestFailed, std::string("the device refused the request: ") + std::strerror(error));
}

}  // namespace vesk::host
