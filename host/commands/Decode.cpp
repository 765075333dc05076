// `decode` and `convert`: recordings in, display lines, values or reports out.
#include <unistd.h>

#include <memory>

#include "host/commands/Command.h"
#include "host/commands/InputOptions.h"
#include "host/commands/OutputOptions.h"
#include "host/commands/ReadInputs.h"

namespace vesk::host {

namespace {

struct Options {
  InputOptions input;
  OutputOptions output;
};

void run(Options &options, CommandContext &context) {
  options.output.format.arguments = context.arguments;
  OutputFile output(options.output.file);
  Messages::Options messageOptions = context.messages;
  messageOptions.lenient = options.output.lenient;
  messageOptions.overProgress = options.input.showProgress =
      !messageOptions.quiet && ::isatty(STDERR_FILENO) == 1 && !output.isTerminal();
  Messages messages(messageOptions);
  const auto formatter = options.output.makeFormatter();
  Pipeline pipeline(options.output.pipeline(), options.input.filter, *formatter, output, messages);
  runInputs(options.input, pipeline);
  context.exitCode = messages.exitCode();
}

void addCommand(CLI::App &app, CommandContext &context, const char *name, const char *description, const char *form) {
  CLI::App *command = app.add_subcommand(name, description);
  const auto options = std::make_shared<Options>();
  options->output.form = form;
  options->input.addTo(*command);
  options->output.addTo(*command);
  command->callback([options, &context] { run(*options, context); });
}

}  // namespace

void addDecode(CLI::App &app, CommandContext &context) {
  addCommand(app, context, "decode", "Decode recordings, captures, hex text and raw reports", "text");
}

void addConvert(CLI::App &app, CommandContext &context) {
  addCommand(app, context, "convert", "Turn any input into a recording, hex text or raw reports", "recording");
}

}  // namespace vesk::host
