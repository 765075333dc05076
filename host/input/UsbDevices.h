// What a capture tells of the devices in it: their names, their interfaces, and whether they speak our reports.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "host/input/InputAssembly.h"
#include "host/input/UsbPacket.h"

namespace vesk::host {

/// An IN endpoint, of which a device has at most fifteen.
struct UsbEndpoint {
  InputAssembly assembly;
  std::uint16_t packetSize = 0;  // wMaxPacketSize; 0 where no descriptor tells
  bool otherClass = false;       // belongs to an interface that is no HID interface
  bool ours = false;             // has given a whole report of ours
  bool inPieces = false;         // and in several transfers
};

struct UsbDevice {
  std::string name;  // "1.7": bus and address
  std::optional<std::uint32_t> vendorProduct;
  bool ours = false;                          // has given a report of ours
  std::vector<std::uint8_t> otherInterfaces;  // that are no HID interfaces, as the configuration descriptor says
  std::array<UsbEndpoint, 16> endpoints;

  UsbEndpoint &endpoint(std::uint8_t address) { return endpoints[address & 0x0F]; }
  bool isOtherInterface(std::uint16_t number) const;

  /// Takes the answer to a request for the device descriptor, which may be cut. A device with other numbers at the same
  /// address is another device, so what was known is forgotten.
  void learnDevice(std::string_view descriptor);
  /// The same for a configuration with its interfaces and endpoints.
  void learnConfiguration(std::string_view descriptors);
};

/// Bounded: beyond kMost devices it forgets them all, which no true capture brings about.
class UsbDevices {
 public:
  static constexpr std::size_t kMost = 4096;

  /// Null where nothing is known.
  UsbDevice *find(unsigned interface, const UsbPacket &packet);
  UsbDevice &get(unsigned interface, const UsbPacket &packet);
  std::uint64_t forgotten() const { return forgotten_; }

  template <class Visit>
  void forEach(Visit visit) {
    for (auto &[key, device] : devices_) visit(device);
  }

 private:
  std::unordered_map<std::uint64_t, UsbDevice> devices_;
  std::uint64_t forgotten_ = 0;
};

}  // namespace vesk::host
