// Input options.
#include "host/commands/InputOptions.h"

#include "host/input/PlainText.h"

namespace vesk::host {

namespace {

/// Exact, as inputs tell it: a double would miss a report whose time is given since 1970.
std::int64_t nanoseconds(const std::string &option, const std::string &text) {
  const bool negative = text.starts_with('-');
  const std::string digits = text.substr(negative ? 1 : 0);
  const auto time = parseSeconds(digits.starts_with('.') ? "0" + digits : digits);
  if (!time) throw CLI::ValidationError(option, "a time in seconds was expected, as 12 or 0.004120, not " + text);
  return negative ? -*time : *time;
}

}  // namespace

void InputOptions::addTo(CLI::App &command) {
  command.add_option("files", files, "inputs of any kind; - or none is standard input")->type_name("FILE");
  command.add_option("--hex", hexReports, "a report as hex digits on the command line")
      ->type_name("TEXT")
      ->allow_extra_args(false);

  std::vector<std::string> kinds = {"auto"};
  std::string description = "what the inputs are:";
  for (const InputKind &known : inputKinds()) kinds.emplace_back(known.name);
  for (const std::string &name : kinds) description += (&name == &kinds.front() ? " " : ", ") + name;
  command.add_option("--input-format", kind, description)
      ->check(CLI::IsMember(kinds))
      ->type_name("KIND")
      ->capture_default_str()
      ->group("Input");
  command.add_flag("--split", read.split, "raw: many reports one behind the other, each as long as its ID says")
      ->group("Input");

  command
      .add_option_function<std::string>(
          "--type",
          [this](const std::string &word) {
            const ReportType type = word == "input" ? ReportType::kInput : ReportType::kFeature;
            filter.type = type;
            read.forcedType = type;
          },
          "take reports of this type only; where the input does not tell it, all reports are of it")
      ->check(CLI::IsMember({"feature", "input"}))
      ->type_name("TYPE")
      ->group("Filters");
  command
      .add_option_function<std::vector<std::string>>(
          "--report",
          [this](const std::vector<std::string> &names) {
            for (const std::string &name : names)
              if (!filter.addReport(name))
                throw CLI::ValidationError("--report",
                                           "no report is called " + name + "; 'vesk-report reports' lists them");
          },
          "take this report only: 0xE0, 224 or a name; may be repeated")
      ->type_name("REPORT")
      ->allow_extra_args(false)
      ->group("Filters");
  command
      .add_option_function<std::string>(
          "--device", [this](const std::string &name) { filter.setDevice(name); },
          "take this device only: bus.address, a recording's index, or vendor:product")
      ->type_name("DEVICE")
      ->group("Filters");
  command
      .add_option_function<std::string>(
          "--from", [this](const std::string &text) { filter.fromNs = nanoseconds("--from", text); },
          "take reports from this time on, in seconds from the start of the input; none that has no time")
      ->type_name("SECONDS")
      ->group("Filters");
  command
      .add_option_function<std::string>(
          "--to", [this](const std::string &text) { filter.toNs = nanoseconds("--to", text); }, "and up to this time")
      ->type_name("SECONDS")
      ->group("Filters");
}

}  // namespace vesk::host
