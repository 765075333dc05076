// `read` and `snapshot`: feature reports of a device, decoded or as a recording.
#include <unistd.h>

#include <cstdio>

#include "host/commands/DeviceOptions.h"
#include "host/commands/DeviceOutput.h"
#include "host/device/FeatureReader.h"
#include "host/device/Hidraw.h"
#include "host/device/OpenDevice.h"
#include "host/diagnostics/Progress.h"
#include "host/report/KnownReports.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

struct Options {
  std::vector<std::string> reports = {"all"};
  DeviceOptions device;
  OutputOptions output;
  bool noIdentity = false;
};

/// Which report is being waited for, on a terminal: one that stays mute takes seconds.
class WaitingLine {
 public:
  WaitingLine(bool quiet, std::size_t total) : shows_(!quiet && ::isatty(STDERR_FILENO) == 1), total_(total) {}
  ~WaitingLine() { clear(); }

  void show(std::size_t done, std::uint32_t id) const {
    if (!shows_) return;
    const KnownReport *known = findReport(id);
    std::fprintf(stderr, "%sreading 0x%02X %s (%zu of %zu)", kClearLine.data(), id, known->name.data(), done + 1,
                 total_);
  }
  void clear() const {
    if (shows_) std::fputs(kClearLine.data(), stderr);
  }

 private:
  bool shows_;
  std::size_t total_;
};

void readReports(HidNode &node, const std::vector<std::uint32_t> &ids, milliseconds timeout, const Stop &stop,
                 bool quiet, DeviceOutput &output) {
  using Clock = std::chrono::steady_clock;
  const auto begin = Clock::now();
  const WaitingLine waiting(quiet, ids.size());
  FeatureReader reader(node, timeout, stop);
  std::size_t asked = 0;
  for (; asked < ids.size() && !stop.requested(); ++asked) {
    waiting.show(asked, ids[asked]);
    const FeatureReader::Answer answer = reader.get(ids[asked]);
    waiting.clear();
    if (answer.stopped) break;
    if (answer.gone) {
      output.message({&kDeviceGone, output.node(), {}, ids[asked], "the device has gone"});
      return;
    }
    if (answer.problem) {
      output.failure(ids[asked], *answer.problem);
      continue;
    }
    SourceReport report;
    report.bytes = answer.bytes;
    report.id = ids[asked];
    report.type = ReportType::kFeature;
    report.timeNs = std::chrono::nanoseconds(Clock::now() - begin).count();
    output.report(report);
  }
  if (asked < ids.size())
    output.message(
        {&kInterrupted,
         output.node(),
         {},
         {},
         "interrupted; " + std::to_string(asked) + " of " + std::to_string(ids.size()) + " reports were asked for"});
}

void run(const Options &options, CommandContext &context) {
  const std::vector<std::uint32_t> ids = featureIds(options.reports);
  DeviceOutput output(options.output, context, {!options.noIdentity, false});
  Stop stop;
  const StopOnSignals signals(stop);
  Hidraw system;
  try {
    if (const auto node = openDevice(system, options.device.device, stop)) {
      output.begin(node->identity());
      readReports(*node, ids, options.device.timeout(), stop, context.messages.quiet, output);
    }
  } catch (const DeviceError &error) {
    output.message(error.message());
  }
  output.finish();
  context.exitCode = output.exitCode();
}

}  // namespace

void addRead(CLI::App &app, CommandContext &context) {
  CLI::App *command = app.add_subcommand("read", "Read feature reports from a device and decode them");
  const auto options = std::make_shared<Options>();
  command->add_option("reports", options->reports, "0xE0, 224 or a name, as 'vesk-report reports' lists them, or all")
      ->type_name("REPORT")
      ->required();
  options->device.addDevice(*command);
  options->device.addTimeout(*command);
  options->output.addTo(*command);
  command->remove_option(command->get_option("--jobs"));  // there is nothing to share
  command->callback([options, &context] { run(*options, context); });
}

void addSnapshot(CLI::App &app, CommandContext &context) {
  CLI::App *command = app.add_subcommand("snapshot", "Put all feature reports of a device into one recording");
  const auto options = std::make_shared<Options>();
  options->output.form = "recording";
  options->device.addDevice(*command);
  options->device.addTimeout(*command);
  command
      ->add_option("-O,--output-file", options->output.file,
                   "write to FILE, which appears whole or not at all; - is standard output")
      ->type_name("FILE");
  command->add_flag("--no-identity", options->noIdentity,
                    "leave out what tells whose device it is: serial number, physical path and this machine's name");
  command->callback([options, &context] { run(*options, context); });
}

}  // namespace vesk::host
