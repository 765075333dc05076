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
  /// Domain, code and message on one line: what would end it or move a cursor (control characters, U+2028, U+2029) is
  /// written as \xNN, byte by byte.
  std::string description() const;
};
