// What the emulated controller does with the kernel's requests, with its own commands and with time.
#include "Controller.h"

#include <sched.h>

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <stdexcept>

namespace vesk::bench {
namespace {

using std::chrono::milliseconds;

// The bench has one processor: nothing else runs while this object lives, so a burst reaches every reader's queue
// whole, before the reader has taken anything out.
class Undisturbed {
 public:
  Undisturbed() { set(SCHED_FIFO, 10); }
  ~Undisturbed() { set(SCHED_OTHER, 0); }
  Undisturbed(const Undisturbed &) = delete;
  Undisturbed &operator=(const Undisturbed &) = delete;

 private:
  static void set(int policy, int priority) {
    sched_param parameter{};
    parameter.sched_priority = priority;
    sched_setscheduler(0, policy, &parameter);
  }
};

}  // namespace

void Log::line(const char *format, ...) {
  const auto since = std::chrono::duration_cast<milliseconds>(Clock::now() - start_).count();
  std::fprintf(file_, "%lld ", static_cast<long long>(since));
  va_list arguments;
  va_start(arguments, format);
  std::vfprintf(file_, format, arguments);
  va_end(arguments);
  std::fputc('\n', file_);
  std::fflush(file_);
}

Clock::time_point Controller::Stream::due() const {
  const std::chrono::duration<double> since(double(sent) / rate);
  return start + std::chrono::duration_cast<Clock::duration>(since);
}

Controller::Controller(Identity identity, Bytes reportDescriptor, Log &log)
    : identity_(std::move(identity)), reportDescriptor_(std::move(reportDescriptor)), log_(log) {}

void Controller::plug() {
  if (plugged_) throw std::invalid_argument("plugged in already");
  const std::vector<std::string> known = hidrawNames();
  device_.create(identity_, reportDescriptor_);
  plugged_ = true;
  const std::string node = waitForNode(identity_, known);
  if (node.empty()) throw std::runtime_error("the kernel made no hidraw node");
  log_.line("node %s", node.c_str());
}

void Controller::unplug() {
  if (!plugged_) throw std::invalid_argument("not plugged in");
  stopStream();
  device_.destroy();
  plugged_ = open_ = false;
  answers_.clear();
  log_.line("unplugged");
}

void Controller::handleKernelEvents() {
  while (const auto event = device_.next()) {
    switch (event->type) {
      case UHID_START:
        log_.line("start");
        break;
      case UHID_STOP:
        log_.line("stop");
        break;
      case UHID_OPEN:
        log_.line("open");
        open_ = true;
        if (waitForOpen_) commandsPaused_ = Clock::now() + milliseconds(settle_);
        waitForOpen_ = false;
        break;
      case UHID_CLOSE:
        log_.line("close");
        open_ = false;
        break;
      case UHID_GET_REPORT:
        getReport(event->u.get_report);
        break;
      case UHID_SET_REPORT:
        log_.line("set-report %02x type %u size %u", event->u.set_report.rnum, event->u.set_report.rtype,
                  event->u.set_report.size);
        device_.answerSet(event->u.set_report.id, 0);
        break;
      case UHID_OUTPUT:
        log_.line("output size %u", event->u.output.size);
        break;
      default:
        log_.line("event %u", event->type);
        break;
    }
  }
}

void Controller::getReport(const uhid_get_report_req &request) {
  const std::uint8_t id = request.rnum;
  const bool feature = request.rtype == UHID_FEATURE_REPORT;
  log_.line("get-report %02x %s", id, feature ? "feature" : "input");
  const auto declared = std::find_if(reportSizes().begin(), reportSizes().end(), [&](const ReportSize &report) {
    return report.id == id && report.kind == ReportKind::Feature;
  });
  if (!feature || declared == reportSizes().end()) {
    device_.answerGet(request.id, EIO, {});
    return;
  }
  const auto own = features_.find(id);
  Bytes report = own == features_.end() ? featureReport(id) : own->second;

  const auto found = faults_.find(id);
  const Fault fault = found == faults_.end() ? Fault{} : found->second;
  if (fault.kind == "error") return device_.answerGet(request.id, std::uint16_t(fault.value), {});
  if (fault.kind == "mute") return;
  if (fault.kind == "empty") report.clear();
  if (fault.kind == "short") report.resize(std::min<std::size_t>(report.size(), fault.value));
  if (fault.kind == "long") report.resize(report.size() + fault.value, 0xee);
  if (fault.kind == "wrong") report[0] = std::uint8_t(fault.value);
  if (fault.kind == "late") {
    answers_.push_back({Clock::now() + milliseconds(fault.value), request.id, std::move(report)});
    return;
  }
  device_.answerGet(request.id, 0, report);
}

void Controller::send(std::uint8_t id, std::size_t length) {
  if (!plugged_) throw std::invalid_argument("not plugged in");
  const std::uint32_t number = this->number(id)++;
  Bytes report = id == kImageId ? imageReport(number, cookie_) : packetReport(number);
  if (length != 0) report.resize(length, 0xee);
  device_.input(report);
  if (untilUnplug_ != 0 && --untilUnplug_ == 0) unplug();
}

void Controller::burst(unsigned count, const std::vector<std::uint8_t> &ids) {
  const std::uint32_t frame = frame_, packet = packet_;
  {
    const Undisturbed whole;
    for (unsigned k = 0; k < count && plugged_; ++k) send(ids[k % ids.size()]);
  }
  log_.line("sent frames %u..%u packets %u..%u", frame, frame_ - 1, packet, packet_ - 1);
}

void Controller::stopStream() {
  if (!stream_.active()) return;
  log_.line("streamed %llu reports, next frame %u packet %u", static_cast<unsigned long long>(stream_.sent), frame_,
            packet_);
  stream_ = {};
}

bool Controller::mayRunCommand() {
  return !commands_.empty() && !finished_ && !waitForOpen_ && !(waitForSent_ && stream_.active()) &&
         Clock::now() >= commandsPaused_;
}

void Controller::handleTime() {
  while (mayRunCommand()) {
    waitForSent_ = false;
    const std::string line = commands_.front();
    commands_.pop_front();
    log_.line("command %s", line.c_str());
    run(line);
  }
  const auto now = Clock::now();
  while (stream_.active() && stream_.due() <= now) {
    ++stream_.sent;
    const bool last = stream_.sent == stream_.count;
    send(stream_.ids[(stream_.sent - 1) % stream_.ids.size()]);
    if (last) stopStream();
  }
  const auto late = std::partition(answers_.begin(), answers_.end(), [&](const Answer &a) { return a.due > now; });
  for (auto answer = late; answer != answers_.end(); ++answer) {
    device_.answerGet(answer->request, 0, answer->report);
    log_.line("late answer %02x", answer->report[0]);
  }
  answers_.erase(late, answers_.end());
}

Clock::time_point Controller::due() const {
  if (finished_) return Clock::now();
  auto due = Clock::now() + std::chrono::hours(1);
  if (stream_.active()) due = std::min(due, stream_.due());
  for (const Answer &answer : answers_) due = std::min(due, answer.due);
  const bool held = waitForOpen_ || (waitForSent_ && stream_.active());
  if (!commands_.empty() && !held) due = std::min(due, commandsPaused_);
  return due;
}

}  // namespace vesk::bench
