// `watch` and `record`: what a device sends, as it comes.
#include <unistd.h>

#include <algorithm>
#include <cstdio>

#include "host/commands/DeviceOptions.h"
#include "host/commands/DeviceOutput.h"
#include "host/device/Hidraw.h"
#include "host/device/LiveRun.h"
#include "host/device/LiveView.h"
#include "host/device/OpenDevice.h"
#include "host/report/KnownReports.h"

namespace vesk::host {

namespace {

struct Options {
  DeviceOptions device;
  OutputOptions output;
  LiveRun::Options run;
  std::vector<std::string> reports;   // watch: what to show
  std::vector<std::string> features;  // record: what to ask for beside the inputs
  double interval = 1;
  std::optional<double> duration;
  bool view = false;
  std::string scan = "D";
  bool noIdentity = false;
};

/// Writes decoded reports or a recording.
class Writer : public LiveConsumer {
 public:
  explicit Writer(DeviceOutput &output) : output_(output) {}
  void report(const SourceReport &report, const LossCounter::Total &) override { output_.report(report); }
  void failure(std::uint32_t id, const Finding &problem) override { output_.failure(id, problem); }
  void message(Message message) override { output_.message(std::move(message)); }

 private:
  DeviceOutput &output_;
};

/// "0xE0@2.5", "all@60"; without a time the default.
void addPolls(std::vector<FeaturePoll> &polls, const std::string &text, milliseconds interval) {
  const std::size_t at = text.find('@');
  if (at != std::string::npos) {
    double seconds = 0;
    if (!CLI::detail::lexical_cast(text.substr(at + 1), seconds) || !(seconds >= 0.001 && seconds <= 1e6))
      throw CLI::ValidationError(text, "a time from 0.001 to 1000000 seconds was expected behind the @");
    interval = DeviceOptions::toMilliseconds(seconds);
  }
  for (const std::uint32_t id : featureIds({text.substr(0, at)})) polls.push_back({id, interval});
}

/// Divides --report into input reports to be shown and feature reports to be asked for.
void chooseReports(const Options &options, LiveRun::Options &run) {
  const milliseconds interval = DeviceOptions::toMilliseconds(options.interval);
  for (const std::string &name : options.reports) {
    const KnownReport *known = findReport(name);
    if (known != nullptr && known->type == ReportType::kInput)
      run.inputIds.push_back(known->id);
    else
      addPolls(run.reader.features, name, interval);
  }
  run.reader.inputs = options.reports.empty() || !run.inputIds.empty();
  for (const std::string &feature : options.features) addPolls(run.reader.features, feature, interval);
}

LiveRun::Options runOptions(const Options &options) {
  LiveRun::Options run = options.run;
  run.reader.timeout = options.device.timeout();
  if (options.duration) run.reader.duration = DeviceOptions::toMilliseconds(*options.duration);
  chooseReports(options, run);
  return run;
}

void printCounts(const LiveCounts &counts) {
  std::fprintf(stderr, "vesk-report: %ju reports (%ju input, %ju feature), %ju lost\n",
               std::uintmax_t{counts.inputs + counts.features}, std::uintmax_t{counts.inputs},
               std::uintmax_t{counts.features}, std::uintmax_t{counts.lost});
}

int show(const Options &options, const CommandContext &context) {
  const LiveRun::Options run = runOptions(options);
  Stop stop;
  const StopOnSignals signals(stop);
  Hidraw system;
  LiveCounts counts;
  ExitCode exitCode = kExitOk;
  try {
    auto node = openDevice(system, options.device.device, stop);
    if (node == nullptr) return kExitOk;
    LiveView view(node->identity(), options.scan, context.messages);
    counts = LiveRun(run, stop, view).run(system, std::move(node));
    view.finish();
    exitCode = view.exitCode();
  } catch (const DeviceError &error) {
    Messages messages(context.messages);
    messages.add(error.message());
    return messages.exitCode();
  }
  if (!context.messages.quiet) printCounts(counts);
  return exitCode;
}

int write(const Options &options, const CommandContext &context) {
  const LiveRun::Options run = runOptions(options);
  DeviceOutput output(options.output, context, {.identity = !options.noIdentity, .grows = true});
  Stop stop;
  const StopOnSignals signals(stop);
  Hidraw system;
  std::optional<LiveCounts> counts;
  try {
    if (auto node = openDevice(system, options.device.device, stop)) {
      output.begin(node->identity());
      Writer writer(output);
      counts = LiveRun(run, stop, writer).run(system, std::move(node));
    }
  } catch (const DeviceError &error) {
    output.message(error.message());
  }
  output.finish();
  if (counts && !context.messages.quiet) printCounts(*counts);
  return output.exitCode();
}

/// What both commands have.
void addCommon(CLI::App &command, Options &options) {
  command.add_option("--count", options.run.count, "end after so many reports")
      ->check(CLI::PositiveNumber)
      ->type_name("N");
  command.add_option("--duration", options.duration, "end after so many seconds")
      ->check(secondsBetween(0.001, 1e6))
      ->type_name("SECONDS");
  options.device.addDevice(command);
  options.device.addTimeout(command);
  command
      .add_flag("--reconnect", options.run.reader.reconnect,
                "where the device goes, wait for the same one to return and go on")
      ->group("Device");
}

}  // namespace

void addWatch(CLI::App &app, CommandContext &context) {
  CLI::App *command = app.add_subcommand("watch", "Show what a device sends, as it comes");
  const auto options = std::make_shared<Options>();
  command
      ->add_option("--report", options->reports,
                   "show this report: 0x76, 118 or a name; feature reports are asked for; may be repeated; all input "
                   "reports where none is named")
      ->type_name("REPORT")
      ->allow_extra_args(false);
  command->add_option("--interval", options->interval, "how often a feature report is asked for")
      ->check(secondsBetween(0.001, 1e6))
      ->type_name("SECONDS")
      ->capture_default_str();
  command->add_flag("--changes-only", options->run.changesOnly,
                    "leave out a report that differs from the one before in nothing but number and time");
  command->add_flag("--view", options->view, "on a terminal: a picture of the sensor image that is redrawn in place");
  command->add_option("--scan", options->scan, "which scan the view shows: D, P")
      ->check(CLI::IsMember({"D", "P"}, CLI::ignore_case))
      ->type_name("SCAN")
      ->capture_default_str();
  addCommon(*command, *options);
  options->output.addTo(*command);
  command->get_option("--output-file")
      ->description("write to FILE, which is whole at any moment; - is standard output");
  command->remove_option(command->get_option("--jobs"));  // there is nothing to share
  command->callback([options, &context] {
    if (options->output.form == "json")
      throw CLI::ValidationError("--output", "a JSON document has an end, which a stream has not; use jsonl");
    const bool isTerminal = options->output.file == "-" && ::isatty(STDOUT_FILENO) == 1;
    context.exitCode = options->view && isTerminal ? show(*options, context) : write(*options, context);
  });
}

void addRecord(CLI::App &app, CommandContext &context) {
  CLI::App *command = app.add_subcommand("record", "Put what a device sends into a recording, as it comes");
  const auto options = std::make_shared<Options>();
  options->output.form = "recording";
  command
      ->add_option("-O,--output-file", options->output.file,
                   "write to FILE, which is whole at any moment; - is standard output")
      ->type_name("FILE");
  command
      ->add_option("--feature", options->features,
                   "ask for this feature report too: ID@SECONDS, or all@SECONDS; every second without a time; may be "
                   "repeated")
      ->type_name("ID@SECONDS")
      ->allow_extra_args(false);
  command->add_flag("--no-identity", options->noIdentity,
                    "leave out what tells whose device it is: serial number, physical path and this machine's name");
  addCommon(*command, *options);
  command->callback([options, &context] { context.exitCode = write(*options, context); });
}

}  // namespace vesk::host
