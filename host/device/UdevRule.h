// The udev rule that gives users access to a device.
#pragma once

#include <string>

#include "host/device/HidNode.h"

namespace vesk::host {

/// Whole lines, ready to paste into a rules file, with comments that say where it goes.
std::string udevRule(const DeviceIdentity &device);

/// "USB", "I2C" ...; "bus 0x42" for one without a name.
std::string busName(std::uint32_t bus);

}  // namespace vesk::host
