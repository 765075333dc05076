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

/// Writes a tree. Its functions write at `end`, look for the room themselves, and return the new end: where the text
/// ends stays in a register, which the many small entries of a tree are quicker for.
class TreeWriter {
 public:
  explicit TreeWriter(OutputBuffer &out) : out_(out) {}

  char *value(char *end, const ReportValue &value) {
    return std::visit([this, end](const auto &alternative) { return write(end, alternative); }, value.variant());
  }
  bool isLossy() const { return lossy_; }

 private:
  template <class Number>
  requires std::is_arithmetic_v<Number>
  char *write(char *end, Number number) {
    lossy_ |= host::isLossy(number);
    return writeNumber(out_.room(end, kTextNumberRoom), number);
  }

  char *write(char *end, bool value) {
    const std::string_view text = value ? "true" : "false";
    return std::copy(text.begin(), text.end(), out_.room(end, text.size()));
  }

  char *write(char *end, const Text &text) {
    const std::string_view view = text.view();
    if (!text.isConstant()) {
      out_.advanceTo(end);
      appendJsonString(out_, view);
      return out_.room(0);
    }
    end = out_.room(end, view.size() + 2);
    *end++ = '"';
    end = copyShort(end, view);
    *end++ = '"';
    return end;
  }

  template <class Number>
  char *write(char *end, const std::vector<Number> &numbers) {
    bool lossy = false;
    end = out_.room(end, 2 + numbers.size() * (kTextNumberRoom + 1));
    *end++ = '[';
    for (const Number number : numbers) {
      end = writeNumber(end, number);
      *end++ = ',';
      lossy |= host::isLossy(number);
    }
    if (!numbers.empty()) --end;
    *end++ = ']';
    lossy_ |= lossy;
    return end;
  }

  char *write(char *end, const Dictionary &dictionary) {
    char separator = '{';
    for (const auto &[key, entry] : dictionary) {
      const std::string_view name = key.text();  // nothing in a key needs an escape, which its constructor sees to
      end = out_.room(end, name.size() + 4);
      *end++ = separator;
      *end++ = '"';
      end = copyShort(end, name);
      *end++ = '"';
      *end++ = ':';
      end = value(end, entry);
      separator = ',';
    }
    end = out_.room(end, 2);
    if (dictionary.size() == 0) *end++ = '{';
    *end++ = '}';
    return end;
  }

  OutputBuffer &out_;
  bool lossy_ = false;
};

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
  TreeWriter writer(out);
  out.advanceTo(writer.value(out.room(0), value));
  return writer.isLossy();
}

void appendExact(OutputBuffer &out, const ReportValue &value) {
  ExactWriter writer(out);
  writer.value(value, "");
  writer.end();
}

}  // namespace vesk::host
