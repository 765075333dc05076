// Where the reports of a live device go: decoded, written and told one by one, as they come.
#pragma once

#include <memory>
#include <string>

#include "host/commands/Command.h"
#include "host/commands/OutputOptions.h"
#include "host/decode/ReportPrinter.h"
#include "host/device/HidNode.h"
#include "host/output/OutputFile.h"

namespace vesk::host {

/// Not for use from two threads at once. What writes throws OutputError and PipeClosed.
class DeviceOutput {
 public:
  struct Options {
    bool identity = true;  // recordings: say who the device is
    bool grows = false;    // the file has its name from the beginning, and is whole at any moment
  };

  DeviceOutput(const OutputOptions &output, const CommandContext &context, const Options &options);

  /// The device is open. To be called once, before the reports.
  void begin(const DeviceIdentity &device);
  /// Its file, index and device IDs are filled in here.
  void report(SourceReport report);
  /// A report that was asked for in vain.
  void failure(std::uint32_t id, const Finding &problem);
  void message(Message message) { messages_.add(std::move(message)); }
  /// The end of the document, whether a device was opened or not.
  void finish();

  const std::string &node() const { return node_; }
  ExitCode exitCode() const { return messages_.exitCode(); }

 private:
  void flush();

  Options options_;
  bool isRecording_;
  Messages messages_;
  OutputFile file_;
  std::unique_ptr<Formatter> formatter_;
  ReportPrinter printer_;
  OutputBuffer buffer_;
  std::vector<Message> reportMessages_;
  std::string node_;
  std::uint32_t vendorProduct_ = 0;
  std::uint64_t reports_ = 0;
};

}  // namespace vesk::host
