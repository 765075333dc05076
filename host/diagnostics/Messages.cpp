// Printing and counting of messages.
#include "host/diagnostics/Messages.h"

#include <algorithm>

#include "host/diagnostics/Progress.h"
#include "values/PrintfFormat.h"
#include "values/Utf8.h"

namespace vesk::host {

namespace {

/// Appends text of inputs, with what a terminal would obey rather than show as \xNN. Line feeds are our own: what is
/// quoted of an input is never more than a line.
void appendPrintable(std::string &line, std::string_view text) {
  const bool isText = isUtf8(text);
  for (std::size_t i = 0; i < text.size(); ++i) {
    const auto byte = static_cast<unsigned char>(text[i]);
    const bool isLongControl = byte == 0xC2 && i + 1 < text.size() && static_cast<unsigned char>(text[i + 1]) < 0xA0;
    if ((byte < ' ' && byte != '\n') || byte == 0x7F || (byte >= 0x80 && !isText)) {
      line += formatted<"\\x%02X">(std::uint32_t{byte});
    } else if (isLongControl) {
      line += formatted<"\\x%02X">(std::uint32_t{static_cast<unsigned char>(text[++i])});
    } else {
      line += text[i];
    }
  }
}

}  // namespace

std::string_view severityName(Severity severity) {
  constexpr std::string_view kNames[] = {"note", "warning", "error"};
  return kNames[static_cast<std::size_t>(severity)];
}

Severity Messages::severityOf(const MessageKind &kind) const {
  return kind.lenient && options_.lenient ? std::min(kind.severity, Severity::kWarning) : kind.severity;
}

bool Messages::shows(Severity severity) const {
  if (severity == Severity::kError) return true;
  if (severity == Severity::kNote) return options_.verbose;
  return !options_.quiet;
}

Severity Messages::add(Message message) {
  const Severity severity = severityOf(*message.kind);
  if (severity == message.kind->severity) exitCode_ = std::max(exitCode_, message.kind->exitCode);
  const auto [entry, isNew] = index_.try_emplace({message.file, message.kind->code}, kept_.size());
  if (isNew || options_.verbose) {
    if (shows(severity)) print(message, severity, message.text);
  }
  if (isNew)
    kept_.push_back({std::move(message), severity});
  else
    ++kept_[entry->second].count;
  return severity;
}

void Messages::finishFile(std::string_view file) {
  if (options_.verbose) return;  // each one was printed
  for (Kept &kept : kept_)
    if (kept.first.file == file && kept.count > kept.told && shows(kept.severity)) {
      const Message total{kept.first.kind, kept.first.file, {}, {}, {}};
      print(total, kept.severity,
            std::to_string(kept.count - kept.told) + " more of this kind (" + std::string(kept.first.kind->code) + ")");
      kept.told = kept.count;
    }
}

void Messages::print(const Message &message, Severity severity, std::string_view text) const {
  std::string line(options_.overProgress ? kClearLine : "");
  const std::size_t start = line.size();
  if (!message.file.empty()) {
    appendPrintable(line, message.file);
    line += ':';
  }
  if (const std::string place = message.place.text(); !place.empty()) line += place + ":";
  if (line.size() != start) line += ' ';
  const char *colour = severity == Severity::kError     ? "\x1b[1;31m"
                       : severity == Severity::kWarning ? "\x1b[1;35m"
                                                        : "\x1b[1;36m";
  if (options_.colour) line += colour;
  line += severityName(severity);
  line += ':';
  if (options_.colour) line += "\x1b[0m";
  line += ' ';
  if (message.reportId) line += formatted<"0x%02X: ">(*message.reportId);
  appendPrintable(line, text);
  line += '\n';
  std::fwrite(line.data(), 1, line.size(), stream_);
}

}  // namespace vesk::host
