// What a device says of itself: its descriptor, its name, its serial number and its place. A hostile one can say
// anything; the recordings that begin with it must read back, and nothing of it may give orders to a terminal or to
// udev.
#include <algorithm>
#include <functional>

#include "fuzz/FuzzInput.h"
#include "fuzz/RecordedReports.h"
#include "host/device/DeviceRecording.h"
#include "host/device/OpenDevice.h"
#include "host/device/ReportDescriptor.h"
#include "host/device/UdevRule.h"

namespace {

using fuzz::check;
using fuzz::RecordedReports;
using namespace vesk::host;

constexpr std::time_t kNow = 1'700'000'000;

void checkPrintable(std::string_view text, const char *what) {
  for (const char c : text)
    check(c == '\n' || (static_cast<unsigned char>(c) >= ' ' && c != 0x7F), std::string(what) + " holds no orders");
}

/// What is declared grows with the descriptor: later items take nothing back.
void checkDescriptor(std::string_view descriptor) {
  const auto whole = declaredReports(descriptor);
  check(std::adjacent_find(whole.begin(), whole.end(), std::greater_equal<>()) == whole.end(), "in order, each once");
  const auto half = declaredReports(descriptor.substr(0, descriptor.size() / 2));
  check(std::includes(whole.begin(), whole.end(), half.begin(), half.end()), "a half declares no more than the whole");
  check(!speaksOurReports(descriptor) || !whole.empty(), "who speaks our reports declares some");
}

void checkRecording(const DeviceIdentity &device, bool identity) {
  const std::string header = recordingHeader(device, identity, kNow);
  checkPrintable(header, "a recording's header");
  ByteSource source("recorded", header + "F: 000000.000000 2 de 01\n");
  RecordedReports found("recorded");
  findInputKind("hid-recording")->read(source, {}, found);
  check(found.bytes.size() == 1 && found.bytes[0] == "\xDE\x01", "what follows the header reads back: " + found.story);
  check(found.messages == 0, "the header reads back without a word: " + found.story);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  fuzz::FuzzInput input(data, size);
  DeviceIdentity device;
  device.node = "/dev/hidraw3";
  device.bus = input.take<std::uint8_t>();
  device.vendor = input.take<std::uint16_t>();
  device.product = input.take<std::uint16_t>();
  std::string_view rest = input.rest();
  for (std::string *text : {&device.name, &device.serial, &device.physicalPath}) {  // each up to a zero
    const std::size_t end = std::min(rest.find('\0'), rest.size());
    *text = rest.substr(0, end);
    rest.remove_prefix(std::min(end + 1, rest.size()));
  }
  device.descriptor = rest.substr(0, 4096);

  checkDescriptor(device.descriptor);
  checkRecording(device, true);
  checkRecording(device, false);
  checkPrintable(udevRule(device), "a rule");
  try {
    const std::string node = findDevice(std::vector{device}, "S1");
    check(device.serial == "S1" && node == device.node, "only what is called so is found");
  } catch (const DeviceError &error) {
    checkPrintable(error.message().text, "a list of devices");
  }
  return 0;
}
