// Counts what the program takes from the heap.
#pragma once

#include <cstdint>

namespace vesk::benchmarks {

/// Calls of operator new so far.
std::uint64_t allocations();

}  // namespace vesk::benchmarks
