// The options that say in which form and where to decoded reports go; the same for every command that decodes.
#pragma once

#include <CLI/CLI.hpp>
#include <memory>
#include <string>

#include "host/decode/Pipeline.h"
#include "host/output/Formatter.h"

namespace vesk::host {

struct OutputOptions {
  std::string form = "text";
  std::string file = "-";
  bool decimal = false;
  bool lenient = false;
  unsigned jobs = 0;  // 0: as many as the machine has use for
  FormatOptions format;

  /// Adds -o, -O, -decimal and the others to a command, as one group.
  void addTo(CLI::App &command);

  std::unique_ptr<Formatter> makeFormatter() const;
  /// For recordings; live input flushes each report instead of sharing the work.
  Pipeline::Options pipeline() const;
};

}  // namespace vesk::host
