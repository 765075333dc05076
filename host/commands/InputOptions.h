// The options that say which inputs are read, how, and which of their reports are wanted.
#pragma once

#include <CLI/CLI.hpp>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/input/Input.h"
#include "host/report/Filter.h"

namespace vesk::host {

struct InputOptions {
  std::vector<std::string> files;
  std::vector<std::string> hexReports;
  std::string kind = "auto";
  ReadOptions read;
  Filter filter;
  bool showProgress = false;

  /// Adds the files, --hex, --input-format, --type, --split and the filters to a command.
  void addTo(CLI::App &command);
};

}  // namespace vesk::host
