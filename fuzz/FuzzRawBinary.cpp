// Raw binary, one report or many.
#include "fuzz/ReadInput.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  return fuzz::readInput("raw", data, size);
}
