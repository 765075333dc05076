// The messages of /dev/uhid, and the search for the hidraw node that the kernel makes.
#include "UhidDevice.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <system_error>
#include <thread>

namespace vesk::bench {
namespace {

[[noreturn]] void fail(const char *what) {
  throw std::system_error(errno, std::generic_category(), what);
}

template <std::size_t N>
void copyText(__u8 (&to)[N], const std::string &from) {
  std::memcpy(to, from.data(), std::min(from.size(), N - 1));
}

// The fields of these packed messages cannot be bound to references, hence the pointer.
void copyBytes(__u8 *to, std::size_t room, const Bytes &from) {
  if (from.size() > room) throw std::length_error("report or descriptor too long for uhid");
  std::copy(from.begin(), from.end(), to);
}

bool describes(const std::filesystem::path &uevent, const Identity &identity) {
  char id[32];
  std::snprintf(id, sizeof id, "HID_ID=%04X:%08X:%08X", identity.bus, identity.vendor, identity.product);
  std::ifstream file(uevent);
  const std::string text{std::istreambuf_iterator<char>(file), {}};
  const auto holds = [&](const std::string &line) { return ("\n" + text).find("\n" + line + "\n") != text.npos; };
  return holds(id) && holds("HID_NAME=" + identity.name) && holds("HID_PHYS=" + identity.phys) &&
         holds("HID_UNIQ=" + identity.uniq);
}

}  // namespace

UhidDevice::UhidDevice() : file_(open("/dev/uhid", O_RDWR | O_CLOEXEC | O_NONBLOCK)) {
  if (file_ < 0) fail("/dev/uhid");
}

UhidDevice::~UhidDevice() {
  close(file_);
}

void UhidDevice::write(const uhid_event &event) {
  if (::write(file_, &event, sizeof event) != ssize_t(sizeof event)) fail("write to /dev/uhid");
}

void UhidDevice::create(const Identity &identity, const Bytes &reportDescriptor) {
  uhid_event event{};
  event.type = UHID_CREATE2;
  uhid_create2_req &request = event.u.create2;
  copyText(request.name, identity.name);
  copyText(request.phys, identity.phys);
  copyText(request.uniq, identity.uniq);
  request.rd_size = std::uint16_t(reportDescriptor.size());
  request.bus = identity.bus;
  request.vendor = identity.vendor;
  request.product = identity.product;
  request.version = identity.version;
  copyBytes(request.rd_data, sizeof request.rd_data, reportDescriptor);
  write(event);
}

void UhidDevice::destroy() {
  uhid_event event{};
  event.type = UHID_DESTROY;
  write(event);
}

void UhidDevice::input(const Bytes &report) {
  uhid_event event{};
  event.type = UHID_INPUT2;
  event.u.input2.size = std::uint16_t(report.size());
  copyBytes(event.u.input2.data, sizeof event.u.input2.data, report);
  write(event);
}

void UhidDevice::answerGet(std::uint32_t request, std::uint16_t error, const Bytes &report) {
  uhid_event event{};
  event.type = UHID_GET_REPORT_REPLY;
  event.u.get_report_reply.id = request;
  event.u.get_report_reply.err = error;
  event.u.get_report_reply.size = std::uint16_t(report.size());
  copyBytes(event.u.get_report_reply.data, sizeof event.u.get_report_reply.data, report);
  write(event);
}

void UhidDevice::answerSet(std::uint32_t request, std::uint16_t error) {
  uhid_event event{};
  event.type = UHID_SET_REPORT_REPLY;
  event.u.set_report_reply.id = request;
  event.u.set_report_reply.err = error;
  write(event);
}

std::optional<uhid_event> UhidDevice::next() {
  uhid_event event{};
  const ssize_t got = read(file_, &event, sizeof event);
  if (got > 0) return event;
  if (got < 0 && errno != EAGAIN && errno != EINTR) fail("read from /dev/uhid");
  return std::nullopt;
}

std::vector<std::string> hidrawNames() {
  std::vector<std::string> names;
  std::error_code none;  // the class folder comes with the first device
  for (const auto &entry : std::filesystem::directory_iterator("/sys/class/hidraw", none))
    names.push_back(entry.path().filename());
  return names;
}

std::string waitForNode(const Identity &identity, const std::vector<std::string> &known) {
  using namespace std::chrono;
  const auto end = steady_clock::now() + seconds(2);
  while (steady_clock::now() < end) {
    for (const std::string &name : hidrawNames()) {
      const std::string node = "/dev/" + name;
      if (std::find(known.begin(), known.end(), name) == known.end() &&
          describes("/sys/class/hidraw/" + name + "/device/uevent", identity) && access(node.c_str(), F_OK) == 0)
        return node;
    }
    std::this_thread::sleep_for(milliseconds(2));
  }
  return {};
}

}  // namespace vesk::bench
