// Many plug-in objects in many threads at once, each with reports of its own: what each gives is what it gives alone.
#include <gtest/gtest.h>

#include <atomic>
#include <random>
#include <thread>

#include "plugin/HIDReportVeskPlugin.h"

namespace {

constexpr unsigned kIds[] = {0xD0, 0xD2, 0xDC, 0xDE, 0xE0, 0xE1, 0xEA, 0xE2, 0xE3,
                             0xE4, 0xE5, 0xA2, 0xEC, 0xDF, 0xA9, 0x76, 0x77};

bool isInput(unsigned id) {
  return id == 0x76 || id == 0x77;
}

PaddedReport reportOf(unsigned id, unsigned seed) {
  std::mt19937 random(seed);
  std::string bytes(id == 0x76 ? 792 : id == 0x77 ? 2064 : 1023, '\0');
  const bool isText = id == 0xD0 || id == 0xD2;
  for (char &c : bytes) c = isText ? "abc\n"[random() % 4] : static_cast<char>(random() & 0xFF);
  bytes[0] = static_cast<char>(id);
  return PaddedReport(bytes);
}

ReportResult decode(HIDReportVeskPlugin &plugin, const PaddedReport &report, unsigned id) {
  return plugin.reportToObject(report.data(), id, isInput(id) ? 0 : 2, report.length());
}

bool same(const ReportResult &a, const ReportResult &b) {
  if (a.index() != b.index()) return false;
  if (const auto *lines = std::get_if<DisplayLines>(&a)) return *lines == std::get<DisplayLines>(b);
  return std::get<ReportValue>(a) == std::get<ReportValue>(b);
}

TEST(Threads, OneObjectEach) {
  constexpr unsigned kThreads = 8, kRounds = 40;
  std::atomic<unsigned> differences = 0, decoded = 0;
  std::vector<std::thread> threads;
  for (unsigned t = 0; t < kThreads; ++t)
    threads.emplace_back([t, &differences, &decoded] {
      const auto alone = HIDReportVeskPlugin::init();
      for (unsigned round = 0; round < kRounds; ++round) {
        const auto plugin = HIDReportVeskPlugin::init();
        plugin->setUseStrings((t + round) % 2 == 0);
        plugin->setDisplayDecimal(t % 3 == 0);
        alone->setUseStrings(plugin->useStrings());
        alone->setDisplayDecimal(plugin->displayDecimal());
        for (const unsigned id : kIds) {
          const PaddedReport report = reportOf(id, 1000 * t + round);
          if (!same(decode(*plugin, report, id), decode(*alone, report, id))) ++differences;
          ++decoded;
        }
      }
    });
  for (std::thread &thread : threads) thread.join();
  EXPECT_EQ(differences, 0u);
  EXPECT_EQ(decoded, kThreads * kRounds * std::size(kIds));
}

TEST(Threads, AnObjectMayMoveFromThreadToThread) {
  auto plugin = HIDReportVeskPlugin::init();
  plugin->setUseStrings(true);
  const PaddedReport report = reportOf(0xE1, 7);
  ReportResult result;
  std::thread([&] { result = decode(*plugin, report, 0xE1); }).join();
  EXPECT_EQ(std::get<DisplayLines>(result).size(), 303u);
  EXPECT_TRUE(same(result, decode(*plugin, report, 0xE1)));
}

}  // namespace
