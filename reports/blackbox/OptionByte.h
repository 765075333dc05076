// The event option byte: severity level in bits 0 to 2, what else the event triggers in bits 3 to 7.
#pragma once

#include <array>
#include <cstdint>
#include <string_view>

#include "values/PrintfFormat.h"
#include "values/ReportValue.h"

namespace vesk {

constexpr std::uint8_t kLevelMask = 0x07;

inline constexpr Key kLevelNames[] = {"TRACE", "DEBUG", "INFO", "WARNING", "ERROR", "CRITICAL", "UNKNOWN"};

/// "TRACE" to "CRITICAL" for 0 to 5, "UNKNOWN" for all others.
constexpr Key levelName(std::uint8_t level) {
  return kLevelNames[level < 6 ? level : 6];
}

/// levelName() and a blank, for the rows that are printed most.
extern const std::array<TextBlock<16>, kLevelMask + 1> kLevelTexts;

constexpr unsigned kFlagShift = 3;
using FlagText = TextBlock<40>;
/// The words of the flags in bits 3 to 7, each with a blank behind it; "(no options set)" for none.
extern const std::array<FlagText, 32> kFlagTexts;

/// Fills a dictionary that has room for two entries.
inline void addOption(EntryAdder out, std::uint8_t option) {
  out.add("ERROR_LEVEL", Text(levelName(option & kLevelMask)));
  out.add("OPTIONS_RAW", i32(option));  // whole: a consumer takes the flags out of it
}

}  // namespace vesk
