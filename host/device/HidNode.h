// The seam to the kernel: all that is asked of HID devices, as thin as the kernel's own calls, so that tests can answer
// in its place.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

namespace vesk::host {

using std::chrono::milliseconds;

/// Who a device is.
struct DeviceIdentity {
  std::string node;       // "/dev/hidraw3"
  std::uint32_t bus = 0;  // in the kernel's numbers
  std::uint16_t vendor = 0;
  std::uint16_t product = 0;
  std::string name, serial, physicalPath;  // empty where the device does not say
  std::string descriptor;                  // its report descriptor
  int unreadable = 0;                      // an errno: why the machine does not tell all of this
};

/// An open device. Its functions may be called from several threads at once.
class HidNode {
 public:
  /// Kernels refuse to fill more than this for some transports, and a device cannot answer with more.
  static constexpr std::size_t kFullBuffer = 4096;

  virtual ~HidNode() = default;

  virtual DeviceIdentity identity() = 0;
  /// Asks for the feature report whose ID is report[0] and waits for it; a signal ends the wait. Returns the bytes that
  /// came, the ID among them, or minus an errno.
  virtual int getFeature(std::span<char> report) = 0;
  /// Takes the oldest input report of the queue. Returns its bytes, or minus an errno: EAGAIN where none waits, EIO or
  /// ENODEV where the device has gone and all that it had sent was taken.
  virtual int read(std::span<char> report) = 0;
  /// Waits until there is something to read, the device has gone or `wakeFd` can be read; a signal may end it too.
  /// Returns 0, or minus an errno where it cannot wait.
  virtual int waitForReport(int wakeFd) = 0;
  /// Whether the device has gone, or goes within this time: a request that it leaves unanswered fails a little before
  /// the node knows.
  virtual bool isGone(milliseconds within) = 0;
};

class HidSystem {
 public:
  struct Opened {
    std::unique_ptr<HidNode> node;
    int error = 0;  // an errno where there is no node
  };

  virtual ~HidSystem() = default;

  /// All HID devices; needs no rights. Throws DeviceError where the machine does not tell.
  virtual std::vector<DeviceIdentity> list() = 0;
  /// Opens for reading only, so that nothing can ever be written to a device.
  virtual Opened open(const std::string &path) = 0;
};

}  // namespace vesk::host
