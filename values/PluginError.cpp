// The error value's words.
#include "values/PluginError.h"

#include "values/PrintfFormat.h"

std::string PluginError::localizedDescription() const {
  const auto message = userInfo.find(kLocalizedDescription);
  return message == userInfo.end() ? std::string() : message->second;
}

std::string PluginError::description() const {
  std::string line = domain + " error " + std::to_string(code) + ": ";
  for (const char c : localizedDescription()) {
    const auto byte = static_cast<unsigned char>(c);
    if (byte >= 0x20 && byte != 0x7F)
      line += c;
    else
      line += "\\x" + vesk::formatted<"%02x">(std::uint32_t{byte});
  }
  return line;
}
