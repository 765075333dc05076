// What the tests of the report decoders share: reports under construction, both decoded forms as plain text, and tables
// of fields against which a report is checked byte by byte.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <bit>
#include <cstring>
#include <functional>
#include <map>
#include <memory>
#include <random>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "plugin/HIDReportVeskPlugin.h"
#include "tests/Text.h"

namespace test {

/// A report to be filled: all zero behind its ID.
class Report {
 public:
  Report(unsigned id, std::size_t size) : bytes_(size, '\0') { u8(0, static_cast<std::uint8_t>(id)); }

  Report &number(std::size_t at, std::size_t width, std::uint64_t value) {
    for (std::size_t i = 0; i < width; ++i) bytes_.at(at + i) = static_cast<char>(value >> (8 * i) & 0xFF);
    return *this;
  }
  Report &u8(std::size_t at, std::uint8_t value) { return number(at, 1, value); }
  Report &u16(std::size_t at, std::uint16_t value) { return number(at, 2, value); }
  Report &u32(std::size_t at, std::uint32_t value) { return number(at, 4, value); }
  Report &u64(std::size_t at, std::uint64_t value) { return number(at, 8, value); }
  Report &f32(std::size_t at, float value) { return u32(at, std::bit_cast<std::uint32_t>(value)); }
  Report &text(std::size_t at, std::string_view value) {
    bytes_.replace(at, value.size(), value);
    return *this;
  }
  /// Random bytes behind the ID, every fourth report with many extreme ones.
  Report &randomise(std::mt19937_64 &random) {
    const bool extreme = random() % 4 == 0;
    for (std::size_t i = 1; i < bytes_.size(); ++i) {
      const auto bits = random();
      bytes_[i] = static_cast<char>(extreme && bits % 3 != 0 ? (bits & 0x100 ? 0xFF : 0x00) : bits >> 32);
    }
    return *this;
  }

  std::uint64_t number(std::size_t at, std::size_t width) const {
    std::uint64_t value = 0;
    for (std::size_t i = width; i-- > 0;) value = value << 8 | static_cast<unsigned char>(bytes_.at(at + i));
    return value;
  }
  std::uint8_t u8(std::size_t at) const { return static_cast<std::uint8_t>(number(at, 1)); }
  std::uint32_t u32(std::size_t at) const { return static_cast<std::uint32_t>(number(at, 4)); }
  float f32(std::size_t at) const { return std::bit_cast<float>(u32(at)); }

  unsigned id() const { return u8(0); }
  std::size_t size() const { return bytes_.size(); }
  const std::string &bytes() const { return bytes_; }

