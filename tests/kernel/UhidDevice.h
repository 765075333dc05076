// One HID device that this process plays for the kernel through /dev/uhid.
#pragma once

#include <linux/uhid.h>

#include <cstdint>
#include <optional>
#include <string>

#include "Contents.h"

namespace vesk::bench {

struct Identity {
  std::string name = "Vesk Controller";
  std::string phys = "bench-0/input0";
  std::string uniq = "BENCH0001";
  std::uint16_t bus = 0x03;
  std::uint16_t vendor = 0x1234;
  std::uint16_t product = 0x5678;
  std::uint32_t version = 0x0100;
};

class UhidDevice {
 public:
  UhidDevice();  // throws std::system_error where there is no /dev/uhid
  ~UhidDevice();
  UhidDevice(const UhidDevice &) = delete;
  UhidDevice &operator=(const UhidDevice &) = delete;

  int descriptor() const { return file_; }

  void create(const Identity &identity, const Bytes &reportDescriptor);
  void destroy();
  void input(const Bytes &report);
  // The kernel accepts any answer: other lengths and IDs than declared, too.
  void answerGet(std::uint32_t request, std::uint16_t error, const Bytes &report);
  void answerSet(std::uint32_t request, std::uint16_t error);

  std::optional<uhid_event> next();  // nothing waits: nullopt

 private:
  void write(const uhid_event &event);

  int file_ = -1;
};

// The node of the device with this identity that is not named in `known`, as soon as it can be opened; blocks for
// up to two seconds and returns an empty string then.
std::string waitForNode(const Identity &identity, const std::vector<std::string> &known);
std::vector<std::string> hidrawNames();

}  // namespace vesk::bench
