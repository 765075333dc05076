// Rules for USB devices, which have attributes for their IDs, and for all others, which are known by the name of their
// HID folder.
#include "host/device/UdevRule.h"

#include <linux/input.h>

#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

std::string match(const DeviceIdentity &device) {
  const std::uint32_t vendor = device.vendor, product = device.product;
  if (device.bus == BUS_USB)
    return formatted<R"(KERNEL=="hidraw*", ATTRS{idVendor}=="%04x", ATTRS{idProduct}=="%04x", )">(vendor, product);
  return formatted<R"(KERNEL=="hidraw*", KERNELS=="%04X:%04X:%04X.*", )">(device.bus, vendor, product);
}

}  // namespace

std::string udevRule(const DeviceIdentity &device) {
  // uaccess works only in a file that sorts before the one that hands it out.
  std::string rule =
      "# Goes to /etc/udev/rules.d/70-vesk-report.rules. Then: udevadm control --reload-rules && udevadm trigger\n";
  rule += "# For whoever sits at the machine:\n";
  rule += match(device) + "TAG+=\"uaccess\"\n";
  rule += "# For those who log in over the network, as members of the group plugdev:\n";
  rule += match(device) + "GROUP=\"plugdev\", MODE=\"0660\"\n";
  return rule;
}

std::string busName(std::uint32_t bus) {
  switch (bus) {
    case BUS_PCI:
      return "PCI";
    case BUS_USB:
      return "USB";
    case BUS_BLUETOOTH:
      return "Bluetooth";
    case BUS_VIRTUAL:
      return "virtual";
    case BUS_I2C:
      return "I2C";
    case BUS_HOST:
      return "host";
    case BUS_SPI:
      return "SPI";
    case BUS_RMI:
      return "RMI";
    case BUS_INTEL_ISHTP:
      return "ISH";
    case BUS_AMD_SFH:
      return "SFH";
    default:
      return formatted<"bus 0x%02X">(bus);
  }
}

}  // namespace vesk::host
