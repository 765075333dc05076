// `decode` and `convert`: recordings in, display lines, values or reports out.
#include <memory>

#include "host/commands/Command.h"
#include "host/commands/InputOptions.h"
#include "host/commands/OutputOptions.h"
#include "host/input/ByteSource.h"

namespace vesk::host {

namespace {

struct Options {
  InputOptions input;
  OutputOptions output;
};

void readInput(ByteSource &source, const InputOptions &options, Pipeline &pipeline) {
  const std::string_view head = source.peek(kHeadSize).substr(0, kHeadSize);
  if (head.empty()) {
    pipeline.message({&kNoReports, source.name(), {}, {}, "the input is empty"});
    return;
  }
  const InputKind &kind = options.kind == "auto" ? detectInputKind(head) : *findInputKind(options.kind);
  pipeline.message({&kInputKind, source.name(), {}, {}, "read as " + std::string(kind.title)});
  ReadOptions readOptions = options.read;
  readOptions.kindForced = options.kind != "auto";
  kind.read(source, readOptions, pipeline);
}

void readFile(const std::string &path, const InputOptions &options, Pipeline &pipeline) {
  const std::string name = path == "-" ? "(standard input)" : path;
  try {
    readInput(*ByteSource::open(path), options, pipeline);
  } catch (const InputError &error) {
    pipeline.message({&kUnreadable, name, {}, {}, error.what()});
  }
  pipeline.finishFile(name);
}

void readAll(const InputOptions &options, Pipeline &pipeline) {
  for (const std::string &hex : options.hexReports) {
    ByteSource source("--hex", hex);
    InputOptions asHex = options;
    asHex.kind = "hex";
    readInput(source, asHex, pipeline);
    pipeline.finishFile(source.name());
  }
  for (const std::string &file : options.files) readFile(file, options, pipeline);
  if (options.files.empty() && options.hexReports.empty()) readFile("-", options, pipeline);
}

void run(Options &options, CommandContext &context) {
  options.output.format.arguments = context.arguments;
  Messages::Options messageOptions = context.messages;
  messageOptions.lenient = options.output.lenient;
  Messages messages(messageOptions);
  OutputFile output(options.output.file);
  const auto formatter = options.output.makeFormatter();
  Pipeline pipeline(options.output.pipeline(), options.input.filter, *formatter, output, messages);
  pipeline.begin();
  readAll(options.input, pipeline);
  pipeline.finish();
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
