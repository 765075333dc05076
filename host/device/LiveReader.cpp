// The two reading threads, and the wait for a device that has gone.
#include "host/device/LiveReader.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <exception>
#include <thread>

#include "host/device/FeatureReader.h"
#include "host/device/OpenDevice.h"

namespace vesk::host {

namespace {

constexpr milliseconds kLookAgainAfter{200}, kHotPlugTime{1000};

/// A device is the same if all is equal that it takes along to another node or port.
bool isSame(const DeviceIdentity &a, const DeviceIdentity &b) {
  return a.bus == b.bus && a.vendor == b.vendor && a.product == b.product && a.serial == b.serial && a.name == b.name &&
         a.descriptor == b.descriptor;
}

}  // namespace

LiveReader::LiveReader(HidSystem &system, std::unique_ptr<HidNode> node, const Options &options, Stop &stop,
                       LiveQueue &queue)
    : system_(system),
      node_(std::move(node)),
      options_(options),
      stop_(stop),
      queue_(queue),
      identity_(node_->identity()),
      begin_(Clock::now()) {}

std::int64_t LiveReader::elapsedNs() const {
  return std::chrono::nanoseconds(Clock::now() - begin_).count();
}

bool LiveReader::isOver() const {
  return stop_.requested() || (options_.duration && Clock::now() - begin_ >= *options_.duration);
}

void LiveReader::run() {
  for (;;) {
    const auto opened = Clock::now();
    const int error = readUntilGone();
    if (isOver()) break;
    const std::string text =
        error == 0 ? "the device has gone" : std::string("the device cannot be read: ") + std::strerror(error);
    if (!options_.reconnect) {
      queue_.push(Message{error == 0 ? &kDeviceGone : &kDeviceUnreadable, identity_.node, {}, {}, text});
      break;
    }
    queue_.push(Message{&kDeviceAway, identity_.node, {}, {}, text + "; waiting for its return"});
    node_.reset();  // the next one can have the same path only if nobody holds this one
    // One that can be opened and not be read is not to be opened without a pause.
    if (Clock::now() - opened < kLookAgainAfter) stop_.waitFor(kLookAgainAfter);
    if (!waitForReturn()) break;
  }
  queue_.close();
}

int LiveReader::readUntilGone() {
  Stop gone;
  int error = 0;
  std::exception_ptr failure, failureHere;
  std::thread inputs;
  {
    const SignalsElsewhere here;
    inputs = std::thread([&] {
      try {
        error = readInputs(gone);
      } catch (...) {
        failure = std::current_exception();
      }
      gone.request();
    });
  }
  try {
    pollFeatures(gone);
  } catch (...) {
    failureHere = std::current_exception();
  }
  gone.request();
  inputs.join();
  for (const std::exception_ptr &thrown : {failure, failureHere})
    if (thrown) std::rethrow_exception(thrown);
  // What an unplug looks like.
  return error == EIO || error == ENODEV ? 0 : error;
}

int LiveReader::readInputs(Stop &gone) {
  std::string buffer(HidNode::kFullBuffer, '\0');
  while (!gone.requested()) {
    int count = node_->read(buffer);
    if (count == -EAGAIN) count = node_->waitForReport(gone.fd());
    if (count > 0) {
      if (!options_.inputs) continue;
      LiveReport report;
      report.bytes.assign(buffer.data(), static_cast<std::size_t>(count));
      report.id = static_cast<unsigned char>(buffer[0]);
      report.timeNs = elapsedNs();
      queue_.push(std::move(report));
    } else if (count != -EINTR && count != 0) {
      return -count;
    }
  }
  return 0;
}

bool LiveReader::sleepUntil(Clock::time_point time, const Stop &gone) const {
  if (options_.duration) time = std::min(time, begin_ + *options_.duration);
  while (!isOver() && !gone.requested()) {
    const auto left = std::chrono::ceil<milliseconds>(time - Clock::now());
    if (left <= milliseconds(0)) return !isOver();
    pollfd ends[] = {{stop_.fd(), POLLIN, 0}, {gone.fd(), POLLIN, 0}};
    ::poll(ends, 2, static_cast<int>(std::min(left, milliseconds(60'000)).count()));
  }
  return false;
}

void LiveReader::pollFeatures(const Stop &gone) {
  FeatureReader reader(*node_, options_.timeout, stop_);
  PollSchedule schedule(options_.features, Clock::now());
  while (sleepUntil(schedule.nextDue().value_or(Clock::time_point::max()), gone)) {
    const auto id = schedule.take(Clock::now());
    if (!id) continue;
    const FeatureReader::Answer answer = reader.get(*id);
    if (answer.stopped || answer.gone) return;
    if (answer.problem)
      queue_.push(LiveFailure{*id, *answer.problem});
    else
      queue_.push(LiveReport{std::string(answer.bytes), *id, ReportType::kFeature, elapsedNs()});
  }
}

bool LiveReader::openAgain(std::string &problem) {
  try {
    for (const DeviceIdentity &device : system_.list()) {
      if (!isSame(device, identity_)) continue;
      HidSystem::Opened opened = system_.open(device.node);
      if (opened.node) {
        queue_.push(Message{&kDeviceBack, identity_.node, {}, {}, "the device is back, as " + device.node});
        node_ = std::move(opened.node);
        return true;
      }
      problem = "the device is back, as " + device.node + ", but cannot be opened: " + std::strerror(opened.error);
    }
  } catch (const DeviceError &error) {
    problem = error.message().file + " " + error.message().text;
  }
  return false;
}

bool LiveReader::waitForReturn() {
  std::optional<Clock::time_point> seen;
  for (bool isTold = false; !isOver(); stop_.waitFor(kLookAgainAfter)) {
    std::string problem;
    if (openAgain(problem)) return true;
    if (problem.empty() || isTold) continue;
    // Rights come a little later than the node; only where they stay away there is something to tell.
    if (!seen) seen = Clock::now();
    if (Clock::now() - *seen < kHotPlugTime) continue;
    queue_.push(Message{&kDeviceShut, identity_.node, {}, {}, problem + "; trying on"});
    isTold = true;
  }
  return false;
}

}  // namespace vesk::host
