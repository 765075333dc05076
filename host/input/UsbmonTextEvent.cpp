// Taking a line of usbmon text apart.
#include "host/input/UsbmonTextEvent.h"

#include "host/input/PlainText.h"

namespace vesk::host {

std::string_view takeUsbmonPart(std::string_view &text) {
  const std::size_t colon = text.find(':');
  const std::string_view part = text.substr(0, colon);
  text.remove_prefix(colon == std::string_view::npos ? text.size() : colon + 1);
  return part;
}

std::optional<UsbmonEvent> parseUsbmonEvent(std::string_view line) {
  const auto tag = parseNumber(takeWord(line), 16), time = parseNumber(takeWord(line), 10);
  const std::string_view step = takeWord(line);
  std::string_view address = takeWord(line);
  const std::string_view kind = takeUsbmonPart(address);
  const auto first = parseNumber(takeUsbmonPart(address), 10), second = parseNumber(takeUsbmonPart(address), 10);
  if (!tag || !time || *time > 0xFFFFFFFF || (step != "S" && step != "C" && step != "E")) return {};
  if (kind.size() != 2 || std::string_view("CIZB").find(kind[0]) == std::string_view::npos ||
      (kind[1] != 'i' && kind[1] != 'o') || !first || !second)
    return {};
  UsbmonEvent event;
  event.tag = *tag;
  event.microseconds = static_cast<std::uint32_t>(*time);
  event.step = step[0];
  event.transfer = kind[0];
  event.in = kind[1] == 'i';
  if (!address.empty()) {  // an endpoint is left: there was a bus
    if (!parseNumber(address, 10)) return {};
    event.bus = *first;
    event.device = *second;
  } else {
    event.device = *first;
  }
  event.rest = line;
  return event;
}

std::optional<UsbRequest> parseUsbmonRequest(std::string_view rest) {
  if (takeWord(rest) != "s") return {};
  const auto type = parseNumber(takeWord(rest), 16), request = parseNumber(takeWord(rest), 16),
             value = parseNumber(takeWord(rest), 16);
  if (!type || !request || !value || *type > 0xFF || *request > 0xFF || *value > 0xFFFF) return {};
  return UsbRequest{*type << 8 | *request, *value, 0};
}

}  // namespace vesk::host
