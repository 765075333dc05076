// Text made by the C library's own printf: the oracle for every format.
#pragma once

#include <cstdio>
#include <string>

namespace test {

#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
#pragma GCC diagnostic ignored "-Wformat-security"
template <class... Args>
std::string printed(const char *format, Args... args) {
  std::string text(static_cast<std::size_t>(std::snprintf(nullptr, 0, format, args...)), '\0');
  std::snprintf(text.data(), text.size() + 1, format, args...);
  return text;
}
#pragma GCC diagnostic pop

}  // namespace test
