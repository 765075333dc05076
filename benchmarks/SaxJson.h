// The values of four reports as JSON through RapidJSON's SAX writer, straight from the bytes and without a tree: the
// fastest that a well-known library does.
#pragma once

#include <string_view>

namespace vesk::benchmarks {

/// Reports 0x76, 0x77, 0xE1 and 0xE2. The text lives until the next call.
std::string_view saxJson(const char *report, unsigned id);

}  // namespace vesk::benchmarks
