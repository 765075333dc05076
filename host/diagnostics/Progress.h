// The line on a terminal that tells how far a long run has come.
#pragma once

#include <chrono>
#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>
#include <string_view>

namespace vesk::host {

/// What moves the cursor to the start of the line and clears it; to be written before anything else when a progress
/// line may stand there.
inline constexpr std::string_view kClearLine = "\r\x1b[K";

/// The line's text: "s.pcapng  45% of 1.2 GB  1234567 reports  412000/s  12 s left"; without a known size the bytes
/// that were read stand in place of the share, and nothing is said of the time that is left.
std::string progressText(std::string_view name, std::uint64_t bytes, std::optional<std::uint64_t> size,
                         std::uint64_t reports, double seconds);

/// Silent in the first half second, then redrawn five times a second, and cleared at the end.
class Progress {
 public:
  explicit Progress(std::string_view name, std::FILE *terminal = stderr);
  ~Progress();
  Progress(const Progress &) = delete;
  Progress &operator=(const Progress &) = delete;

  void update(std::uint64_t bytes, std::optional<std::uint64_t> size, std::uint64_t reports);

 private:
  using Clock = std::chrono::steady_clock;

  std::string_view name_;
  std::FILE *terminal_;
  Clock::time_point start_ = Clock::now();
  Clock::time_point next_;
  bool drawn_ = false;
};

}  // namespace vesk::host
