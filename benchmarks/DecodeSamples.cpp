// decode_samples ID lines|decimal|value ROUNDS: decodes sample reports, for valgrind to count the instructions, and
// prints the nanoseconds that a report took in the best round, which even a busy machine leaves alone for so long.
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string_view>

#include "benchmarks/SampleReports.h"
#include "plugin/HIDReportVeskPlugin.h"

int main(int argc, char **argv) {
  using Clock = std::chrono::steady_clock;
  constexpr std::size_t kSamples = 64;
  if (argc != 4) {
    std::fputs("usage: decode_samples ID lines|decimal|value ROUNDS\n", stderr);
    return 2;
  }
  const auto &kind = vesk::benchmarks::sampleKind(static_cast<unsigned>(std::strtoul(argv[1], nullptr, 16)));
  const std::string_view form = argv[2];
  const auto rounds = std::strtoul(argv[3], nullptr, 10);
  std::vector<PaddedReport> reports;
  for (const std::string &sample : vesk::benchmarks::makeSamples(kind, kSamples)) reports.emplace_back(sample);
  const auto plugin = HIDReportVeskPlugin::init();
  plugin->setUseStrings(form != "value");
  plugin->setDisplayDecimal(form == "decimal");

  double best = 1e18;
  for (std::size_t round = 0; round < rounds; ++round) {
    const auto start = Clock::now();
    for (const PaddedReport &report : reports) {
      const ReportResult result = plugin->runParser(report.data(), kind.id, kind.type, report.length());
      if (result.index() == 0) return 4;
    }
    const std::chrono::duration<double, std::nano> taken = Clock::now() - start;
    best = std::min(best, taken.count() / kSamples);
  }
  std::printf("%.1f\n", best);
}
