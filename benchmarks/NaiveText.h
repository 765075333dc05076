// Display lines as one would write them without a thought of speed: a string a line, made by snprintf.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace vesk::benchmarks {

/// The lines of reports 0x76, 0x77, 0xA2, 0xE1, 0xE2 and 0xEC; none for any other.
std::vector<std::string> naiveLines(const char *report, unsigned id, bool decimal);

}  // namespace vesk::benchmarks
