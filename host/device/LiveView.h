// Shows a run in the live view instead of writing it.
#pragma once

#include <chrono>
#include <cstdio>
#include <deque>
#include <string>

#include "host/decode/Decoder.h"
#include "host/device/HidNode.h"
#include "host/device/LiveRun.h"
#include "host/device/View.h"
#include "host/diagnostics/Messages.h"
#include "host/output/OutputFile.h"

namespace vesk::host {

/// Has the terminal to itself while it lives, and leaves it as it was. Messages are held back until then.
class LiveView : public LiveConsumer {
 public:
  /// `scan` is "D" or "P".
  LiveView(const DeviceIdentity &device, const std::string &scan, const Messages::Options &options);
  ~LiveView() override;
  LiveView(const LiveView &) = delete;
  LiveView &operator=(const LiveView &) = delete;

  void report(const SourceReport &report, const LossCounter::Total &losses) override;
  void failure(std::uint32_t id, const Finding &problem) override;
  void message(Message message) override { messages_.add(std::move(message)); }
  void idle() override { draw(); }

  void finish() { messages_.finishFile(node_); }
  ExitCode exitCode() const { return messages_.exitCode(); }

 private:
  void takeImage(const ReportValue &image);
  void draw();

  std::string node_, scan_;
  std::FILE *held_;
  Messages messages_;
  OutputFile screen_{"-"};
  Decoder decoder_;
  std::deque<std::int64_t> imageTimes_;  // of the last seconds
  std::chrono::steady_clock::time_point drawn_;
  ViewState state_;
};

}  // namespace vesk::host
