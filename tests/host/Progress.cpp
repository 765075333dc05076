// The progress line's words, and when it is drawn.
#include "host/diagnostics/Progress.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <thread>

namespace vesk::host {
namespace {

TEST(ProgressText, TellsTheShareTheRateAndWhatIsLeft) {
  EXPECT_EQ(progressText("s.pcapng", 450'000'000, 1'000'000'000, 900'000, 3.0),
            "s.pcapng  45% of 1.0 GB  900000 reports  300000/s  4 s left");
}

TEST(ProgressText, TellsTheBytesWhereTheSizeIsNotKnown) {
  EXPECT_EQ(progressText("(standard input)", 12'345'678, std::nullopt, 10, 2.0),
            "(standard input)  12 MB  10 reports  5/s");
}

TEST(ProgressText, BelievesNoSizeThatWasPassed) {
  EXPECT_EQ(progressText("growing", 2000, 1000, 1, 1.0), "growing  2.0 kB  1 reports  1/s");
}

TEST(ProgressText, PromisesNothingBeforeTheFirstByte) {
  EXPECT_EQ(progressText("f", 0, 1000, 0, 1.0), "f  0% of 1.0 kB  0 reports  0/s");
  EXPECT_EQ(progressText("empty", 0, 0, 0, 1.0), "empty  0 B  0 reports  0/s");
}

TEST(ProgressText, WritesSizesInThreeDigits) {
  const auto size = [](std::uint64_t bytes) { return progressText("f", bytes, std::nullopt, 0, 0); };
  EXPECT_EQ(size(0), "f  0 B  0 reports");
  EXPECT_EQ(size(999), "f  999 B  0 reports");
  EXPECT_EQ(size(1'000), "f  1.0 kB  0 reports");
  EXPECT_EQ(size(9'949), "f  9.9 kB  0 reports");
  EXPECT_EQ(size(9'951), "f  10 kB  0 reports");
  EXPECT_EQ(size(999'500), "f  1.0 MB  0 reports");
  EXPECT_EQ(size(5'000'000'000'000'000), "f  5000 TB  0 reports");
}

TEST(Progress, IsDrawnNowAndThenInLongRunsAndClearedAtTheEnd) {
  std::FILE *terminal = std::tmpfile();
  {
    Progress progress("f", terminal);
    std::this_thread::sleep_for(std::chrono::milliseconds(550));
    for (int k = 0; k < 100; ++k) progress.update(1, 2, 7);
  }
  std::rewind(terminal);
  char shown[200] = {};
  const std::size_t size = std::fread(shown, 1, sizeof shown, terminal);
  std::fclose(terminal);
  const std::string text(shown, size);
  EXPECT_EQ(text.rfind("\r\x1b[Kf  50% of 2 B  7 reports  ", 0), 0u) << text;
  EXPECT_EQ(text.substr(text.size() - 4), "\r\x1b[K");
  EXPECT_LT(size, 100u) << "drawn more than once";
}

TEST(Progress, IsSilentInShortRuns) {
  std::FILE *terminal = std::tmpfile();
  {
    Progress progress("f", terminal);
    progress.update(1, 2, 1);
  }
  EXPECT_EQ(std::ftell(terminal), 0);
  std::fclose(terminal);
}

}  // namespace
}  // namespace vesk::host
