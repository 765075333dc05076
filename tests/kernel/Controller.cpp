// What the emulated controller does with the kernel's requests, with its own commands and with time.
#include "Controller.h"

#include <sched.h>

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <sstream>
#include <stdexcept>

namespace vesk::bench {
namespace {

using std::chrono::milliseconds;

constexpr unsigned kLongest = UHID_DATA_MAX;

unsigned long toNumber(const std::string &text, int base, unsigned long limit) {
  std::size_t used = 0;
  const unsigned long value = text.empty() || text[0] == '-' ? limit + 1 : std::stoul(text, &used, base);
  if (used != text.size() || value > limit) throw std::invalid_argument("bad number '" + text + "'");
  return value;
}

std::uint8_t toByte(const std::string &hex) {
  return std::uint8_t(toNumber(hex, 16, 0xff));
}

std::uint8_t toInputId(const std::string &hex) {
  const std::uint8_t id = toByte(hex);
  if (id != kImageId && id != kPacketId) throw std::invalid_argument("no input report " + hex);
  return id;
}

std::vector<std::uint8_t> toInputIds(const std::string &list) {
  std::vector<std::uint8_t> ids;
  std::istringstream in(list);
  for (std::string id; std::getline(in, id, ',');) ids.push_back(toInputId(id));
  if (ids.empty()) throw std::invalid_argument("no input reports named");
  return ids;
}

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
  log_.line("get-report %02x type %u", id, request.rtype);
  const auto declared = std::find_if(reportSizes().begin(), reportSizes().end(), [&](const ReportSize &report) {
    return report.id == id && report.kind == ReportKind::Feature;
  });
  if (request.rtype != UHID_FEATURE_REPORT || declared == reportSizes().end()) {
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
  auto due = Clock::now() + std::chrono::hours(1);
  if (stream_.active()) due = std::min(due, stream_.due());
  for (const Answer &answer : answers_) due = std::min(due, answer.due);
  const bool held = waitForOpen_ || (waitForSent_ && stream_.active());
  if (!commands_.empty() && !held) due = std::min(due, commandsPaused_);
  return due;
}

void Controller::run(const std::string &line) {
  std::istringstream in(line);
  std::vector<std::string> words;
  for (std::string word; in >> word;) words.push_back(word);
  const auto is = [&](const char *name, std::size_t least, std::size_t most) {
    if (words.empty() || words[0] != name) return false;
    if (words.size() - 1 < least || words.size() - 1 > most) throw std::invalid_argument("bad command: " + line);
    return true;
  };
  const auto count = [&](std::size_t k, unsigned otherwise) {
    return k < words.size() ? unsigned(toNumber(words[k], 10, 100'000'000)) : otherwise;
  };

  if (is("burst", 2, 2)) {
    burst(count(1, 0), toInputIds(words[2]));
  } else if (is("stream", 3, 3)) {
    stopStream();
    stream_ = {toInputIds(words[3]), Clock::now(), double(std::max(1U, count(1, 0))), 0, count(2, 0)};
  } else if (is("stop", 0, 0)) {
    stopStream();
  } else if (is("send", 1, 2)) {
    send(toInputId(words[1]), std::min(count(2, 0), kLongest));
  } else if (is("skip", 2, 2)) {
    number(toInputId(words[1])) += count(2, 0);
  } else if (is("cookie", 1, 1)) {
    cookie_ = toByte(words[1]);
  } else if (is("contents", 1, kLongest)) {
    Bytes &report = features_[toByte(words[1])];
    report.clear();
    for (std::size_t k = 1; k < words.size(); ++k) report.push_back(toByte(words[k]));
  } else if (is("fault", 2, 3)) {
    static const std::vector<std::string> kinds = {"none", "error", "short", "long", "empty", "wrong", "late", "mute"};
    if (std::find(kinds.begin(), kinds.end(), words[2]) == kinds.end())
      throw std::invalid_argument("bad command: " + line);
    const bool counted = words[2] == "short" || words[2] == "long" || words[2] == "late" || words[2] == "wrong";
    if (counted && words.size() != 4) throw std::invalid_argument("number missing: " + line);
    const unsigned value = words[2] == "wrong" ? toByte(words[3]) : count(3, EIO);
    faults_[toByte(words[1])] = {words[2], words[2] == "long" ? std::min(value, 2048U) : value};
  } else if (is("unplug", 0, 0)) {
    unplug();
  } else if (is("unplug-after", 1, 1)) {
    untilUnplug_ = count(1, 0);
  } else if (is("replug", 0, 0)) {
    plug();
  } else if (is("wait", 1, 1)) {
    commandsPaused_ = Clock::now() + milliseconds(count(1, 0));
  } else if (is("wait-open", 0, 1)) {
    settle_ = count(1, 100);
    waitForOpen_ = !open_;
  } else if (is("wait-sent", 0, 0)) {
    waitForSent_ = true;
  } else if (is("quit", 0, 0)) {
    finished_ = true;
  } else {
    throw std::invalid_argument("bad command: " + line);
  }
}

}  // namespace vesk::bench
