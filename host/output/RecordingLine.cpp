// Numbers and bytes as recordings have them.
#include "host/output/RecordingLine.h"

#include <string>

#include "host/output/JsonText.h"

namespace vesk::host {

namespace {

/// " 3 e0 0d 05": the count, then each byte behind a blank.
void appendCountAndBytes(OutputBuffer &out, std::string_view bytes) {
  out.append(' ');
  appendNumber(out, std::uint64_t{bytes.size()});
  char *end = out.room(3 * bytes.size());
  for (const char byte : bytes) {
    *end++ = ' ';
    end = writeHex(end, static_cast<unsigned char>(byte), 2, false);
  }
  out.advanceTo(end);
  out.append('\n');
}

void appendSixDigits(OutputBuffer &out, std::int64_t number) {
  const std::string digits = std::to_string(number);
  if (digits.size() < 6) out.append(std::string(6 - digits.size(), '0'));
  out.append(digits);
}

}  // namespace

void appendDescriptorLine(OutputBuffer &out, std::string_view descriptor) {
  out.append("R:");
  appendCountAndBytes(out, descriptor);
}

void appendRecordingLine(OutputBuffer &out, ReportType type, std::int64_t microseconds, std::string_view bytes) {
  out.append(type == ReportType::kInput ? "E: " : "F: ");
  appendSixDigits(out, microseconds / 1'000'000);
  out.append('.');
  appendSixDigits(out, microseconds % 1'000'000);
  appendCountAndBytes(out, bytes);
}

}  // namespace vesk::host
