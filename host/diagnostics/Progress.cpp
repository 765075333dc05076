// Drawing of the progress line.
#include "host/diagnostics/Progress.h"

#include <array>

namespace vesk::host {

namespace {

using namespace std::chrono_literals;

/// Three digits and a decimal unit: "45 B", "1.2 GB".
std::string sizeText(std::uint64_t bytes) {
  constexpr std::array<const char *, 5> kUnits = {"B", "kB", "MB", "GB", "TB"};
  double value = static_cast<double>(bytes);
  std::size_t unit = 0;
  for (; value >= 999.5 && unit + 1 < kUnits.size(); ++unit) value /= 1000;
  std::array<char, 32> text;
  std::snprintf(text.data(), text.size(), value < 9.95 && unit != 0 ? "%.1f %s" : "%.0f %s", value, kUnits[unit]);
  return text.data();
}

}  // namespace

std::string progressText(std::string_view name, std::uint64_t bytes, std::optional<std::uint64_t> size,
                         std::uint64_t reports, double seconds) {
  std::string line(name);
  if (size && *size >= bytes && *size != 0)
    line += "  " + std::to_string(bytes * 100 / *size) + "% of " + sizeText(*size);
  else
    line += "  " + sizeText(bytes);
  line += "  " + std::to_string(reports) + " reports";
  if (seconds > 0)
    line += "  " + std::to_string(static_cast<std::uint64_t>(static_cast<double>(reports) / seconds)) + "/s";
  if (size && *size >= bytes && bytes != 0) {
    const double left = seconds * static_cast<double>(*size - bytes) / static_cast<double>(bytes);
    line += "  " + std::to_string(static_cast<std::uint64_t>(left + 0.5)) + " s left";
  }
  return line;
}

Progress::Progress(std::string_view name, std::FILE *terminal)
    : name_(name), terminal_(terminal), next_(start_ + 500ms) {}

void Progress::update(std::uint64_t bytes, std::optional<std::uint64_t> size, std::uint64_t reports) {
  const Clock::time_point now = Clock::now();
  if (now < next_) return;
  next_ = now + 200ms;
  drawn_ = true;
  const std::chrono::duration<double> elapsed = now - start_;
  const std::string line = std::string(kClearLine) + progressText(name_, bytes, size, reports, elapsed.count());
  std::fwrite(line.data(), 1, line.size(), terminal_);
  std::fflush(terminal_);
}

Progress::~Progress() {
  if (!drawn_) return;
  std::fwrite(kClearLine.data(), 1, kClearLine.size(), terminal_);
  std::fflush(terminal_);
}

}  // namespace vesk::host
