// Bars of half a character's height, upwards and downwards from a line of zero.
#include "host/device/View.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <iterator>

namespace vesk::host {

namespace {

constexpr std::size_t kMargin = 2;      // columns before the bars
constexpr std::size_t kOtherLines = 6;  // title, status, two headings, the axis, and the last line, where the cursor is
constexpr std::size_t kTallestBars = 16;  // lines
constexpr const char *kNewLine = "\x1b[K\n";

std::string fixed(double number, int decimals) {
  char text[400];
  return {text, std::to_chars(text, std::end(text), number, std::chars_format::fixed, decimals).ptr};
}

/// So many characters of a text, of which each may be several bytes.
std::string cut(const std::string &text, std::size_t columns) {
  std::size_t at = 0;
  for (; at < text.size(); ++at) {
    const bool begins = (static_cast<unsigned char>(text[at]) & 0xC0) != 0x80;
    if (begins && columns-- == 0) break;
  }
  return text.substr(0, at);
}

std::uint32_t magnitude(std::int32_t sample) {
  return static_cast<std::uint32_t>(std::llabs(sample));
}

/// The height of a sample's bar in half lines, with its sign.
long barHeight(std::int32_t sample, std::uint32_t scale, std::size_t lines) {
  return std::lround(static_cast<double>(sample) / scale * static_cast<double>(lines));
}

std::string bars(const std::vector<std::int32_t> &samples, std::size_t lines, std::size_t columns) {
  const std::uint32_t scale = viewScale(samples);
  const std::size_t channels = std::min(samples.size(), columns);
  const long zero = static_cast<long>(lines);  // half lines above the line of zero
  std::string picture;
  for (long half = 0; half < 2 * zero; half += 2) {
    picture += std::string(kMargin, ' ');
    for (std::size_t channel = 0; channel < channels; ++channel) {
      const long height = barHeight(samples[channel], scale, lines);
      const auto isLit = [&](long at) { return at < zero ? height >= zero - at : -height > at - zero; };
      constexpr const char *kCells[] = {" ", "▄", "▀", "█"};
      picture += kCells[isLit(half) * 2 + isLit(half + 1)];
    }
    picture += kNewLine;
  }
  return picture;
}

/// "0       8       16 ..." under the bars.
std::string axis(std::size_t channels, std::size_t columns) {
  std::string text(kMargin, ' ');
  for (std::size_t channel = 0; channel < channels; channel += 8) {
    text.resize(kMargin + channel, ' ');
    text += std::to_string(channel);
  }
  return cut(text, columns);
}

std::string status(const ViewState &state) {
  std::string text;
  if (!state.inPhase.empty())
    text = "frame " + std::to_string(state.frameNumber) + "   " + fixed(state.framesPerSecond, 1) + "/s   " +
           fixed(state.degC, 2) + " degC   ";
  if (state.packets != 0) text += std::to_string(state.packets) + " ADC packets   ";
  return text + std::to_string(state.lost) + " lost";
}

}  // namespace

std::uint32_t viewScale(const std::vector<std::int32_t> &samples) {
  std::uint32_t most = 1;
  for (const std::int32_t sample : samples) most = std::max(most, magnitude(sample));
  std::uint64_t scale = 1;
  for (unsigned step = 0; scale < most; ++step) scale = step % 3 == 1 ? scale / 2 * 5 : scale * 2;
  return static_cast<std::uint32_t>(std::min<std::uint64_t>(scale, UINT32_MAX));
}

std::string drawView(const ViewState &state) {
  const auto line = [&](const std::string &text) { return cut(text, state.columns) + kNewLine; };
  std::string picture = "\x1b[H" + line(state.title) + line(status(state));
  if (state.inPhase.empty()) {
    picture += line("waiting for a sensor image");
  } else {
    const std::size_t free = std::max(state.rows, kOtherLines + 2) - kOtherLines;
    const std::size_t lines = std::min(free / 2, kTallestBars);
    const std::size_t columns = std::max(state.columns, kMargin) - kMargin;
    for (const auto &[name, samples] : {std::pair("I", &state.inPhase), std::pair("Q", &state.quadrature)})
      picture +=
          line(state.scan + " " + name + ", +-" + std::to_string(viewScale(*samples))) + bars(*samples, lines, columns);
    picture += line(axis(state.inPhase.size(), state.columns));
  }
  return picture + "\x1b[J";
}

}  // namespace vesk::host