 private:
  std::string bytes_;
};

using Lines = std::vector<std::string>;
/// The leaves of a value tree as ("PSE/PSE_MODULE_ID", "u16 4660"), array elements as ("D_SCAN_I[3]", "i32 -1"), floats
/// by their bits. A bare value has the path "".
using Leaves = std::vector<std::pair<std::string, std::string>>;

inline std::string leaf(std::uint8_t v) {
  return printed("u8 %u", unsigned{v});
}
inline std::string leaf(std::uint16_t v) {
  return printed("u16 %u", unsigned{v});
}
inline std::string leaf(std::uint32_t v) {
  return printed("u32 %u", v);
}
inline std::string leaf(std::uint64_t v) {
  return printed("u64 %llu", static_cast<unsigned long long>(v));
}
inline std::string leaf(std::int32_t v) {
  return printed("i32 %d", v);
}
inline std::string leaf(std::int64_t v) {
  return printed("i64 %lld", static_cast<long long>(v));
}
inline std::string leaf(float v) {
  return printed("float %08x", std::bit_cast<std::uint32_t>(v));
}
inline std::string leaf(double v) {
  return printed("double %016llx", static_cast<unsigned long long>(std::bit_cast<std::uint64_t>(v)));
}
inline std::string leaf(bool v) {
  return v ? "bool true" : "bool false";
}
inline std::string leaf(const vesk::Text &v) {
  return "string " + std::string(v.view());
}

template <class T>
inline constexpr bool kIsArray = false;
template <class T>
inline constexpr bool kIsArray<std::vector<T>> = true;

inline void appendLeaves(const ReportValue &value, const std::string &path, Leaves &leaves) {
  std::visit(
      [&]<class T>(const T &v) {
        if constexpr (std::is_same_v<T, vesk::Dictionary>) {
          for (const auto &[key, entry] : v)
            appendLeaves(entry, (path.empty() ? "" : path + "/") + std::string(key.text()), leaves);
        } else if constexpr (kIsArray<T>) {
          for (std::size_t i = 0; i < v.size(); ++i)
            leaves.emplace_back(path + "[" + std::to_string(i) + "]", leaf(v[i]));
        } else {
          leaves.emplace_back(path, leaf(v));
        }
      },
      value.variant());
}

inline Leaves leavesOf(const ReportResult &result) {
  Leaves leaves;
  appendLeaves(std::get<ReportValue>(result), "", leaves);
  return leaves;
}
inline Lines linesOf(const DisplayLines &lines) {
  return {lines.begin(), lines.end()};
}
inline Lines linesOf(const ReportResult &result) {
  return linesOf(std::get<DisplayLines>(result));
}

inline std::int32_t typeOf(unsigned id) {
  return id == 0x76 || id == 0x77 ? 0 : 2;
}

/// A plug-in in one of its modes.
class Decoder {
 public:
  explicit Decoder(bool strings, bool decimal = false) : plugin_(HIDReportVeskPlugin::init()) {
    plugin_->setUseStrings(strings);
    plugin_->setDisplayDecimal(decimal);
  }
  ReportResult operator()(const Report &report) { return (*this)(report.id(), report.bytes()); }
  ReportResult operator()(unsigned id, std::string_view bytes) {
    padded_.assign(bytes);
    return plugin_->reportToObject(padded_.data(), id, typeOf(id), padded_.length());
  }
  HIDReportVeskPlugin &plugin() { return *plugin_; }

