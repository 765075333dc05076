// The event option byte: severity level in bits 0 to 2, what else the event triggers in bits 3 to 7.
#pragma once

#include <array>
#include <cstdint>
#include <string_view>

#include "values/PrintfFormat.h"
#include "values/ReportValue.h"

namespace vesk {

constexpr std::uint8_t kLevelMask = 0x07;

/// "TRACE" to "CRITICAL" for 0 to 5, "UNKNOWN" for all others.
constexpr std::string_view levelName(std::uint8_t level) {
  constexpr std::string_view kNames[] = {"TRACE", "DEBUG", "INFO", "WARNING", "ERROR", "CRITICAL"};
  return level > 5 ? "UNKNOWN" : kNames[level];
}

/// The words of an option byte, as they stand behind the colon.
using OptionText = TextBlock<48>;

/// With the level for an event, without it for a global setting.
extern const std::array<OptionText, 256> kOptionWithLevel;
extern const std::array<OptionText, 256> kOptionWithoutLevel;

/// Fills a dictionary that has room for two entries.
void addOption(EntryAdder out, std::uint8_t option);

}  // namespace vesk
