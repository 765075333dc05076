// Option bytes in words, straight from their description.
#pragma once

#include <cstdint>
#include <string>

#include "tests/Text.h"

namespace test {

inline std::string levelName(unsigned level) {
  switch (level) {
    case 0:
      return "TRACE";
    case 1:
      return "DEBUG";
    case 2:
      return "INFO";
    case 3:
      return "WARNING";
    case 4:
      return "ERROR";
    case 5:
      return "CRITICAL";
    default:
      return "UNKNOWN";
  }
}

inline std::string optionText(std::uint8_t option, const std::string &name, bool printLevel) {
  const int gpio = option / 16 % 4;
  const std::string masked = option & 0x08 ? "MASKED " : "";
  const std::string message = option & 0x40 ? "MESSAGE " : "";
  const std::string gpioText = gpio == 1 ? "GPIO_0 " : gpio == 2 ? "GPIO_1 " : gpio == 3 ? "GPIO_2 " : "";
  const std::string breakpoint = option & 0x80 ? "BREAKPOINT " : "";
  const std::string none = (option & 0xF8) == 0 ? "(no options set)" : "";
  const std::string words = masked + message + gpioText + breakpoint + none;
  return printLevel ? printed("%40s: %s %s", name.c_str(), levelName(option & 7).c_str(), words.c_str())
                    : printed("%40s:  %s", name.c_str(), words.c_str());
}

}  // namespace test
