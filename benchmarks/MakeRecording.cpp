// make_recording ID COUNT: writes so many sample reports, one behind the other, to standard output.
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "benchmarks/SampleReports.h"

namespace {

constexpr std::size_t kDistinct = 4096;  // more than any branch predictor learns, and soon made

}  // namespace

int main(int argc, char **argv) {
  if (argc != 3) {
    std::fputs("usage: make_recording ID COUNT\n", stderr);
    return 2;
  }
  const auto &kind = vesk::benchmarks::sampleKind(static_cast<unsigned>(std::strtoul(argv[1], nullptr, 16)));
  const auto count = static_cast<std::uint32_t>(std::strtoul(argv[2], nullptr, 10));
  auto samples = vesk::benchmarks::makeSamples(kind, std::min<std::size_t>(count, kDistinct));
  for (std::uint32_t number = 0; number < count; ++number) {
    std::string &report = samples[number % kDistinct];
    if (kind.type == 0) std::memcpy(report.data() + 4, &number, sizeof number);  // no gap where the samples repeat
    if (std::fwrite(report.data(), 1, report.size(), stdout) != report.size()) return 5;
  }
  return std::fflush(stdout) == 0 ? 0 : 5;
}
