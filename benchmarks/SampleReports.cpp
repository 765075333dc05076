// What the sample reports hold.
#include "benchmarks/SampleReports.h"

#include <cstring>
#include <random>
#include <stdexcept>

namespace vesk::benchmarks {

namespace {

using Random = std::mt19937;

void put(std::string &report, std::size_t offset, const void *bytes, std::size_t size) {
  std::memcpy(report.data() + offset, bytes, size);  // the firmware's byte order is this machine's
}

/// Log-uniform: any length is as likely as any other.
std::uint32_t counter(Random &random) {
  const auto value = static_cast<std::uint32_t>(random());
  return value >> (12 + random() % 20);
}

void fillWords(std::string &report, std::size_t offset, Random &random) {
  for (; offset + 4 <= report.size(); offset += 4) {
    const auto value = static_cast<std::uint32_t>(random());
    put(report, offset, &value, sizeof value);
  }
}

void fillCounters(std::string &report, Random &random) {
  for (std::size_t offset = 3; offset + 4 <= report.size(); offset += 4) {
    const std::uint32_t value = counter(random);
    put(report, offset, &value, sizeof value);
  }
}

void fillFloats(std::string &report, Random &random) {
  std::uniform_real_distribution<float> value(-4096, 4096);
  for (std::size_t offset = 1; offset + 4 <= report.size(); offset += 4) {
    const float number = value(random);
    put(report, offset, &number, sizeof number);
  }
}

void fillBytes(std::string &report, Random &random) {
  for (std::size_t i = 1; i < report.size(); ++i) report[i] = static_cast<char>(random());
}

/// Six lines, as an extended version has them; a plain version is a short one.
void fillText(std::string &report, std::uint32_t number) {
  std::string text = "2.14." + std::to_string(number % 100);
  if (report.size() > 64) text += "\nsdk 5.0.3\ngcc 12.2.0\nkorvo 1.7\nvendor 0x1209\nalgs 3.1.4";
  put(report, 1, text.data(), text.size());
}

std::string makeSample(const SampleKind &kind, std::uint32_t number, Random &random) {
  std::string report(kind.size, '\0');
  report[0] = static_cast<char>(kind.id);
  switch (kind.id) {
    case 0x76: {
      const float celsius = 34.5;
      fillWords(report, 8, random);
      put(report, 4, &number, sizeof number);
      put(report, 788, &celsius, sizeof celsius);
      break;
    }
    case 0x77:
      fillWords(report, 8, random);
      put(report, 4, &number, sizeof number);
      break;
    case 0xA2:
    case 0xEC:
      fillFloats(report, random);
      break;
    case 0xD0:
    case 0xD2:
      fillText(report, number);
      break;
    case 0xE1:
    case 0xEA:
      fillCounters(report, random);
      break;
    default:
      fillBytes(report, random);
  }
  return report;
}

}  // namespace

const SampleKind &sampleKind(unsigned id) {
  for (const SampleKind &kind : kSampleKinds)
    if (kind.id == id) return kind;
  throw std::invalid_argument("no report has the ID " + std::to_string(id));
}

std::vector<std::string> makeSamples(const SampleKind &kind, std::size_t count) {
  Random random(kind.id);
  std::vector<std::string> samples;
  for (std::uint32_t number = 0; number < count; ++number) samples.push_back(makeSample(kind, number, random));
  return samples;
}

}  // namespace vesk::benchmarks
