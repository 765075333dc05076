// Reading of USB descriptors, as far as they help to find the controller.
#include "host/input/UsbDevices.h"

#include <algorithm>
#include <utility>

namespace vesk::host {

namespace {

constexpr std::uint8_t kDeviceDescriptor = 1, kInterfaceDescriptor = 4, kEndpointDescriptor = 5;
constexpr std::uint8_t kHidClass = 3;

struct DeviceDescriptor {
  U8 length, type;
  U16 usbVersion;
  U8 deviceClass, subclass, protocol, packetSize;
  U16 vendor, product;
};
static_assert(sizeof(DeviceDescriptor) == 12);  // as much of it as is read here

struct InterfaceDescriptor {
  U8 length, type, number, alternate, endpoints, interfaceClass, subclass, protocol, name;
};
static_assert(sizeof(InterfaceDescriptor) == 9);

struct EndpointDescriptor {
  U8 length, type, address, attributes;
  U16 packetSize;
  U8 interval;
};
static_assert(sizeof(EndpointDescriptor) == 7);

std::uint64_t keyOf(unsigned interface, const UsbPacket &packet) {
  return std::uint64_t{interface} << 32 | std::uint64_t{packet.bus} << 16 | packet.device;
}

}  // namespace

bool UsbDevice::isOtherInterface(std::uint16_t number) const {
  return std::find(otherInterfaces.begin(), otherInterfaces.end(), number) != otherInterfaces.end();
}

void UsbDevice::learnDevice(std::string_view descriptor) {
  if (descriptor.size() < sizeof(DeviceDescriptor)) return;
  const auto device = read<DeviceDescriptor>(descriptor.data());
  if (device.type != kDeviceDescriptor) return;
  const std::uint32_t found = std::uint32_t{device.vendor} << 16 | device.product;
  if (vendorProduct && *vendorProduct != found) {
    UsbDevice other;
    other.name = std::move(name);
    *this = std::move(other);
  }
  vendorProduct = found;
}

void UsbDevice::learnConfiguration(std::string_view descriptors) {
  bool otherClass = false;
  while (descriptors.size() >= 2) {
    const auto length = static_cast<std::uint8_t>(descriptors[0]), type = static_cast<std::uint8_t>(descriptors[1]);
    if (length < 2 || length > descriptors.size()) return;
    if (type == kInterfaceDescriptor && length >= sizeof(InterfaceDescriptor)) {
      const auto interface = read<InterfaceDescriptor>(descriptors.data());
      otherClass = interface.interfaceClass != kHidClass;
      std::erase(otherInterfaces, std::uint8_t{interface.number});
      if (otherClass) otherInterfaces.push_back(interface.number);
    } else if (type == kEndpointDescriptor && length >= sizeof(EndpointDescriptor)) {
      const auto found = read<EndpointDescriptor>(descriptors.data());
      if ((found.address & 0x80) != 0) {
        endpoint(found.address).packetSize = found.packetSize & 0x07FF;
        endpoint(found.address).otherClass = otherClass;
      }
    }
    descriptors.remove_prefix(length);
  }
}

UsbDevice *UsbDevices::find(unsigned interface, const UsbPacket &packet) {
  const auto found = devices_.find(keyOf(interface, packet));
  return found == devices_.end() ? nullptr : &found->second;
}

UsbDevice &UsbDevices::get(unsigned interface, const UsbPacket &packet) {
  if (UsbDevice *known = find(interface, packet)) return *known;
  if (devices_.size() == kMost) {
    forgotten_ += kMost;
    devices_.clear();
  }
  UsbDevice &device = devices_[keyOf(interface, packet)];
  device.name = std::to_string(packet.bus) + "." + std::to_string(packet.device);
  return device;
}

}  // namespace vesk::host
