// Reading of inputs: their kind, their reports, and what is told at the end of each.
#include "host/commands/ReadInputs.h"

#include "host/diagnostics/Progress.h"
#include "host/input/ByteSource.h"

namespace vesk::host {

namespace {

void readInput(ByteSource &source, const InputOptions &options, Pipeline &pipeline) {
  const std::string_view head = source.peek(kHeadSize).substr(0, kHeadSize);
  if (head.empty()) {
    source.checkEnd();
    pipeline.message({&kNoReports, source.name(), {}, {}, "the input is empty"});
    return;
  }
  const InputKind &kind = options.kind == "auto" ? detectInputKind(head) : *findInputKind(options.kind);
  pipeline.message({&kInputKind, source.name(), {}, {}, "read as " + std::string(kind.title)});
  ReadOptions readOptions = options.read;
  readOptions.kindForced = options.kind != "auto";
  kind.read(source, readOptions, pipeline);
  source.checkEnd();
}

void readFile(const std::string &path, const InputOptions &options, Pipeline &pipeline) {
  const std::string name = path == "-" ? "(standard input)" : path;
  try {
    std::optional<Progress> progress;
    ByteSource::Watch watch;
    if (options.showProgress) {
      progress.emplace(name);
      watch = [&](std::uint64_t read, std::optional<std::uint64_t> size) {
        progress->update(read, size, pipeline.reports());
      };
    }
    readInput(*ByteSource::open(path, watch), options, pipeline);
  } catch (const InputError &error) {
    pipeline.message({&kUnreadable, name, {}, {}, error.what()});
  }
  pipeline.finishFile(name);
}

}  // namespace

void readInputs(const InputOptions &options, Pipeline &pipeline) {
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

void runInputs(const InputOptions &options, Pipeline &pipeline) {
  try {
    pipeline.begin();
    readInputs(options, pipeline);
    pipeline.finish();
  } catch (const PipeClosed &) {  // what was found before it left counts
  }
}

}  // namespace vesk::host
