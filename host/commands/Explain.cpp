// `explain`: the layout of a report, or a report's bytes beside what they mean.
#include <memory>

#include "host/commands/Command.h"
#include "host/commands/ReadInputs.h"
#include "host/output/FieldsFormatter.h"
#include "host/report/Layouts.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

struct Options {
  std::vector<std::string> reports;
  InputOptions input;

  bool hasInput() const { return !input.files.empty() || !input.hexReports.empty(); }
};

std::string padded(std::string_view text, std::size_t width) {
  std::string cell(text);
  cell.resize(std::max(width, cell.size()), ' ');
  return cell;
}

std::string leftPadded(std::string_view text, std::size_t width) {
  return std::string(text.size() < width ? width - text.size() : 0, ' ') + std::string(text);
}

std::string lengthText(const KnownReport &report) {
  switch (report.length) {
    case KnownReport::Length::kExact:
      return "exactly " + std::to_string(report.layoutSize) + " bytes; any other length is not decoded";
    case KnownReport::Length::kAtLeast:
      return std::to_string(report.layoutSize) + " bytes; what a shorter one lacks is read as zero";
    case KnownReport::Length::kText:
      return "a text of any length";
  }
  return {};
}

std::string typeText(const Field &field) {
  std::string text;
  if (field.bit) return "bit " + std::to_string(*field.bit);
  text += fieldTypeName(field.type);
  if (field.count > 1 && elementWidth(field.type) > 1) text += " x " + std::to_string(field.count);
  return text;
}

std::string_view labelText(const Field &field) {
  return field.label.empty() ? "(all lines)" : std::string_view(field.label);
}
std::string_view keyText(const Field &field) {
  return field.key.empty() ? "(the value itself)" : std::string_view(field.key);
}

/// How many bytes: a text has as many as it needs.
std::string widthText(const Field &field) {
  return field.type == FieldType::kString ? "any" : std::to_string(field.width());
}

/// A note in lines that a terminal takes, each behind a margin.
std::string noteLines(std::string_view note) {
  constexpr std::size_t kMargin = 26, kWidth = 90;
  std::string lines;
  while (!note.empty()) {
    const std::size_t end = note.size() <= kWidth ? note.size() : note.rfind(' ', kWidth);
    lines += std::string(kMargin, ' ') + std::string(note.substr(0, end)) + "\n";
    note.remove_prefix(std::min(end + 1, note.size()));
  }
  return lines;
}

/// One row a field, and under it what there is to say about it.
std::string fieldTable(const std::vector<Field> &fields) {
  std::size_t labelWidth = 9, keyWidth = 12;
  for (const Field &field : fields) {
    labelWidth = std::max(labelWidth, labelText(field).size());
    keyWidth = std::max(keyWidth, keyText(field).size());
  }
  std::string table = "offset  bytes  type       " + padded("on screen", labelWidth) + "  " +
                      padded("in the value", keyWidth) + "  unit\n";
  for (const Field &field : fields) {
    std::string row = formatted<"%6u  ">(field.offset) + leftPadded(widthText(field), 5) + "  " +
                      padded(typeText(field), 9) + "  " + padded(labelText(field), labelWidth) + "  " +
                      padded(keyText(field), keyWidth) + "  " + field.unit;
    row.resize(row.find_last_not_of(' ') + 1);
    table += row + "\n";
    table += noteLines(field.note);
  }
  return table;
}

std::string explanation(const KnownReport &report) {
  std::string text =
      formatted<"0x%02X ">(unsigned{report.id}) + std::string(report.name) + ": " + std::string(report.title) + "\n";
  text += std::string(typeName(report.type)) + " report, " + lengthText(report) + "; decoder " +
          std::string(report.decoder) + "\n";
  for (const FieldRow &row : report.fields)
    if (row.type == FieldType::kModules)
      text += "from byte " + std::to_string(row.offset) + ":\n" + noteLines(row.note);
  return text + "\n" + fieldTable(layoutOf(report));
}

void explainLayouts(const Options &options) {
  std::string text;
  for (const std::string &name : options.reports) {
    if (!text.empty()) text += "\n";
    text += explanation(*findReport(name));
  }
  OutputFile("-").write(text);
}

void explainReports(const Options &options, CommandContext &context) {
  Messages messages(context.messages);
  OutputFile output("-");
  const auto formatter = makeFieldsFormatter();
  Pipeline pipeline({}, options.input.filter, *formatter, output, messages);
  runInputs(options.input, pipeline);
  context.exitCode = messages.exitCode();
}

void run(Options &options, CommandContext &context) {
  for (const std::string &name : options.reports)
    if (!options.input.filter.addReport(name))
      throw CLI::ValidationError("REPORT", "no report is called " + name + "; 'vesk-report reports' lists them");
  if (options.hasInput())
    explainReports(options, context);
  else if (options.reports.empty())
    throw CLI::ValidationError("explain", "name a report, or give one with --bytes or --hex");
  else
    explainLayouts(options);
}

}  // namespace

void addExplain(CLI::App &app, CommandContext &context) {
  CLI::App *command = app.add_subcommand("explain", "Show how a report is laid out, or what the bytes of one mean");
  const auto options = std::make_shared<Options>();
  command->add_option("reports", options->reports, "which reports: 0xE0, 224 or a name")->type_name("REPORT");
  command
      ->add_option("--bytes", options->input.files,
                   "show the fields of this input's reports, each with its bytes and its value; - is standard input")
      ->type_name("FILE")
      ->allow_extra_args(false);
  command->add_option("--hex", options->input.hexReports, "the same for a report as hex digits")
      ->type_name("TEXT")
      ->allow_extra_args(false);
  command->add_flag("--split", options->input.read.split,
                    "raw: many reports one behind the other, each as long as its ID says");
  command->callback([options, &context] { run(*options, context); });
}

}  // namespace vesk::host
