// Number arrays as lines of eight or as values, and printing: what every decoder shares.
#include <algorithm>
#include <cstdio>
#include <string_view>
#include <utility>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk {
namespace {

constexpr std::uint32_t kValuesPerLine = 8;

/// Appends the values in lines of eight, each written by `write(out, value)` into `room` bytes at the most.
template <class Field, class Write>
void addLines(DisplayLines &lines, const void *data, std::uint32_t count, std::size_t room, Write write) {
  const auto *field = static_cast<const Field *>(data);
  const std::uint32_t wholeLines = count / kValuesPerLine, rest = count % kValuesPerLine;
  lines.rows(wholeLines, kValuesPerLine * room, [&](char *out, std::size_t) {
    [&]<std::size_t... I>(std::index_sequence<I...>) {
      ((out = write(out, field[I])), ...);
    }
    (std::make_index_sequence<kValuesPerLine>());
    field += kValuesPerLine;
    return out;
  });
  if (rest == 0 && wholeLines != 0) return;
  lines.rows(1, rest * room, [&](char *out, std::size_t) {
    for (std::uint32_t i = 0; i < rest; ++i) out = write(out, field[i]);
    return out;
  });
}

template <FormatText F, class Field>
void addLinesAs(DisplayLines &lines, const void *data, std::uint32_t count) {
  addLines<Field>(lines, data, count, Format<F>::room(Field()),
                  [](char *out, const Field &field) { return Format<F>::write(out, field); });
}

/// "%08x ", the format that a recording is full of: the blank comes with the digits.
template <class Field>
void addHexLines(DisplayLines &lines, const void *data, std::uint32_t count) {
  addLines<Field>(lines, data, count, 9, [](char *out, const Field &field) {
    return writeHex8(out, static_cast<std::uint32_t>(typename Field::value_type{field})) + 1;
  });
}

#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"  // the format is the caller's
/// Any other format goes through the C library, as it stands.
template <class Field, class Argument>
void addLinesByPrintf(DisplayLines &lines, const void *data, std::uint32_t count, const char *format) {
  std::size_t room = 1;  // for the terminating zero
  for (std::uint32_t i = 0; i < count; ++i) {
    const Argument value = static_cast<const Field *>(data)[i];
    room = std::max(room, static_cast<std::size_t>(std::max(0, std::snprintf(nullptr, 0, format, value))) + 1);
  }
  addLines<Field>(lines, data, count, room, [format, room](char *out, const Field &field) {
    const Argument value = field;
    return out + std::max(0, std::snprintf(out, room, format, value));
  });
}
#pragma GCC diagnostic pop

/// Compares without a call, for a report asks four times.
bool isFormat(const char *format, std::string_view known) {
  for (const char c : known)
    if (*format++ != c) return false;
  return *format == '\0';
}

template <class Field>
void addIntegers(DisplayLines &lines, const void *data, std::uint32_t count, const char *format) {
  if (isFormat(format, "%08x "))
    addHexLines<Field>(lines, data, count);
  else if (isFormat(format, "%14d "))
    addLinesAs<"%14d ", Field>(lines, data, count);
  else
    addLinesByPrintf<Field, typename Field::value_type>(lines, data, count, format);
}

template <class Field>
ReportValue arrayOf(const void *data, std::uint32_t length) {
  const auto *fields = static_cast<const Field *>(data);
  return ReportValue(std::vector<typename Field::value_type>(fields, fields + length));
}

}  // namespace
}  // namespace vesk

void HIDReportVeskPlugin::addArrayUint32(DisplayLines &lines, const void *data, std::uint32_t dataLength,
                                         const char *format) const {
  vesk::addIntegers<vesk::U32>(lines, data, dataLength, format);
}

void HIDReportVeskPlugin::addArrayInt32(DisplayLines &lines, const void *data, std::uint32_t dataLength,
                                        const char *format) const {
  vesk::addIntegers<vesk::I32>(lines, data, dataLength, format);
}

void HIDReportVeskPlugin::addArrayFloat(DisplayLines &lines, const void *data, std::uint32_t dataLength,
                                        const char *format) const {
  if (vesk::isFormat(format, "% -13.3f "))
    vesk::addLinesAs<"% -13.3f ", vesk::F32>(lines, data, dataLength);
  else
    vesk::addLinesByPrintf<vesk::F32, double>(lines, data, dataLength, format);
}

ReportValue HIDReportVeskPlugin::arrayWithUint32Array(const void *data, std::uint32_t length) const {
  return vesk::arrayOf<vesk::U32>(data, length);
}

ReportValue HIDReportVeskPlugin::arrayWithInt32Array(const void *data, std::uint32_t length) const {
  return vesk::arrayOf<vesk::I32>(data, length);
}

ReportValue HIDReportVeskPlugin::arrayWithFloatArray(const void *data, std::uint32_t length) const {
  return vesk::arrayOf<vesk::F32>(data, length);
}

bool HIDReportVeskPlugin::printStrings(const DisplayLines *lines) const {
  if (lines == nullptr) return false;
  std::putchar('\n');
  if (!lines->empty()) std::fwrite(lines->text().data(), 1, lines->text().size(), stdout);  // else data() is null
  std::putchar('\n');
  return true;
}
