// The value tree of one report: numbers that keep their width and signedness, texts, number arrays, dictionaries.
#pragma once

#include <cstddef>
#include <cstdint>
#include <iosfwd>
#include <new>
#include <string_view>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

#include "values/Text.h"

class ReportValue;

namespace vesk {

struct Entry;
class EntryAdder;

/// String keys to values, in the order in which they were added. Each key is added once.
///
/// Its entries lie in one block of fixed size. A dictionary that is going to hold dictionaries is given room for their
/// entries too, behind its own, so that a whole tree is one allocation: one for each of the 239 small dictionaries of
/// the black box configuration took three times as long.
class Dictionary {
  /// Entries that belong to an outer dictionary.
  struct Room {
    Entry *entries;
    std::uint32_t capacity;
  };

 public:
  Dictionary() noexcept = default;
  /// Room for `entries` entries, and for `nestedEntries` more that addDictionary() deals out.
  explicit Dictionary(std::size_t entries, std::size_t nestedEntries = 0);
  /// For addDictionary() alone, since nobody else has a Room.
  explicit Dictionary(Room room) noexcept : entries_(room.entries), capacity_(room.capacity) {}
  Dictionary(Dictionary &&other) noexcept;
  Dictionary &operator=(Dictionary &&other) noexcept;
  ~Dictionary();

  /// Adds a value, a ReportValue or exactly one of its types; std::length_error when the room is used up.
  template <class T>
  void add(Key key, T value);
  /// Adds an empty dictionary with room for `entries`. What it returns is good as long as this dictionary is.
  EntryAdder addDictionary(Key key, std::size_t entries);

  std::size_t size() const noexcept { return size_; }
  const Entry *begin() const noexcept { return entries_; }
  const Entry *end() const noexcept;
  /// The value under `key`, or null.
  const ReportValue *find(std::string_view key) const noexcept;
  Dictionary clone() const;

 private:
  friend class ::ReportValue;
  template <class... Args>
  Entry &emplace(Key key, Args &&...args);
  Room dealOut(std::size_t entries) noexcept;
  void steal(Dictionary &other) noexcept;
  static bool holdsNoMemory(const Entry &entry) noexcept;
  void release() noexcept;
  [[noreturn]] static void throwFull();

  Entry *entries_ = nullptr;
  std::uint32_t size_ = 0;
  std::uint32_t capacity_ = 0;
  std::uint32_t room_ = 0;  // entries behind entries_ + capacity_ that are still to be dealt out
  bool owns_ = false;       // false: the block belongs to an outer dictionary
};

/// Fills a dictionary. A nested one is handed out as this alone, because it must not be moved away from the block that
/// it lies in.
class EntryAdder {
 public:
  EntryAdder(Dictionary &dictionary) : dictionary_(dictionary) {}  // NOLINT: implicit

  template <class T>
  void add(Key key, T value);
  EntryAdder addDictionary(Key key, std::size_t entries) { return dictionary_.addDictionary(key, entries); }

 private:
  Dictionary &dictionary_;
};

template <class T, class Variant>
inline constexpr bool kIsAlternative = false;
template <class T, class... Alternatives>
inline constexpr bool kIsAlternative<T, std::variant<Alternatives...>> = (std::is_same_v<T, Alternatives> || ...);

}  // namespace vesk

/// One node of the tree. Move-only, with clone() for a copy. No constructor converts, so that a width is always said.
class ReportValue {
 public:
  using Variant = std::variant<std::uint8_t, std::uint16_t, std::uint32_t, std::uint64_t, std::int32_t, std::int64_t,
                               float, double, bool, vesk::Text, std::vector<std::uint32_t>, std::vector<std::int32_t>,
                               std::vector<float>, vesk::Dictionary>;

  template <class T>
  requires vesk::kIsAlternative<T, Variant>
  explicit ReportValue(T value) : variant_(std::in_place_type<T>, std::move(value)) {}

  ReportValue clone() const;

  /// For std::visit.
  const Variant &variant() const noexcept { return variant_; }
  template <class T>
  bool is() const noexcept {
    return std::holds_alternative<T>(variant_);
  }
  /// The value as exactly the type that it has; std::bad_variant_access for any other.
  template <class T>
  const T &as() const {
    return std::get<T>(variant_);
  }

  /// Entries of a dictionary, elements of an array, 0 for everything else.
  std::size_t size() const noexcept;
  /// The value under `key`, or null where there is none or this is no dictionary.
  const ReportValue *find(std::string_view key) const noexcept;
  /// The value under `key`; std::out_of_range where find() gives null.
  const ReportValue &at(std::string_view key) const;
  /// Element `index` of an array as a value of its own; std::out_of_range beyond its end or where this is no array.
  ReportValue at(std::size_t index) const;

  /// Same types and same values. The order of dictionary entries does not count; floats are compared by their bits, so
  /// that a NaN equals its copy.
  friend bool operator==(const ReportValue &a, const ReportValue &b) noexcept;
  /// One line for people: {"Count": u32 7, "Name": "x"}.
  friend std::ostream &operator<<(std::ostream &out, const ReportValue &value);

 private:
  friend class vesk::Dictionary;  // makes its values in place, and fills the dictionary that it has just added
  template <class T, class From>
  ReportValue(std::in_place_type_t<T> type, From &&from) : variant_(type, std::forward<From>(from)) {}
  vesk::Dictionary &nested() { return std::get<vesk::Dictionary>(variant_); }

  Variant variant_;
};

namespace vesk {

/// One row of a dictionary; decomposes into [key, value].
struct Entry {
  Key key;
  ReportValue value;
};

// Named widths, for values that come out of arithmetic or a layout field: add("BROWNOUT", u8(flags & 1)).
constexpr std::uint8_t u8(std::uint8_t value) noexcept {
  return value;
}
constexpr std::uint16_t u16(std::uint16_t value) noexcept {
  return value;
}
constexpr std::uint32_t u32(std::uint32_t value) noexcept {
  return value;
}
constexpr std::uint64_t u64(std::uint64_t value) noexcept {
  return value;
}
constexpr std::int32_t i32(std::int32_t value) noexcept {
  return value;
}
constexpr std::int64_t i64(std::int64_t value) noexcept {
  return value;
}

inline const Entry *Dictionary::end() const noexcept {
  return entries_ + size_;
}

template <class... Args>
Entry &Dictionary::emplace(Key key, Args &&...args) {
  if (size_ == capacity_) throwFull();
  Entry &entry = *::new (entries_ + size_) Entry{key, ReportValue(std::forward<Args>(args)...)};
  ++size_;
  return entry;
}

template <class T>
void Dictionary::add(Key key, T value) {
  static_assert(std::is_same_v<T, ReportValue> || kIsAlternative<T, ReportValue::Variant>, "say the width");
  if constexpr (std::is_same_v<T, ReportValue>)
    emplace(key, std::move(value));
  else
    emplace(key, std::in_place_type<T>, std::move(value));
}

inline Dictionary::Room Dictionary::dealOut(std::size_t entries) noexcept {
  room_ -= static_cast<std::uint32_t>(entries);
  return {entries_ + capacity_ + room_, static_cast<std::uint32_t>(entries)};
}

inline EntryAdder Dictionary::addDictionary(Key key, std::size_t entries) {
  constexpr std::in_place_type_t<Dictionary> kType;
  Entry &entry = entries <= room_ ? emplace(key, kType, dealOut(entries)) : emplace(key, kType, Dictionary(entries));
  return entry.value.nested();
}

template <class T>
void EntryAdder::add(Key key, T value) {
  dictionary_.add(key, std::move(value));
}

}  // namespace vesk
