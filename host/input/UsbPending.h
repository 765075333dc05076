// The control transfers of a capture that were asked for and not yet answered.
#pragma once

#include <cstdint>
#include <list>
#include <optional>
#include <unordered_map>

#include "host/input/UsbPacket.h"

namespace vesk::host {

/// Remembers submits until their completion takes them. Bounded: the oldest gives way.
class UsbPending {
 public:
  static constexpr std::size_t kMost = 65536;

  struct Submit {
    unsigned interface = 0;  // of the capture: two of them may watch the same bus
    std::uint16_t bus = 0, device = 0;
    std::uint64_t transferId = 0;
    UsbSetup setup{};
    std::uint64_t packet = 0;  // its number
  };

  /// Returns a submit that will never be answered: one whose transfer ID is used again now, or the oldest of too many.
  std::optional<Submit> add(const Submit &submit);
  std::optional<Submit> take(unsigned interface, std::uint16_t bus, std::uint64_t transferId);
  /// The oldest, for the end of the capture.
  std::optional<Submit> takeOldest();

 private:
  using Submits = std::list<Submit>;

  struct Key {
    unsigned interface;
    std::uint16_t bus;
    std::uint64_t transferId;
    friend bool operator==(const Key &, const Key &) = default;
  };
  struct Hash {
    std::size_t operator()(const Key &key) const {
      return static_cast<std::size_t>(
          (key.transferId ^ std::uint64_t{key.bus} << 48 ^ std::uint64_t{key.interface} << 32) * 0x9E3779B97F4A7C15);
    }
  };
  using Index = std::unordered_map<Key, Submits::iterator, Hash>;

  Submit remove(Index::iterator entry);

  Submits submits_;  // in the order in which they came
  Index index_;
};

}  // namespace vesk::host
