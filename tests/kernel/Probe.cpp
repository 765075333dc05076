// The plainest possible user of a hidraw node, to see what the kernel does without any library in between.
//
//   probe get NODE ID [SIZE]           one feature report: "<count> <bytes of the report in hex>" or "error <errno>"
//   probe read NODE COUNT TIMEOUT_MS   input reports: "opened", then "<id> <length> <number>" each; "timeout"
//   probe set NODE ID                  writes a feature report; only to see that a write shows in the controller's log
//   probe write NODE ID                the same with an output report
#include <fcntl.h>
#include <linux/hidraw.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

int fail() {
  std::printf("error %d\n", errno);
  return 1;
}

int get(int node, std::uint8_t id, std::size_t size) {
  std::vector<std::uint8_t> report(size, 0xaa);
  report[0] = id;
  const int count = ioctl(node, HIDIOCGFEATURE(size), report.data());
  if (count < 0) return fail();
  // The byte after the report is shown too: nothing may have been written there.
  std::printf("%d", count);
  for (int k = 0; k <= count && k < int(size); ++k) std::printf(" %02x", report[std::size_t(k)]);
  std::puts("");
  return 0;
}

int readReports(int node, long count, int timeout) {
  std::puts("opened");
  for (std::array<std::uint8_t, 4096> report{}; count > 0; --count) {
    pollfd waiting{node, POLLIN, 0};
    const int ready = poll(&waiting, 1, timeout);
    if (ready == 0) {
      std::puts("timeout");
      return 0;
    }
    const ssize_t got = ready < 0 ? -1 : read(node, report.data(), report.size());
    if (got < 0) return fail();
    const unsigned number = unsigned(report[4] | report[5] << 8 | report[6] << 16) | unsigned(report[7]) << 24;
    std::printf("%02x %zd %u\n", report[0], got, number);
  }
  return 0;
}

int put(int node, const std::string &how, std::uint8_t id) {
  std::array<std::uint8_t, 2> report{id, 1};
  const long done = how == "set" ? ioctl(node, HIDIOCSFEATURE(2), report.data()) : write(node, report.data(), 2);
  if (done < 0) return fail();
  std::printf("%ld\n", done);
  return 0;
}

}  // namespace

int main(int count, char **arguments) {
  const std::vector<std::string> words(arguments + 1, arguments + count);
  if (words.size() < 3) {
    std::fputs("usage: probe get|read|set|write NODE ID|COUNT [SIZE|TIMEOUT_MS]\n", stderr);
    return 2;
  }
  std::setvbuf(stdout, nullptr, _IOLBF, 0);
  const bool writes = words[0] == "set" || words[0] == "write";
  const int node = open(words[1].c_str(), writes ? O_RDWR : O_RDONLY);
  if (node < 0) return fail();
  const auto id = std::uint8_t(std::strtoul(words[2].c_str(), nullptr, 16));
  const long last = words.size() > 3 ? std::atol(words[3].c_str()) : 4096;
  if (writes) return put(node, words[0], id);
  if (words[0] == "get") return get(node, id, std::size_t(last));
  return readReports(node, std::atol(words[2].c_str()), int(last));
}
