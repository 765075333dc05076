// The error value's words.
#include "values/PluginError.h"

#include <algorithm>
#include <string_view>

#include "values/PrintfFormat.h"

std::string PluginError::localizedDescription() const {
  const auto message = userInfo.find(kLocalizedDescription);
  return message == userInfo.end() ? std::string() : message->second;
}

namespace {

/// How many bytes at the start of `text` are one character that a line cannot hold; 0 where it can.
std::size_t unprintable(std::string_view text) {
  const auto byte = static_cast<unsigned char>(text[0]);
  if (byte < 0x20 || byte == 0x7F) return 1;
  if (byte == 0xC2 && text.size() > 1 && static_cast<unsigned char>(text[1]) < 0xA0) return 2;  // U+0080 to U+009F
  if (text.starts_with("\u2028") || text.starts_with("\u2029")) return 3;
  return 0;
}

}  // namespace

std::string PluginError::description() const {
  const std::string message = localizedDescription();
  std::string line = domain + " error " + std::to_string(code) + ": ";
  for (std::size_t i = 0, escaped = 0; i < message.size(); ++i) {
    escaped = std::max(escaped, i + unprintable(std::string_view(message).substr(i)));
    if (i < escaped)
      line += "\\x" + vesk::formatted<"%02x">(std::uint32_t{static_cast<unsigned char>(message[i])});
    else
      line += message[i];
  }
  return line;
}
