// The texts of a value tree: keys, which the compiler knows, and values, which it may know or which come out of a
// report.
#pragma once

#include <cstddef>
#include <cstring>
#include <string_view>
#include <utility>

namespace vesk {

/// A dictionary key, or a text that is always the same: a view of a string literal, made by the compiler, so that it
/// costs nothing and always lives. It is printable ASCII without quotes and backslashes, so that whoever writes it need
/// not look for something to escape.
class Key {
 public:
  template <std::size_t Size>
  consteval Key(const char (&literal)[Size]) : text_(literal, Size - 1) {  // NOLINT: implicit, like a string_view
    for (const char c : text_)
      if (c < ' ' || c > '~' || c == '"' || c == '\\') throw "a key that would have to be escaped";
  }

  constexpr std::string_view text() const noexcept { return text_; }

 private:
  std::string_view text_;
};

/// A text as a value: a constant, which is not copied, or bytes of its own. The black box configuration has 239 texts,
/// all of them one of seven words.
class Text {
 public:
  explicit Text(Key constant) noexcept : data_(constant.text().data()), size_(constant.text().size()) {}
  /// Takes a copy of `text`.
  explicit Text(std::string_view text) : size_(text.size()), owns_(true) {
    auto *copy = new char[text.size()];
    if (!text.empty()) std::memcpy(copy, text.data(), text.size());
    data_ = copy;
  }
  Text(Text &&other) noexcept
      : data_(std::exchange(other.data_, nullptr)),
        size_(std::exchange(other.size_, 0)),
        owns_(std::exchange(other.owns_, false)) {}
  Text(const Text &other) : Text(other.owns_ ? Text(other.view()) : Text(other.data_, other.size_)) {}
  Text &operator=(Text other) noexcept {
    std::swap(data_, other.data_);
    std::swap(size_, other.size_);
    std::swap(owns_, other.owns_);
    return *this;
  }
  ~Text() {
    if (owns_) delete[] data_;
  }

  /// Good as long as this text is, and for ever where it is constant.
  std::string_view view() const noexcept { return {data_, size_}; }
  /// Made from a Key, so that nothing in it needs an escape.
  bool isConstant() const noexcept { return !owns_; }

  friend bool operator==(const Text &a, const Text &b) noexcept { return a.view() == b.view(); }
  friend bool operator==(const Text &a, std::string_view b) noexcept { return a.view() == b; }

 private:
  Text(const char *data, std::size_t size) noexcept : data_(data), size_(size) {}

  const char *data_ = nullptr;
  std::size_t size_ = 0;
  bool owns_ = false;
};

}  // namespace vesk
