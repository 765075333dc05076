// Any bytes through the reader of one input kind.
#pragma once

#include <cstddef>
#include <cstdint>

namespace fuzz {

/// Reads the bytes behind a flag byte as the kind of that name; once from memory, once as a slow pipe would bring them,
/// a few at a time, and expects the same. Always returns 0.
int readInput(const char *kind, const std::uint8_t *data, std::size_t size);

}  // namespace fuzz
