// What every command is given, and what it gives back.
#pragma once

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

#include "host/diagnostics/Messages.h"

namespace vesk::host {

/// The options that all commands share, and where a command leaves its exit code.
struct CommandContext {
  Messages::Options messages;
  std::vector<std::string> arguments;  // the command line without the program's name
  int exitCode = kExitOk;
};

// Each adds one command to the program; its work is done in the command's callback.
void addDecode(CLI::App &app, CommandContext &context);
void addConvert(CLI::App &app, CommandContext &context);
void addReports(CLI::App &app, CommandContext &context);
void addExplain(CLI::App &app, CommandContext &context);
void addList(CLI::App &app, CommandContext &context);
void addRead(CLI::App &app, CommandContext &context);
void addSnapshot(CLI::App &app, CommandContext &context);
void addWatch(CLI::App &app, CommandContext &context);
void addRecord(CLI::App &app, CommandContext &context);
void addUdevRule(CLI::App &app, CommandContext &context);

}  // namespace vesk::host
