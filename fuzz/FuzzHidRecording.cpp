// HID recordings.
#include "fuzz/ReadInput.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  return fuzz::readInput("hid-recording", data, size);
}