 private:
  std::unique_ptr<HIDReportVeskPlugin> plugin_;
  PaddedReport padded_;
};

inline Lines decodeLines(const Report &report, bool decimal = false) {
  return linesOf(Decoder(true, decimal)(report));
}
inline ReportValue decodeValue(const Report &report) {
  return std::get<ReportValue>(Decoder(false)(report));
}
inline Leaves decodeLeaves(const Report &report) {
  return leavesOf(Decoder(false)(report));
}
inline std::map<std::string, std::string> decodeMap(const Report &report) {
  const Leaves leaves = decodeLeaves(report);
  return {leaves.begin(), leaves.end()};
}

/// The keys of the outermost dictionary.
inline std::vector<std::string> keysOf(const ReportValue &value) {
  std::vector<std::string> keys;
  for (const auto &[key, entry] : value.as<vesk::Dictionary>()) keys.emplace_back(key.text());
  return keys;
}

/// Whatever a decoder does, as one text.
inline std::string outcome(Decoder &decode, unsigned id, std::string_view bytes) {
  try {
    const ReportResult result = decode(id, bytes);
    std::string text;
    if (std::holds_alternative<std::monostate>(result)) return "nothing";
    if (std::holds_alternative<DisplayLines>(result)) {
      for (const std::string &line : linesOf(result)) text += "line " + line + "\n";
      return text;
    }
    for (const auto &[path, value] : leavesOf(result)) text += path + " = " + value + "\n";
    return text;
  } catch (const std::out_of_range &) {
    return "raises out_of_range";
  } catch (const std::invalid_argument &) {
    return "raises invalid_argument";
  }
}

/// One field of a report: the bytes that it has, and all that the two forms make of it.
struct Field {
  using Text = std::function<std::string(const Report &)>;
  std::size_t offset, width;
  std::map<std::size_t, Text> shown;  // by line, counted from 1
  std::map<std::string, Text> kept;   // by path
};

/// The text of `format` for a number of the report.
inline Field::Text show(const char *format, std::size_t at, std::size_t width) {
  return [=](const Report &r) {
    if (width == 8) return printed(format, static_cast<unsigned long long>(r.number(at, 8)));
    return printed(format, static_cast<unsigned>(r.number(at, width)));
  };
}
/// `count` numbers on one line.
template <class Element = std::uint32_t>
Field::Text showRow(const char *format, std::size_t at, std::size_t count = 8) {
  return [=](const Report &r) {
    std::string line;
    for (std::size_t i = 0; i < count; ++i) line += printed(format, std::bit_cast<Element>(r.u32(at + 4 * i)));
    return line;
  };
}
inline Field::Text showFloatRow(const char *format, std::size_t at) {
  return [=](const Report &r) {
    std::string line;
    for (std::size_t i = 0; i < 8; ++i) line += printed(format, double{r.f32(at + 4 * i)});
    return line;
  };
}
/// A number as a leaf of exactly the type T.
template <class T>
Field::Text keep(std::size_t at) {
  return [=](const Report &r) {
    const std::uint64_t bits = r.number(at, sizeof(T));
    if constexpr (std::is_same_v<T, float>)
      return leaf(r.f32(at));
    else
      return leaf(static_cast<T>(bits));
  };
}

/// 48 (or `count`) numbers from `at` on, in lines of eight that begin at line `line`.
template <class T>
void addArray(std::vector<Field> &fields, std::size_t at, std::size_t line, const std::string &path, const char *format,
              std::size_t count = 48) {
  for (std::size_t i = 0; i < count; ++i) {
    const std::size_t row = at + i / 8 * 32;
    Field::Text text;
    if constexpr (std::is_same_v<T, float>)
      text = showFloatRow(format, row);
    else
      text = showRow<T>(format, row);
    fields.push_back(
        {at + 4 * i, 4, {{line + i / 8, text}}, {{path + "[" + std::to_string(i) + "]", keep<T>(at + 4 * i)}}});
  }
}

/// Decodes `report` in both forms and compares every line and every leaf with what `fields` make of the all-zero forms.
/// `changed`: the one byte that is not zero, or 0 for a report in which every field counts.
inline void expectFields(const Report &report, const std::vector<Field> &fields, const Lines &zeroLines,
                         const Leaves &zeroLeaves, Decoder &toLines, Decoder &toValue, std::size_t changed) {
  std::map<std::size_t, std::string> wantedLines;
  std::map<std::string, std::string> wantedLeaves;
  for (const Field &field : fields) {
    if (changed != 0 && (changed < field.offset || changed >= field.offset + field.width)) continue;
    for (const auto &[line, text] : field.shown) wantedLines[line] = text(report);
    for (const auto &[path, text] : field.kept) wantedLeaves[path] = text(report);
  }
  const Lines lines = linesOf(toLines(report));
  ASSERT_EQ(lines.size(), zeroLines.size());
  ASSERT_TRUE(wantedLines.empty() || wantedLines.rbegin()->first <= lines.size());
  for (std::size_t i = 0; i < lines.size(); ++i) {
    const auto wanted = wantedLines.find(i + 1);
    ASSERT_EQ(lines[i], wanted == wantedLines.end() ? zeroLines[i] : wanted->second)
        << "line " << i + 1 << ", byte " << changed;
  }
  const Leaves leaves = leavesOf(toValue(report));
  ASSERT_EQ(leaves.size(), zeroLeaves.size());
  for (std::size_t i = 0; i < leaves.size(); ++i) {
    const auto wanted = wantedLeaves.find(leaves[i].first);
    ASSERT_EQ(leaves[i].first, zeroLeaves[i].first);
    ASSERT_EQ(leaves[i].second, wanted == wantedLeaves.end() ? zeroLeaves[i].second : wanted->second)
        << leaves[i].first << ", byte " << changed;
    if (wanted != wantedLeaves.end()) wantedLeaves.erase(wanted);
  }
  ASSERT_THAT(wantedLeaves, testing::IsEmpty()) << "byte " << changed;
}

/// A marker at every single offset of the report, all other bytes zero: it must show where `fields` say, and nowhere
/// else. Then `randoms` reports full of random bytes, in which all fields show at once.
inline void expectEveryOffset(unsigned id, std::size_t size, const std::vector<Field> &fields, bool decimal = false,
                              const std::vector<std::uint8_t> &markers = {0x01, 0x80, 0x6D, 0xFF}, int randoms = 200) {
  Decoder toLines(true, decimal), toValue(false, decimal);
  const Report zero(id, size);
  const Lines zeroLines = linesOf(toLines(zero));
  const Leaves zeroLeaves = leavesOf(toValue(zero));
  for (std::size_t at = 1; at < size; ++at)
    for (const std::uint8_t marker : markers) {
      ASSERT_NO_FATAL_FAILURE(
          expectFields(Report(id, size).u8(at, marker), fields, zeroLines, zeroLeaves, toLines, toValue, at))
          << "marker " << unsigned{marker};
    }
  std::mt19937_64 random(id);
  for (int i = 0; i < randoms; ++i) {
    const Report report = Report(id, size).randomise(random);
    ASSERT_NO_FATAL_FAILURE(expectFields(report, fields, zeroLines, zeroLeaves, toLines, toValue, 0));
  }
}

/// Byte 0 and everything behind the layout count for nothing.
inline void expectNothingElseIsRead(unsigned id, std::size_t size) {
  std::mt19937_64 random(id);
  for (const bool strings : {true, false}) {
    Decoder decode(strings);
    const Report report = Report(id, size).randomise(random);
    const std::string wanted = outcome(decode, id, report.bytes());
    EXPECT_EQ(outcome(decode, id, "\x11" + report.bytes().substr(1)), wanted);
    if (typeOf(id) == 2) {
      EXPECT_EQ(outcome(decode, id, report.bytes() + std::string(300, '\xA7')), wanted);
    }
  }
}

/// A report of each length from 0 to one past its layout: a feature decodes as if zeros followed, an input only whole.
inline void expectEveryLength(unsigned id, std::size_t size) {
  std::mt19937_64 random(id);
  const Report full = Report(id, size + 1).randomise(random);
  for (const bool strings : {true, false}) {
    Decoder decode(strings);
    for (std::size_t length = 0; length <= size + 1; ++length) {
      const std::string bytes = full.bytes().substr(0, length);
      std::string extended = bytes;
      extended.resize(size, '\0');
      const bool decodes = typeOf(id) == 2 || length == size;
      ASSERT_EQ(outcome(decode, id, bytes), decodes ? outcome(decode, id, extended) : "nothing") << length;
    }
  }
}

/// Random bodies in both forms. `compare` names what the two forms of a body do not say alike; exactly the names of
/// `allowed` must turn up, each at least once.
template <class Compare>
void expectDifferences(unsigned id, std::size_t size, const std::set<std::string> &allowed, Compare compare,
                       bool decimal = false, int bodies = 3000) {
  Decoder toLines(true, decimal), toValue(false, decimal);
  std::mt19937_64 random(id + 1000);
  std::set<std::string> seen;
  for (int i = 0; i < bodies; ++i) {
    const Report report = Report(id, size).randomise(random);
    const Leaves leaves = leavesOf(toValue(report));
    compare(linesOf(toLines(report)), std::map<std::string, std::string>(leaves.begin(), leaves.end()), seen);
  }
  EXPECT_EQ(seen, allowed);
}

/// What stands behind the last "separator" of a line.
inline std::string behind(const std::string &line, std::string_view separator) {
  const std::size_t at = line.rfind(separator);
  return at == std::string::npos ? "no \"" + std::string(separator) + "\" in: " + line
                                 : line.substr(at + separator.size());
}
/// The number of a leaf or of a line's text, by its digits.
inline std::string digits(const std::string &leafText) {
  return behind(leafText, " ");
}

}  // namespace test
