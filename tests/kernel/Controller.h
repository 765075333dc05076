// The emulated controller: answers the kernel, streams input reports and misbehaves on command.
#pragma once

#include <chrono>
#include <cstdint>
#include <cstdio>
#include <deque>
#include <map>
#include <string>
#include <vector>

#include "Contents.h"
#include "UhidDevice.h"

namespace vesk::bench {

using Clock = std::chrono::steady_clock;

// The story of a run, one event a line, written through at once: "<milliseconds since start> <event> <details>".
class Log {
 public:
  explicit Log(std::FILE *file) : file_(file) {}
  [[gnu::format(printf, 2, 3)]] void line(const char *format, ...);

 private:
  std::FILE *file_;
  Clock::time_point start_ = Clock::now();
};

class Controller {
 public:
  Controller(Identity identity, Bytes reportDescriptor, Log &log);

  void plug();
  // One command of README.md; takes its turn after those that wait. Throws std::invalid_argument when it is run.
  void command(const std::string &line) { commands_.push_back(line); }

  int descriptor() const { return device_.descriptor(); }
  void handleKernelEvents();
  void handleTime();              // runs what is due
  Clock::time_point due() const;  // when handleTime() has something to do next
  bool finished() const { return finished_; }

 private:
  struct Fault {
    std::string kind;
    unsigned value = 0;
  };
  struct Answer {
    Clock::time_point due;
    std::uint32_t request;
    Bytes report;
  };
  struct Stream {
    std::vector<std::uint8_t> ids;
    Clock::time_point start;
    double rate = 0;
    std::uint64_t sent = 0;
    std::uint64_t count = 0;  // 0: without end

    bool active() const { return !ids.empty(); }
    Clock::time_point due() const;
  };

  void run(const std::string &line);
  bool mayRunCommand();
  void getReport(const uhid_get_report_req &request);
  void send(std::uint8_t id, std::size_t length = 0);
  void burst(unsigned count, const std::vector<std::uint8_t> &ids);
  void stopStream();
  void unplug();
  std::uint32_t &number(std::uint8_t id) { return id == kImageId ? frame_ : packet_; }

  Identity identity_;
  Bytes reportDescriptor_;
  Log &log_;
  UhidDevice device_;
  bool plugged_ = false;
  bool open_ = false;
  bool finished_ = false;

  std::deque<std::string> commands_;
  Clock::time_point commandsPaused_{};
  bool waitForOpen_ = false;
  unsigned settle_ = 0;
  bool waitForSent_ = false;

  std::map<std::uint8_t, Fault> faults_;
  std::map<std::uint8_t, Bytes> features_;
  std::vector<Answer> answers_;
  Stream stream_;
  std::uint32_t frame_ = 1;
  std::uint32_t packet_ = 1;
  std::uint8_t cookie_ = 0x05;
  std::uint64_t untilUnplug_ = 0;  // 0: never
};

}  // namespace vesk::bench
