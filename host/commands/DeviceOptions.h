// The options that say which device is meant and how long it may take to answer.
#pragma once

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

#include "host/device/HidNode.h"

namespace vesk::host {

/// CLI::Range without NaN, which lies in every range there.
CLI::Validator secondsBetween(double least, double most);

struct DeviceOptions {
  std::string device;  // empty: the one that speaks our reports
  double timeoutSeconds = 5;

  void addDevice(CLI::App &command);
  void addTimeout(CLI::App &command);
  milliseconds timeout() const { return toMilliseconds(timeoutSeconds); }

  static milliseconds toMilliseconds(double seconds) { return milliseconds(static_cast<std::int64_t>(seconds * 1000)); }
};

/// The IDs of the feature reports that are named, "all" being all of them. Throws CLI::ValidationError.
std::vector<std::uint32_t> featureIds(const std::vector<std::string> &names);

}  // namespace vesk::host
