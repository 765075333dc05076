// Gaps in frame and packet numbers.
#include "host/report/LossCounter.h"

#include <gtest/gtest.h>

#include <cstring>

namespace vesk::host {
namespace {

/// A sensor image or a packet with this counter.
struct Numbered {
  Numbered(unsigned id, std::uint32_t number, std::string_view device = "1.7") : bytes(id == 0x76 ? 792 : 2064, '\0') {
    bytes[0] = static_cast<char>(id);
    std::memcpy(bytes.data() + 4, &number, 4);
    source.bytes = bytes;
    source.id = id;
    source.type = ReportType::kInput;
    source.device = device;
  }
  std::string bytes;
  SourceReport source;
};

std::uint32_t lostBefore(LossCounter &counter, const Numbered &report) {
  const auto gap = counter.observe(report.source);
  return gap ? gap->lost : 0;
}

TEST(LossCounter, CountsWhatIsMissing) {
  LossCounter counter;
  EXPECT_EQ(lostBefore(counter, {0x76, 10}), 0u);
  EXPECT_EQ(lostBefore(counter, {0x76, 11}), 0u);
  EXPECT_EQ(lostBefore(counter, {0x76, 13}), 1u);
  EXPECT_EQ(lostBefore(counter, {0x76, 113}), 99u);
  EXPECT_EQ(counter.total().lost, 100u);
  EXPECT_EQ(counter.total().gaps, 2u);
  EXPECT_EQ(counter.total().restarts, 0u);
}

TEST(LossCounter, SaysWhereTheGapIs) {
  LossCounter counter;
  lostBefore(counter, {0x77, 4});
  const Numbered next(0x77, 9);
  const auto gap = counter.observe(next.source);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->before, 4u);
  EXPECT_EQ(gap->after, 9u);
}

TEST(LossCounter, KeepsDevicesAndReportsApart) {
  LossCounter counter;
  lostBefore(counter, {0x76, 1, "1.7"});
  EXPECT_EQ(lostBefore(counter, {0x76, 50, "1.8"}), 0u);
  EXPECT_EQ(lostBefore(counter, {0x77, 90, "1.7"}), 0u);
  EXPECT_EQ(lostBefore(counter, {0x76, 2, "1.7"}), 0u);
  EXPECT_EQ(lostBefore(counter, {0x76, 52, "1.8"}), 1u);
}

TEST(LossCounter, ACounterThatGoesBackOrStandsStillIsARestart) {
  LossCounter counter;
  for (const std::uint32_t number : {500u, 0u, 1u, 1u}) EXPECT_EQ(lostBefore(counter, {0x76, number}), 0u);
  EXPECT_EQ(counter.total().restarts, 2u);
  EXPECT_EQ(counter.total().lost, 0u);
}

TEST(LossCounter, ACounterThatWrapsIsNoRestart) {
  LossCounter counter;
  lostBefore(counter, {0x76, 0xFFFFFFFEu});
  EXPECT_EQ(lostBefore(counter, {0x76, 1}), 2u);
  EXPECT_EQ(counter.total().restarts, 0u);
}

TEST(LossCounter, ReportsOfAnotherLengthTypeOrIdHaveNoCounter) {
  Numbered report(0x76, 1);
  EXPECT_EQ(counterOf(report.source), 1u);
  report.source.bytes.remove_suffix(1);
  EXPECT_FALSE(counterOf(report.source));
  Numbered feature(0x77, 1);
  feature.source.type = ReportType::kFeature;
  EXPECT_FALSE(counterOf(feature.source));
  Numbered other(0x77, 1);
  other.source.id = 0xE0;
  EXPECT_FALSE(counterOf(other.source));
}

}  // namespace
}  // namespace vesk::host
