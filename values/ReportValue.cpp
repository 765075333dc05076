// The value tree's memory, look-up, comparison and debug print.
#include "values/ReportValue.h"

#include <bit>
#include <charconv>
#include <memory>
#include <ostream>
#include <stdexcept>
#include <string>

#include "values/PrintfFormat.h"

namespace vesk {

namespace {

template <class T>
inline constexpr bool kIsArray = false;
template <class T>
inline constexpr bool kIsArray<std::vector<T>> = true;

/// The alternatives from here on hold memory.
constexpr std::size_t kFirstOwner = 9;
static_assert(std::is_same_v<std::variant_alternative_t<kFirstOwner, ReportValue::Variant>, Text>);

bool same(float a, float b) noexcept {
  return std::bit_cast<std::uint32_t>(a) == std::bit_cast<std::uint32_t>(b);
}
bool same(double a, double b) noexcept {
  return std::bit_cast<std::uint64_t>(a) == std::bit_cast<std::uint64_t>(b);
}

template <class T>
bool same(const T &a, const T &b) noexcept {
  if constexpr (std::is_same_v<T, std::vector<float>>) {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i)
      if (!same(a[i], b[i])) return false;
    return true;
  } else if constexpr (std::is_same_v<T, Dictionary>) {
    if (a.size() != b.size()) return false;
    for (const auto &[key, value] : a) {
      const ReportValue *other = b.find(key.text());
      if (other == nullptr || !(value == *other)) return false;
    }
    return true;
  } else {
    return a == b;
  }
}

template <class T>
constexpr const char *typeName() {
  if constexpr (std::is_same_v<T, std::uint8_t>)
    return "u8";
  else if constexpr (std::is_same_v<T, std::uint16_t>)
    return "u16";
  else if constexpr (std::is_same_v<T, std::uint32_t>)
    return "u32";
  else if constexpr (std::is_same_v<T, std::uint64_t>)
    return "u64";
  else if constexpr (std::is_same_v<T, std::int32_t>)
    return "i32";
  else if constexpr (std::is_same_v<T, std::int64_t>)
    return "i64";
  else if constexpr (std::is_same_v<T, float>)
    return "float";
  else
    return "double";
}

/// With as many digits as tell it from every other number of its type.
template <class T>
void printNumber(std::ostream &out, T value) {
  char text[32];
  out.write(text, std::to_chars(text, text + sizeof(text), value).ptr - text);
}

void printText(std::ostream &out, std::string_view text) {
  out << '"';
  for (const char c : text) {
    if (c == '"' || c == '\\')
      out << '\\' << c;
    else if (static_cast<unsigned char>(c) >= 0x20 && c != 0x7F)
      out << c;
    else
      out << "\\x" << formatted<"%02x">(std::uint32_t{static_cast<unsigned char>(c)});
  }
  out << '"';
}

template <class T>
void print(std::ostream &out, const T &value) {
  if constexpr (std::is_same_v<T, Text>) {
    printText(out, value.view());
  } else if constexpr (kIsArray<T>) {
    out << typeName<typename T::value_type>() << '[';
    for (std::size_t i = 0; i < value.size(); ++i) {
      out << (i == 0 ? "" : ", ");
      printNumber(out, value[i]);
    }
    out << ']';
  } else if constexpr (std::is_same_v<T, Dictionary>) {
    const char *separator = "{";
    for (const auto &[key, entry] : value) {
      out << separator << '"' << key.text() << "\": " << entry;
      separator = ", ";
    }
    out << (value.size() == 0 ? "{}" : "}");
  } else if constexpr (std::is_same_v<T, bool>) {
    out << (value ? "true" : "false");
  } else {
    out << typeName<T>() << ' ';
    printNumber(out, value);
  }
}

}  // namespace

Dictionary::Dictionary(std::size_t entries, std::size_t nestedEntries)
    : entries_(static_cast<Entry *>(::operator new((entries + nestedEntries) * sizeof(Entry)))),
      capacity_(static_cast<std::uint32_t>(entries)),
      room_(static_cast<std::uint32_t>(nestedEntries)),
      owns_(true) {}

Dictionary::Dictionary(Dictionary &&other) noexcept {
  steal(other);
}

Dictionary &Dictionary::operator=(Dictionary &&other) noexcept {
  Dictionary taken(std::move(other));
  release();
  steal(taken);
  return *this;
}

Dictionary::~Dictionary() {
  release();
}

void Dictionary::steal(Dictionary &other) noexcept {
  entries_ = std::exchange(other.entries_, nullptr);
  size_ = std::exchange(other.size_, 0);
  capacity_ = std::exchange(other.capacity_, 0);
  room_ = std::exchange(other.room_, 0);
  owns_ = std::exchange(other.owns_, false);
}

/// Whether there is nothing to give back, as with most entries.
bool Dictionary::holdsNoMemory(const Entry &entry) noexcept {
  const ReportValue::Variant &value = entry.value.variant();
  if (value.index() < kFirstOwner) return true;
  const auto *text = std::get_if<Text>(&value);
  return text != nullptr && text->isConstant();
}

void Dictionary::release() noexcept {
  for (Entry *entry = entries_; entry != entries_ + size_; ++entry)
    if (!holdsNoMemory(*entry)) std::destroy_at(entry);
  if (owns_) ::operator delete(entries_);
}

void Dictionary::throwFull() {
  throw std::length_error("vesk::Dictionary: more entries than it was given room for");
}

const ReportValue *Dictionary::find(std::string_view key) const noexcept {
  for (const auto &[name, value] : *this)
    if (name.text() == key) return &value;
  return nullptr;
}

Dictionary Dictionary::clone() const {
  Dictionary copy(size_);
  for (const auto &[key, value] : *this) copy.add(key, value.clone());
  return copy;
}

}  // namespace vesk

using vesk::Dictionary;

ReportValue ReportValue::clone() const {
  return std::visit(
      []<class T>(const T &value) {
        if constexpr (std::is_same_v<T, Dictionary>)
          return ReportValue(value.clone());
        else
          return ReportValue(value);
      },
      variant_);
}

std::size_t ReportValue::size() const noexcept {
  return std::visit(
      []<class T>(const T &value) -> std::size_t {
        if constexpr (std::is_same_v<T, Dictionary> || vesk::kIsArray<T>)
          return value.size();
        else
          return 0;
      },
      variant_);
}

const ReportValue *ReportValue::find(std::string_view key) const noexcept {
  const auto *dictionary = std::get_if<Dictionary>(&variant_);
  return dictionary == nullptr ? nullptr : dictionary->find(key);
}

const ReportValue &ReportValue::at(std::string_view key) const {
  const ReportValue *value = find(key);
  if (value == nullptr) throw std::out_of_range("ReportValue: no key " + std::string(key));
  return *value;
}

ReportValue ReportValue::at(std::size_t index) const {
  return std::visit(
      [index]<class T>(const T &value) -> ReportValue {
        if constexpr (vesk::kIsArray<T>)
          return ReportValue(value.at(index));
        else
          throw std::out_of_range("ReportValue: an index into what is no array");
      },
      variant_);
}

bool operator==(const ReportValue &a, const ReportValue &b) noexcept {
  if (a.variant_.index() != b.variant_.index()) return false;
  return std::visit([&b]<class T>(const T &value) { return vesk::same(value, b.as<T>()); }, a.variant_);
}

std::ostream &operator<<(std::ostream &out, const ReportValue &value) {
  std::visit([&out](const auto &alternative) { vesk::print(out, alternative); }, value.variant_);
  return out;
}
