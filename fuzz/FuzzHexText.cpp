// Hex text in all its layouts.
#include "fuzz/ReadInput.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  return fuzz::readInput("hex", data, size);
}
