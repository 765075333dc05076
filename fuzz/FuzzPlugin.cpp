// Any report through the plug-in in every mode: nothing is read that must not be, and the two forms tell the same
// story.
#include <algorithm>
#include <iterator>
#include <optional>
#include <stdexcept>

#include "fuzz/Check.h"
#include "fuzz/FuzzInput.h"
#include "fuzz/PrintedValue.h"
#include "plugin/HIDReportVeskPlugin.h"

namespace {

using fuzz::check;
using fuzz::checkSame;

enum class Raised { kNothing, kOutOfRange, kInvalidArgument };

struct Outcome {
  ReportResult result;
  Raised raised = Raised::kNothing;

  bool isNothing() const { return raised == Raised::kNothing && std::holds_alternative<std::monostate>(result); }
  std::string lines() const {
    check(std::holds_alternative<DisplayLines>(result), "string mode gives lines");
    return std::string(std::get<DisplayLines>(result).text());
  }
  const ReportValue &value() const {
    check(std::holds_alternative<ReportValue>(result), "object mode gives a value");
    return std::get<ReportValue>(result);
  }
};

struct Call {
  std::uint32_t id;
  std::int32_t type;
  std::int64_t length;
  bool decimal;
};

Outcome decode(const PaddedReport &report, const Call &call, bool strings) {
  static const auto plugin = HIDReportVeskPlugin::init();
  plugin->setUseStrings(strings);
  plugin->setDisplayDecimal(call.decimal);
  Outcome outcome;
  try {
    outcome.result = plugin->reportToObject(report.data(), call.id, call.type, call.length);
  } catch (const std::out_of_range &) {
    outcome.raised = Raised::kOutOfRange;
  } catch (const std::invalid_argument &) {
    outcome.raised = Raised::kInvalidArgument;
  }
  check(plugin->report_id() == call.id && plugin->report_len() == call.length &&
            plugin->report_type() == static_cast<std::uint32_t>(call.type) && plugin->report_buf() == report.data(),
        "the report that was handed over is stored");
  check(plugin->useStrings() == strings && plugin->displayDecimal() == call.decimal, "the flags stay as they were");
  return outcome;
}

bool isDecoded(const Call &call) {
  constexpr std::uint32_t kFeatures[] = {0xA2, 0xA9, 0xD0, 0xD2, 0xDC, 0xDE, 0xDF, 0xE0,
                                         0xE1, 0xE2, 0xE3, 0xE4, 0xE5, 0xEA, 0xEC};
  if (call.type == 2) return std::ranges::find(kFeatures, call.id) != std::end(kFeatures);
  return call.type == 0 && ((call.id == 0x76 && call.length == 792) || (call.id == 0x77 && call.length == 2064));
}

/// By the table of well-formed sequences, written out; the product has its own way.
bool isUtf8(std::string_view text) {
  const auto byte = [&](std::size_t i) { return i < text.size() ? static_cast<unsigned char>(text[i]) : 0u; };
  const auto in = [](unsigned c, unsigned low, unsigned high) { return c >= low && c <= high; };
  const auto tail = [&](std::size_t i) { return in(byte(i), 0x80, 0xBF); };
  for (std::size_t i = 0; i < text.size();) {
    const unsigned a = byte(i), b = byte(i + 1);
    if (a < 0x80)
      i += 1;
    else if (in(a, 0xC2, 0xDF) && tail(i + 1))
      i += 2;
    else if (((a == 0xE0 && in(b, 0xA0, 0xBF)) || ((in(a, 0xE1, 0xEC) || in(a, 0xEE, 0xEF)) && in(b, 0x80, 0xBF)) ||
              (a == 0xED && in(b, 0x80, 0x9F))) &&
             tail(i + 2))
      i += 3;
    else if (((a == 0xF0 && in(b, 0x90, 0xBF)) || (in(a, 0xF1, 0xF3) && in(b, 0x80, 0xBF)) ||
              (a == 0xF4 && in(b, 0x80, 0x8F))) &&
             tail(i + 2) && tail(i + 3))
      i += 4;
    else
      return false;
  }
  return true;
}

void checkExtendedVersion(const std::string &text, const Outcome &lines, const Outcome &value) {
  checkSame(lines.lines(), text, "the extended version's lines");
  const auto pieces = static_cast<std::size_t>(std::ranges::count(text, '\n'));
  check(std::get<DisplayLines>(lines.result).size() == pieces, "one line a piece");
  if (pieces < 6) return check(value.raised == Raised::kOutOfRange, "fewer than six pieces are out of range");
  check(value.value().size() == 6, "six components");
  std::string_view rest = text;
  for (const char *key : {"PROJECT", "SDK", "TOOLCHAIN", "KORVO", "VENDOR", "ALGS"}) {
    const std::size_t end = rest.find('\n');
    check(value.value().at(std::string_view(key)).as<vesk::Text>() == rest.substr(0, end), key);
    rest.remove_prefix(end + 1);
  }
}

void checkVersion(const Call &call, const PaddedReport &report, const Outcome &lines, const Outcome &value) {
  const bool extended = call.id == 0xD2;
  const std::string text = fuzz::printedVersion(report.bytes());
  if (!isUtf8(text)) {
    const Outcome &absent = extended ? lines : value, &raised = extended ? value : lines;
    check(absent.isNothing(), "one form of a version that is no text is nothing");
    return check(raised.raised == Raised::kInvalidArgument, "the other form raises");
  }
  if (extended) return checkExtendedVersion(text, lines, value);
  checkSame(lines.lines(), text, "the version's line");
  check(std::get<DisplayLines>(lines.result).size() == 1, "one line, whatever line feeds it holds");
  check(std::string(value.value().as<vesk::Text>().view()) + "\n" == text, "the version's string");
}

void checkReport(const PaddedReport &report, const Call &call) {
  const Outcome lines = decode(report, call, true), value = decode(report, call, false);
  if (!isDecoded(call)) return check(lines.isNothing() && value.isNothing(), "what nobody decodes yields nothing");
  if (call.id == 0xD0 || call.id == 0xD2) return checkVersion(call, report, lines, value);

  const std::string_view readable(report.data(), std::max<std::size_t>(kReadableBytes, report.bytes().size()));
  checkSame(lines.lines(), fuzz::printedValue(call.id, value.value(), readable, call.decimal), "lines against value");
  const auto &shown = std::get<DisplayLines>(lines.result);
  std::string joined;
  for (const std::string_view line : shown) joined.append(line) += '\n';
  checkSame(joined, lines.lines(), "the lines one by one");

  const ReportValue copy = value.value().clone();
  check(copy == value.value() && value.value() == copy, "a copy equals its original");
  check(decode(report, call, false).value() == copy, "decoding again gives the same");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  fuzz::FuzzInput input(data, size);
  const auto flags = input.take<std::uint8_t>();
  Call call{};
  call.decimal = (flags & 1) != 0;
  const bool otherType = (flags & 2) != 0, otherId = (flags & 4) != 0, otherLength = (flags & 8) != 0;
  std::optional<std::uint32_t> id;
  std::optional<std::int32_t> type;
  std::optional<std::int64_t> length;
  if (otherType) type = input.take<std::int32_t>();
  if (otherId) id = input.take<std::uint32_t>();
  if (otherLength) length = input.take<std::int64_t>();

  const std::string_view bytes = input.rest().substr(0, 8192);
  // A length that the report does not have is the caller's lie; it must keep the promise of readable bytes all the
  // same.
  std::string padded(bytes);
  if (length && padded.size() < 2064) padded.resize(2064, '\0');
  const PaddedReport report(padded);
  call.id = id.value_or(bytes.empty() ? 0 : static_cast<unsigned char>(bytes[0]));
  call.type = type.value_or(call.id == 0x76 || call.id == 0x77 ? 0 : 2);
  call.length = length.value_or(report.length());
  checkReport(report, call);
  return 0;
}
