// HID devices as Linux shows them: nodes /dev/hidrawN, and their folders in /sys.
#pragma once

#include "host/device/HidNode.h"

namespace vesk::host {

class Hidraw : public HidSystem {
 public:
  explicit Hidraw(std::string classFolder = "/sys/class/hidraw") : classFolder_(std::move(classFolder)) {}

  std::vector<DeviceIdentity> list() override;
  Opened open(const std::string &path) override;

 private:
  std::string classFolder_;
};

}  // namespace vesk::host
