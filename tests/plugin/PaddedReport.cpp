// The reading contract as a type: bytes, zeros behind them, the true length beside them.
#include "plugin/PaddedReport.h"

#include <gtest/gtest.h>

#include <string>

namespace {

static_assert(kReadableBytes == 1023, "the ID and the 1022 bytes of the full report's body");

void expectHolds(const PaddedReport &report, const std::string &bytes) {
  ASSERT_EQ(report.length(), static_cast<std::int64_t>(bytes.size()));
  ASSERT_EQ(report.bytes(), bytes);
  const std::size_t readable = std::max(bytes.size(), std::size_t{1023}) + 1;
  for (std::size_t i = bytes.size(); i < readable; ++i) ASSERT_EQ(report.data()[i], '\0') << i;
}

TEST(PaddedReport, EveryLengthAroundTheContract) {
  for (const std::size_t size : {0u, 1u, 2u, 241u, 1022u, 1023u, 1024u, 2064u, 70000u}) {
    const std::string bytes(size, '\xA5');
    expectHolds(PaddedReport(bytes), bytes);
  }
}

TEST(PaddedReport, DefaultIsAnEmptyReport) {
  expectHolds(PaddedReport(), "");
}

TEST(PaddedReport, ReuseLeavesNothingBehind) {
  PaddedReport report(std::string(2064, '\xFF'));
  for (const std::size_t size : {2063u, 1024u, 1023u, 7u, 0u, 25u, 3000u, 1u}) {
    const std::string bytes(size, '\x11');
    report.assign(bytes);
    expectHolds(report, bytes);
    report.assign(std::string(1100, '\xFF'));
  }
}

TEST(PaddedReport, KeepsThePromiseWhenItIsMovedFrom) {
  PaddedReport report("\xE0\x0D");
  const PaddedReport taken(std::move(report));
  expectHolds(taken, "\xE0\x0D");
  expectHolds(report, "\xE0\x0D");  // NOLINT: that is what is tested
}

TEST(PaddedReport, TakesACopy) {
  std::string bytes = "abc";
  const PaddedReport report(bytes);
  bytes[0] = 'x';
  expectHolds(report, "abc");
}

TEST(PaddedReport, CopiesAndMovesWhole) {
  const PaddedReport report("abc");
  PaddedReport copy = report;
  expectHolds(copy, "abc");
  const PaddedReport moved = std::move(copy);
  expectHolds(moved, "abc");
  expectHolds(report, "abc");
}

}  // namespace
