// What PrintedValue is made with: a report's value, and a function for each report that prints it.
#pragma once

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "values/ReportValue.h"

namespace fuzz {

class Printer {
 public:
  Printer(const ReportValue &value, std::string_view report, bool decimal)
      : value_(value), report_(report), decimal_(decimal) {}

  __attribute__((format(printf, 2, 3))) void line(const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    addFormatted(format, arguments);
    va_end(arguments);
    text_ += '\n';
  }
  std::string take() { return std::move(text_); }

  void version() { line("%s", std::string(value_.as<vesk::Text>().view()).c_str()); }
  void image();
  void packet();
  void dumpConfig();
  void dumpState() { line("ADC Dump State: %s", std::string(value_.as<vesk::Text>().view()).c_str()); }
  void summary();
  void fullReport();
  void configuration();
  void openShortTest();
  void openShortData(const char *scan);
  void parameters(const char *title, const char *key);
  void watchdog();
  void powerModes();

 private:
  // Without the attribute: g++ judges the format where line() is called.
  void addFormatted(const char *format, va_list arguments) {
    char buffer[1024];
    const int size = std::vsnprintf(buffer, sizeof(buffer), format, arguments);
    if (size < 0 || static_cast<std::size_t>(size) >= sizeof(buffer)) std::abort();
    text_.append(buffer, static_cast<std::size_t>(size));
  }
  template <class T>
  const T &get(const char *key) const {
    return value_.at(std::string_view(key)).as<T>();
  }
  unsigned u32(const char *key) const { return get<std::uint32_t>(key); }
  unsigned byte(std::size_t at) const { return static_cast<unsigned char>(report_.at(at)); }
  template <class Number>
  void words(const std::vector<Number> &numbers, bool decimal);
  void mask(const char *label, std::uint64_t mask);
  void option(const char *label, bool isGlobal, const ReportValue &option);

  const ReportValue &value_;
  std::string_view report_;
  bool decimal_;
  std::string text_;
};

}  // namespace fuzz
