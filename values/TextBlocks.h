// Ready texts in blocks of fixed size, for the rows that are printed most: copying a whole block is cheaper than
// copying as many bytes as the text has.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace vesk {

/// A text of at most 48 characters that stands right-aligned in `Width` columns, padded by the compiler: what "%40s"
/// would do with it, as one block to copy.
template <std::size_t Width>
struct Label {
  static constexpr std::size_t kBlock = 48;
  char text[kBlock]{};
  std::uint8_t size = 0;

  template <std::size_t Size>
  consteval Label(const char (&literal)[Size]) {  // NOLINT: implicit
    static_assert(Size - 1 <= kBlock && Width <= kBlock);
    const std::size_t blanks = Size - 1 < Width ? Width - (Size - 1) : 0;
    std::fill_n(text, blanks, ' ');
    std::copy_n(literal, Size - 1, text + blanks);
    size = static_cast<std::uint8_t>(blanks + Size - 1);
  }
};

/// A ready text in a block of fixed size, for rows that are chosen from a table.
template <std::size_t Block>
struct TextBlock {
  static constexpr std::size_t kBlock = Block;
  char text[Block]{};
  std::uint8_t size = 0;

  constexpr void append(std::string_view piece) {
    for (const char c : piece) text[size++] = c;
  }
};

template <class T>
inline constexpr bool kIsBlock = false;
template <std::size_t Width>
inline constexpr bool kIsBlock<Label<Width>> = true;
template <std::size_t Block>
inline constexpr bool kIsBlock<TextBlock<Block>> = true;

}  // namespace vesk
