// The error value that option handling hands out.
#pragma once

#include <cstdint>
#include <map>
#include <string>

/// What went wrong, in words and as a number that other programs can compare.
struct PluginError {
  /// The key of userInfo under which the message stands.
  static constexpr const char *kLocalizedDescription = "LocalizedDescription";

  std::string domain;
  std::int64_t code = 0;
  std::map<std::string, std::string> userInfo;

  /// The message, or an empty text where there is none.
  std::string localizedDescription() const;
  /// Domain, code and message on one line; control characters of the message are escaped there.
  std::string description() const;
};
