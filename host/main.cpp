// vesk-report: decodes the Vesk controller's reports from recordings and live devices.
#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <new>
#include <sstream>

#include "host/commands/Command.h"
#include "host/output/OutputFile.h"

namespace {

using namespace vesk::host;

constexpr std::string_view kOutOfMemory = "vesk-report: error: out of memory\n";

constexpr const char *kExitCodes =
    "Exit codes, the highest that applies:\n"
    "  0  all well\n"
    "  2  wrong usage\n"
    "  3  an input or a device could not be opened or read\n"
    "  4  a report could not be decoded as it should be\n"
    "  5  output could not be written\n";

/// The arguments behind the program's name. "-decimal" is the plug-in's own spelling of an option and would be read as
/// a bundle of one-letter options; a file name in brackets would be read as a list of names.
std::vector<std::string> takeArguments(int argc, char **argv) {
  std::vector<std::string> arguments(argv + std::min(argc, 1), argv + argc);
  bool options = true, behindOption = false;
  for (std::string &argument : arguments) {
    if (options && argument == "-decimal") argument = "--decimal";
    if (!behindOption && argument.starts_with('[') && argument.ends_with(']')) argument.insert(0, "./");
    options = options && argument != "--";
    behindOption = options && argument.starts_with('-') && argument != "-";
  }
  return arguments;
}

/// Whoever started us may have closed standard input, output or error. The next file that is opened must not be taken
/// for one of them; what stands there instead fails when it is used.
void occupyStandardDescriptors() {
  for (const int fd : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
    if (::fcntl(fd, F_GETFD) == -1) ::open("/dev/null", fd == STDIN_FILENO ? O_WRONLY : O_RDONLY);
}

/// Memory that runs out while the command line is put together does so in functions of its library that must not throw,
/// which would end in abort(). Nothing has been opened yet.
[[noreturn]] void endWithoutMemory() {
  [[maybe_unused]] const auto written = ::write(STDERR_FILENO, kOutOfMemory.data(), kOutOfMemory.size());
  ::_exit(kExitUnreadable);
}

/// Prints what was asked for (help, the version) or what is wrong with the command line.
ExitCode answer(const CLI::App &app, const CLI::ParseError &error) {
  std::ostringstream out, problem;
  const bool good = app.exit(error, out, problem) == 0;
  std::fputs(problem.str().c_str(), stderr);
  OutputFile("-").write(out.str());
  return good ? kExitOk : kExitUsage;
}

int runProgram(int argc, char **argv) {
  CommandContext context;
  context.arguments.assign(argv + std::min(argc, 1), argv + argc);
  context.messages.colour = ::isatty(STDERR_FILENO) == 1 && std::getenv("NO_COLOR") == nullptr;

  CLI::App app("Decodes the vendor reports of the Vesk controller", "vesk-report");
  app.set_version_flag("--version", "vesk-report " VESK_REPORT_VERSION);
  app.footer(kExitCodes);
  app.require_subcommand(1);
  app.fallthrough();
  app.parse_complete_callback([] { std::set_new_handler(nullptr); });  // a command's run raises std::bad_alloc
  app.add_flag("-q,--quiet", context.messages.quiet, "errors only");
  app.add_flag("-v,--verbose", context.messages.verbose,
               "notes too, and every message rather than the first of its kind");
  addDecode(app, context);
  addConvert(app, context);
  addReports(app, context);
  addExplain(app, context);
  addList(app, context);
  addRead(app, context);
  addSnapshot(app, context);
  addWatch(app, context);
  addRecord(app, context);
  addUdevRule(app, context);

  try {
    std::vector<std::string> arguments = takeArguments(argc, argv);
    std::reverse(arguments.begin(), arguments.end());  // CLI11 takes them from the back
    app.parse(std::move(arguments));
  } catch (const CLI::ParseError &error) {
    return answer(app, error);
  }
  return context.exitCode;
}

}  // namespace

int main(int argc, char **argv) {
  occupyStandardDescriptors();
  // Both would kill; without them the call fails and says why.
  std::signal(SIGPIPE, SIG_IGN);
  std::signal(SIGXFSZ, SIG_IGN);
  std::set_new_handler(endWithoutMemory);
  try {
    return runProgram(argc, argv);
  } catch (const PipeClosed &) {
    return kExitOk;
  } catch (const OutputError &error) {
    std::fprintf(stderr, "vesk-report: error: %s\n", error.what());
    return kExitOutput;
  } catch (const std::bad_alloc &) {
    std::fputs(kOutOfMemory.data(), stderr);
    return kExitUnreadable;
  } catch (const std::exception &error) {
    std::fprintf(stderr, "vesk-report: error: %s\n", error.what());
    return kExitUnreadable;
  }
}
