// How a running command is asked to end: by a signal, or by a thread that has seen enough.
#pragma once

#include <signal.h>

#include <atomic>
#include <chrono>

namespace vesk::host {

class Stop {
 public:
  Stop();
  ~Stop();
  Stop(const Stop &) = delete;
  Stop &operator=(const Stop &) = delete;

  /// May be called from a signal handler and from any thread.
  void request() noexcept;
  bool requested() const noexcept { return requested_; }
  /// Can be read once a stop was requested, for those who poll.
  int fd() const { return fd_; }
  /// Waits for a request; true where there is one.
  bool waitFor(std::chrono::milliseconds time) const;

 private:
  std::atomic<bool> requested_ = false;
  int fd_;
};

/// While it lives, SIGINT, SIGTERM and SIGHUP request the stop, and end a system call that waits. Each does so once:
/// the second one kills, should the end take too long. One object at a time.
class StopOnSignals {
 public:
  explicit StopOnSignals(Stop &stop);
  ~StopOnSignals();
  StopOnSignals(const StopOnSignals &) = delete;
  StopOnSignals &operator=(const StopOnSignals &) = delete;

 private:
  struct sigaction before_[3];
};

/// While it lives, threads that are started get no signals, so that those come to the thread that waits for the device.
class SignalsElsewhere {
 public:
  SignalsElsewhere();
  ~SignalsElsewhere();
  SignalsElsewhere(const SignalsElsewhere &) = delete;
  SignalsElsewhere &operator=(const SignalsElsewhere &) = delete;

 private:
  sigset_t before_;
};

}  // namespace vesk::host
