// What a reader makes of an input: its reports and messages, copied.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "host/input/Input.h"

namespace test {

using vesk::host::ReportType;

struct Found {
  std::string bytes;
  std::uint32_t id = 0;
  ReportType type = ReportType::kOutput;
  bool typeGuessed = false;
  std::string place;
  std::uint64_t index = 0;
  std::optional<std::int64_t> timeNs;
  std::string device, file;
  std::optional<std::uint32_t> vendorProduct;
};

struct Said {
  std::string code, place, text;
  int exitCode = 0;
  std::optional<std::uint32_t> reportId;
};

struct ReadResult : vesk::host::ReadSink {
  std::vector<Found> reports;
  std::vector<Said> messages;

  void report(const vesk::host::SourceReport &report) override {
    reports.push_back({std::string(report.bytes), report.id, report.type, report.typeGuessed, report.place.text(),
                       report.index, report.timeNs, std::string(report.device), std::string(report.file),
                       report.vendorProduct});
  }
  void message(vesk::host::Message message) override {
    EXPECT_EQ(message.file, "input");
    messages.push_back({std::string(message.kind->code), message.place.text(), message.text, message.kind->exitCode,
                        message.reportId});
  }

  /// "code place" of each message that is no note of words skipped.
  std::vector<std::string> said() const {
    std::vector<std::string> all;
    for (const Said &message : messages)
      if (message.code != "text-skipped")
        all.push_back(message.code + (message.place.empty() ? "" : " " + message.place));
    return all;
  }
  std::vector<std::string> bytes() const {
    std::vector<std::string> all;
    for (const Found &report : reports) all.push_back(report.bytes);
    return all;
  }
};

/// Reads as `vesk-report decode` does, with the kind that the content calls for unless one is named.
inline ReadResult readInput(std::string_view content, std::string_view kind = {},
                            vesk::host::ReadOptions options = {}) {
  vesk::host::ByteSource source("input", std::string(content));
  ReadResult result;
  const std::string head(source.peek(vesk::host::kHeadSize).substr(0, vesk::host::kHeadSize));
  options.kindForced = !kind.empty();
  const vesk::host::InputKind *found =
      kind.empty() ? &vesk::host::detectInputKind(head) : vesk::host::findInputKind(kind);
  found->read(source, options, result);
  const bool refused = !result.messages.empty() && result.messages[0].code == "unknown-input";
  EXPECT_TRUE(refused || source.peek().empty()) << "not read to the end";
  return result;
}

inline std::string_view detectedKind(std::string_view content) {
  return vesk::host::detectInputKind(content.substr(0, vesk::host::kHeadSize)).name;
}

/// The bytes that hex digits stand for; blanks are left out.
inline std::string bytesOf(std::string_view hex) {
  std::string digits, bytes;
  for (const char character : hex)
    if (character != ' ' && character != '\n') digits += character;
  for (std::size_t i = 0; i + 1 < digits.size(); i += 2)
    bytes += static_cast<char>(std::stoi(digits.substr(i, 2), nullptr, 16));
  return bytes;
}

/// ID and then 1, 2, 3 ... round and round.
inline std::string numbered(unsigned id, std::size_t size) {
  std::string bytes(1, static_cast<char>(id));
  for (std::size_t i = 1; i < size; ++i) bytes += static_cast<char>(i & 0xFF);
  return bytes;
}

/// Bytes as digits, in groups with blanks between them.
inline std::string digitsOf(std::string_view bytes, const char *format = "%02x", std::string_view between = " ") {
  std::string text;
  for (const char byte : bytes) {
    char digits[8];
    std::snprintf(digits, sizeof digits, format, static_cast<unsigned>(static_cast<unsigned char>(byte)));
    if (!text.empty()) text += between;
    text += digits;
  }
  return text;
}

/// A list of values as 'xxd -p' prints them: thirty to a line.
inline std::string plainDump(std::string_view bytes) {
  std::string text;
  for (std::size_t at = 0; at < bytes.size(); at += 30) text += digitsOf(bytes.substr(at, 30), "%02x", "") + "\n";
  return text;
}

}  // namespace test
