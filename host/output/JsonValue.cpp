// One pass for the tree; a second one, for the few trees that need it, for the numbers that JSON readers lose.
#include "host/output/JsonValue.h"

#include "host/output/JsonText.h"

namespace vesk::host {

namespace {

constexpr std::uint64_t kLargestExact = std::uint64_t{1} << 53;  // of a reader that keeps numbers as doubles

template <class T>
inline constexpr bool kIsArray = false;
template <class T>
inline constexpr bool kIsArray<std::vector<T>> = true;

template <class Number>
bool isLossy(Number value) {
  if constexpr (std::is_floating_point_v<Number>)
    return !std::isfinite(value);
  else if constexpr (std::is_same_v<Number, std::int64_t>)
    return value > static_cast<std::int64_t>(kLargestExact) || value < -static_cast<std::int64_t>(kLargestExact);
  else if constexpr (std::is_same_v<Number, std::uint64_t>)
    return value > kLargestExact;
  else
    return false;
}

template <class Number>
bool appendArray(OutputBuffer &out, const std::vector<Number> &numbers) {
  bool lossy = false;
  char *end = out.room(2 + numbers.size() * (kTextNumberRoom + 1));
  *end++ = '[';
  for (const Number number : numbers) {
    end = writeNumber(end, number);
    *end++ = ',';
    lossy |= isLossy(number);
  }
  if (!numbers.empty()) --end;
  *end++ = ']';
  out.advanceTo(end);
  return lossy;
}

bool appendDictionary(OutputBuffer &out, const Dictionary &dictionary) {
  bool lossy = false;
  char separator = '{';
  for (const auto &[key, value] : dictionary) {
    const std::string_view name = key.text();  // nothing in a key needs an escape, which its constructor sees to
    char *end = out.room(name.size() + 4);
    *end++ = separator;
    *end++ = '"';
    end = std::copy(name.begin(), name.end(), end);
    *end++ = '"';
    *end++ = ':';
    out.advanceTo(end);
    lossy |= appendJsonValue(out, value);
    separator = ',';
  }
  out.append(dictionary.size() == 0 ? "{}" : "}");
  return lossy;
}

/// A key as a step of a JSON Pointer.
std::string pointerStep(std::string_view key) {
  std::string step = "/";
  for (const char c : key) {
    if (c == '~')
      step += "~0";
    else if (c == '/')
      step += "~1";
    else
      step += c;
  }
  return step;
}

class ExactWriter {
 public:
  explicit ExactWriter(OutputBuffer &out) : out_(out) { out_.append('{'); }

  void value(const ReportValue &node, const std::string &pointer) {
    std::visit([&](const auto &alternative) { visit(alternative, pointer); }, node.variant());
  }
  void end() { out_.append('}'); }

 private:
  template <class T>
  void visit(const T &alternative, const std::string &pointer) {
    if constexpr (std::is_same_v<T, Dictionary>) {
      for (const auto &[key, entry] : alternative) value(entry, pointer + pointerStep(key.text()));
    } else if constexpr (kIsArray<T>) {
      for (std::size_t i = 0; i < alternative.size(); ++i) number(alternative[i], pointer + "/" + std::to_string(i));
    } else if constexpr (std::is_arithmetic_v<T>) {
      number(alternative, pointer);
    }
  }

  template <class Number>
  void number(Number value, const std::string &pointer) {
    if (!isLossy(value)) return;
    if (!first_) out_.append(',');
    first_ = false;
    appendJsonString(out_, pointer);
    out_.append(":\"");
    if constexpr (std::is_floating_point_v<Number>)
      out_.append(std::isnan(value) ? "nan" : value < 0 ? "-inf" : "inf");
    else
      appendNumber(out_, value);
    out_.append('"');
  }

  OutputBuffer &out_;
  bool first_ = true;
};

}  // namespace

bool appendJsonValue(OutputBuffer &out, const ReportValue &value) {
  return std::visit(
      [&out]<class T>(const T &alternative) {
        if constexpr (std::is_same_v<T, Dictionary>) {
          return appendDictionary(out, alternative);
        } else if constexpr (kIsArray<T>) {
          return appendArray(out, alternative);
        } else if constexpr (std::is_same_v<T, std::string>) {
          appendJsonString(out, alternative);
          return false;
        } else if constexpr (std::is_same_v<T, bool>) {
          out.append(alternative ? "true" : "false");
          return false;
        } else {
          appendNumber(out, alternative);
          return isLossy(alternative);
        }
      },
      value.variant());
}

void appendExact(OutputBuffer &out, const ReportValue &value) {
  ExactWriter writer(out);
  writer.value(value, "");
  writer.end();
}

}  // namespace vesk::host
