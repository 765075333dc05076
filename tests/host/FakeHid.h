// HID devices that are played to the host: each call gives what the test has put there.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>

#include <cerrno>
#include <deque>
#include <functional>
#include <map>
#include <mutex>
#include <variant>

#include "host/device/HidNode.h"

namespace test {

using vesk::host::DeviceIdentity;
using vesk::host::HidNode;
using vesk::host::HidSystem;
using vesk::host::milliseconds;

/// A descriptor that declares reports: Report ID, and Input or Feature.
inline std::string declaring(const std::vector<int> &inputs, const std::vector<int> &features) {
  std::string descriptor = "\x06";
  descriptor += std::string("\x00\xFF\x09\x01\xA1\x01", 6);
  for (const int id : inputs) descriptor += std::string("\x85") + static_cast<char>(id) + "\x81\x02";
  for (const int id : features) descriptor += std::string("\x85") + static_cast<char>(id) + "\xB1\x02";
  return descriptor + "\xC0";
}

inline std::string controllerDescriptor() {
  return declaring({0x76, 0x77},
                   {0xD0, 0xD2, 0xDC, 0xDE, 0xE0, 0xE1, 0xEA, 0xE2, 0xE3, 0xE4, 0xE5, 0xA2, 0xEC, 0xDF, 0xA9});
}

inline DeviceIdentity controller(std::string node = "/dev/hidraw1", std::string serial = "S1") {
  return {std::move(node),       3, 0x1234, 0x5678, "Vesk Controller", std::move(serial), "usb-1/input0",
          controllerDescriptor()};
}

inline DeviceIdentity mouse(std::string node = "/dev/hidraw0") {
  return {std::move(node), 3, 0x046D, 0xC077, "Mouse", "", "usb-2/input0", declaring({0x01}, {0xD0})};
}

/// What a read gives: a report, or an errno.
using Read = std::variant<std::string, int>;

class FakeNode : public HidNode {
 public:
  DeviceIdentity identityValue = controller();
  /// The answer to a feature request, or an errno.
  std::function<Read(std::uint8_t id)> onGetFeature = [](std::uint8_t) { return EIO; };
  /// What reads give in turn; afterwards EAGAIN, or ENODEV once `leaves` is set.
  std::deque<Read> inputs;
  bool leaves = false;
  int cannotWait = 0;  // an errno
  bool gone = false;
  std::size_t askedWith = 0;  // the size of the last request's buffer

  DeviceIdentity identity() override { return identityValue; }

  int getFeature(std::span<char> report) override {
    askedWith = report.size();
    return give(onGetFeature(static_cast<std::uint8_t>(report[0])), report);
  }

  int read(std::span<char> report) override {
    if (inputs.empty()) return leaves ? -ENODEV : -EAGAIN;
    const Read next = std::move(inputs.front());
    inputs.pop_front();
    return give(next, report);
  }

  int waitForReport(int wakeFd) override {
    pollfd wake{wakeFd, POLLIN, 0};
    if (cannotWait == 0) ::poll(&wake, 1, -1);
    return -cannotWait;
  }
  bool isGone(milliseconds) override { return gone; }

 private:
  static int give(const Read &read, std::span<char> report) {
    if (const int *error = std::get_if<int>(&read)) return -*error;
    const std::string &bytes = std::get<std::string>(read);
    EXPECT_LE(bytes.size(), report.size()) << "a buffer that cuts";
    std::copy(bytes.begin(), bytes.end(), report.begin());
    return static_cast<int>(bytes.size());
  }
};

class FakeSystem : public HidSystem {
 public:
  std::vector<DeviceIdentity> devices;
  /// Called for each open; gives a node or an errno.
  std::function<Opened(const std::string &path)> onOpen = [](const std::string &) { return Opened{nullptr, ENOENT}; };
  int opens = 0;

  std::vector<DeviceIdentity> list() override { return devices; }
  Opened open(const std::string &path) override {
    ++opens;
    return onOpen(path);
  }
};

}  // namespace test
