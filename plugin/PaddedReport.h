// The form in which a host hands a report to the plug-in: enough readable bytes behind it, whatever its length.
#pragma once

#include <algorithm>
#include <cstdint>
#include <string_view>
#include <vector>

/// How many bytes a host must make readable behind the pointer that it hands over, whatever the report's length: the
/// largest layout that is read without a look at the length, the full report's ID and 1022 bytes of body.
inline constexpr std::size_t kReadableBytes = 1 + 1022;

/// The bytes of one report, zeros behind them up to kReadableBytes, and one zero more, so that a text always ends. The
/// true length goes along. Owns its memory and keeps it from one assign() to the next.
class PaddedReport {
 public:
  PaddedReport() : PaddedReport(std::string_view()) {}
  explicit PaddedReport(std::string_view bytes) { assign(bytes); }
  // Copies only: what was moved from would not keep the promise.
  PaddedReport(const PaddedReport &) = default;
  PaddedReport &operator=(const PaddedReport &) = default;

  /// Takes a copy of `bytes`, the report ID first. REQUIRES: not a view of this object.
  void assign(std::string_view bytes) {
    const std::size_t readable = std::max(bytes.size(), kReadableBytes) + 1;
    if (memory_.size() < readable) memory_.resize(readable);
    const auto end = std::copy(bytes.begin(), bytes.end(), memory_.begin());
    std::fill(end, memory_.begin() + static_cast<std::ptrdiff_t>(readable), '\0');
    length_ = bytes.size();
  }

  const char *data() const noexcept { return memory_.data(); }
  /// The report's own length, padding not counted.
  std::int64_t length() const noexcept { return static_cast<std::int64_t>(length_); }
  std::string_view bytes() const noexcept { return {memory_.data(), length_}; }

 private:
  std::vector<char> memory_;
  std::size_t length_ = 0;
};
