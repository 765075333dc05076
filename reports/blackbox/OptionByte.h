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

/// levelName() and a blank, for the rows that are printed most.
extern const std::array<TextBlock<16>, kLevelMask + 1> kLevelTexts;

constexpr unsigned kFlagShift = 3;
using FlagText = TextBlock<40>;
/// The words of the flags in bits 3 to 7, each with a blank behind it; "(no options set)" for none.
extern const std::array<FlagText, 32> kFlagTexts;

/// Fills a dictionary that has room for two entries.
void addOption(EntryAdder out, std::uint8_t option);

}  // namespace vesk
