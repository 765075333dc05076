// Stop requests through an event descriptor, and the signal handlers that make them.
#include "host/device/Stop.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <system_error>

namespace vesk::host {

namespace {

constexpr int kSignals[] = {SIGINT, SIGTERM, SIGHUP};

std::atomic<Stop *> signalled = nullptr;

void onSignal(int) {
  const int before = errno;
  if (Stop *stop = signalled) stop->request();
  errno = before;
}

}  // namespace

Stop::Stop() : fd_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
  if (fd_ < 0) throw std::system_error(errno, std::generic_category(), "eventfd");
}

Stop::~Stop() {
  ::close(fd_);
}

void Stop::request() noexcept {
  requested_ = true;
  const std::uint64_t one = 1;
  [[maybe_unused]] const ssize_t written = ::write(fd_, &one, sizeof(one));
}

bool Stop::waitFor(std::chrono::milliseconds time) const {
  pollfd waiting{fd_, POLLIN, 0};
  if (!requested_) ::poll(&waiting, 1, static_cast<int>(time.count()));
  return requested_;
}

StopOnSignals::StopOnSignals(Stop &stop) {
  signalled = &stop;
  struct sigaction action {};
  action.sa_handler = onSignal;
  action.sa_flags = static_cast<int>(SA_RESETHAND);  // and no SA_RESTART
  for (std::size_t k = 0; k < std::size(kSignals); ++k) {
    ::sigaction(kSignals[k], nullptr, &before_[k]);
    // Who started us with a signal ignored, as nohup does, wants it ignored.
    if (before_[k].sa_handler != SIG_IGN) ::sigaction(kSignals[k], &action, nullptr);
  }
}

StopOnSignals::~StopOnSignals() {
  for (std::size_t k = 0; k < std::size(kSignals); ++k) ::sigaction(kSignals[k], &before_[k], nullptr);
  signalled = nullptr;
}

SignalsElsewhere::SignalsElsewhere() {
  sigset_t all;
  ::sigfillset(&all);
  ::pthread_sigmask(SIG_SETMASK, &all, &before_);
}

SignalsElsewhere::~SignalsElsewhere() {
  ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
}

}  // namespace vesk::host
