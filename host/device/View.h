// The live view: one sensor image as a picture for a terminal.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace vesk::host {

/// All that the picture shows.
struct ViewState {
  std::string title;                              // which device
  std::string scan;                               // "D-SCAN"
  std::vector<std::int32_t> inPhase, quadrature;  // one sample a channel; empty before the first image
  std::uint32_t frameNumber = 0;
  float degC = 0;
  double framesPerSecond = 0;
  std::uint64_t packets = 0;  // of an ADC dump
  std::uint64_t lost = 0;
  std::size_t columns = 80, rows = 24;  // of the terminal
};

/// The picture, from the upper left corner of the screen to its end, no line wider than the terminal and no more of
/// them than it has.
std::string drawView(const ViewState &state);

/// The least of 1, 2, 5, 10, 20, 50 ... that no sample exceeds, so that the scale does not flicker.
std::uint32_t viewScale(const std::vector<std::int32_t> &samples);

}  // namespace vesk::host
