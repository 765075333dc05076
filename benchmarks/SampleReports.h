// Reports to measure with: of every ID, each one different, the same in every run.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace vesk::benchmarks {

struct SampleKind {
  std::uint8_t id;
  std::int32_t type;  // as the plug-in takes it
  std::size_t size;
};

/// In the order in which they are measured.
inline constexpr std::array<SampleKind, 17> kSampleKinds = {{
    {0x76, 0, 792},
    {0x77, 0, 2064},
    {0xA2, 2, 193},
    {0xA9, 2, 49},
    {0xD0, 2, 24},
    {0xD2, 2, 96},
    {0xDC, 2, 25},
    {0xDE, 2, 2},
    {0xDF, 2, 25},
    {0xE0, 2, 7},
    {0xE1, 2, 1023},
    {0xE2, 2, 241},
    {0xE3, 2, 169},
    {0xE4, 2, 398},
    {0xE5, 2, 398},
    {0xEA, 2, 1023},
    {0xEC, 2, 193},
}};

const SampleKind &sampleKind(unsigned id);

/// Words are random over their whole range, which is the most digits; counters run from 0 to a million with as many
/// short ones as long ones, so that no branch can guess their length; floats are of the size that the firmware sends.
/// Frame and packet numbers count up.
std::vector<std::string> makeSamples(const SampleKind &kind, std::size_t count);

}  // namespace vesk::benchmarks
