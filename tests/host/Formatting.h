// What the tests of the output forms share: reports through a decoder and one formatter, as a run does it.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "host/output/Formatter.h"
#include "host/report/KnownReports.h"

namespace test {

/// A report that owns its bytes. Everything else is as in the record that a formatter gets.
struct Given {
  std::string bytes;
  vesk::host::SourceReport report;
};

/// Bytes from digits: "E0 0D 05".
inline std::string fromHex(std::string_view digits) {
  std::string bytes;
  std::string pair;
  for (const char c : digits) {
    if (c == ' ') continue;
    pair += c;
    if (pair.size() < 2) continue;
    bytes += static_cast<char>(std::stoi(pair, nullptr, 16));
    pair.clear();
  }
  return bytes;
}

/// `value` in little-endian order at `at`.
inline void put(std::string &bytes, std::size_t at, std::uint64_t value, std::size_t width) {
  for (std::size_t i = 0; i < width; ++i) bytes.at(at + i) = static_cast<char>(value >> (8 * i) & 0xFF);
}

/// A report of the first byte's ID and usual type, from file "f", without time and device.
inline Given given(std::string bytes, std::uint64_t index = 0) {
  vesk::host::SourceReport report;
  report.id = bytes.empty() ? 0 : static_cast<unsigned char>(bytes[0]);
  report.type =
      report.id == 0x76 || report.id == 0x77 ? vesk::host::ReportType::kInput : vesk::host::ReportType::kFeature;
  report.file = "f";
  report.index = index;
  return {std::move(bytes), report};
}

struct Formatted {
  std::string text;
  std::vector<std::string> codes;  // of what the form itself found
};

inline Formatted format(std::string_view form, std::vector<Given> reports,
                        const vesk::host::FormatOptions &options = {}, vesk::host::Messages *messages = nullptr) {
  using namespace vesk::host;
  const auto formatter = findOutputKind(form)->make(options);
  Decoder decoder({formatter->wantsLines(), formatter->wantsValue(), false, false});
  Messages none({});
  OutputBuffer out;
  Formatted formatted;
  std::uint64_t count = 0;
  formatter->begin(out);
  for (Given &each : reports) {
    each.report.bytes = each.bytes;
    std::vector<Finding> findings;
    formatter->report(out, each.report, decoder.decode(each.report), count++ == 0, findings);
    for (const Finding &finding : findings) formatted.codes.emplace_back(finding.kind->code);
  }
  formatter->end(out, {count, messages == nullptr ? &none : messages});
  formatted.text = out.text();
  return formatted;
}

}  // namespace test
