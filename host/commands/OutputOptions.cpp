// Output options and the formatter that they ask for.
#include "host/commands/OutputOptions.h"

#include <algorithm>
#include <thread>

namespace vesk::host {

namespace {

/// One thread reads and one at a time writes; beyond this they would only wait for each other.
constexpr unsigned kMostUseful = 8;

}  // namespace

void OutputOptions::addTo(CLI::App &command) {
  std::vector<std::string> names;
  std::string description = "output form:";
  for (const OutputKind &kind : outputKinds()) {
    names.emplace_back(kind.name);
    description += (names.size() == 1 ? " " : ", ") + names.back();
  }
  command.add_option("-o,--output", form, description)
      ->check(CLI::IsMember(names))
      ->type_name("FORM")
      ->capture_default_str()
      ->group("Output");
  command
      .add_option("-O,--output-file", file, "write to FILE, which appears whole or not at all; - is standard output")
      ->type_name("FILE")
      ->group("Output");
  command.add_flag("--decimal", decimal, "number arrays in decimal (also -decimal)")->group("Output");
  command.add_flag("--headers", format.headers, "text: a line before each report that says where it comes from")
      ->group("Output");
  command.add_flag("--with-lines", format.withLines, "json, jsonl: the display lines too")->group("Output");
  command.add_flag("--with-bytes", format.withBytes, "json, jsonl: the report's bytes too")->group("Output");
  command.add_flag("--lenient", lenient, "a report shorter than its layout is a warning, not an error")
      ->group("Output");
  command.add_option("-j,--jobs", jobs, "threads that decode; the output is the same for every number")
      ->check(CLI::Range(1u, 256u))
      ->type_name("N")
      ->group("Output");
}

Pipeline::Options OutputOptions::pipeline() const {
  const unsigned cores = std::max(1u, std::thread::hardware_concurrency());
  return {decimal, lenient, false, jobs != 0 ? jobs : std::min(cores, kMostUseful)};
}

std::unique_ptr<Formatter> OutputOptions::makeFormatter() const {
  return findOutputKind(form)->make(format);
}

}  // namespace vesk::host
