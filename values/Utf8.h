// Whether bytes are UTF-8, strictly.
#pragma once

#include <string_view>

namespace vesk {

/// True for well-formed UTF-8: no overlong form, no surrogate, nothing above U+10FFFF, no sequence cut short.
bool isUtf8(std::string_view bytes) noexcept;

}  // namespace vesk
