// The program's own operator new.
#include "benchmarks/Allocations.h"

#include <cstdlib>
#include <new>

namespace {

std::uint64_t count = 0;

}  // namespace

namespace vesk::benchmarks {

std::uint64_t allocations() {
  return count;
}

}  // namespace vesk::benchmarks

void *operator new(std::size_t size) {
  ++count;
  if (void *memory = std::malloc(size == 0 ? 1 : size)) return memory;
  throw std::bad_alloc();
}

void operator delete(void *memory) noexcept {
  std::free(memory);
}

void operator delete(void *memory, std::size_t) noexcept {
  std::free(memory);
}
