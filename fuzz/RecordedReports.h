// What a reader finds in an input, kept as text that can be compared.
#pragma once

#include <string>
#include <vector>

#include "fuzz/Check.h"
#include "host/input/Input.h"

namespace fuzz {

/// Keeps everything, and checks what every reader promises.
class RecordedReports : public vesk::host::ReadSink {
 public:
  explicit RecordedReports(std::string_view file) : file_(file) {}

  void report(const vesk::host::SourceReport &report) override {
    check(!report.bytes.empty(), "a report has bytes");
    check(report.bytes.size() <= (std::size_t{1} << 20), "a report is no longer than what can be one");
    check(report.file == file_, "a report names its file");
    check(report.index == bytes.size(), "reports are numbered");
    bytes.emplace_back(report.bytes);
    story += std::to_string(report.id) + " " + std::string(typeName(report.type)) + (report.typeGuessed ? "? " : " ") +
             report.place.text() + " " + std::string(report.device) + " " +
             (report.timeNs ? std::to_string(*report.timeNs) : "-") + " " +
             (report.vendorProduct ? std::to_string(*report.vendorProduct) : "-") + " " + bytes.back() + "\n";
  }

  void message(vesk::host::Message message) override {
    check(message.kind != nullptr && !message.kind->code.empty(), "a message has a kind");
    check(!message.text.empty() && message.text.size() < 1000, "a message has a text of sensible length");
    check(message.file == file_, "a message names its file");
    story += std::string(message.kind->code) + " " + message.place.text() + " " + message.text + "\n";
    ++messages;
    if (message.kind->severity == vesk::host::Severity::kError) ++errors;
  }

  std::vector<std::string> bytes;
  std::size_t messages = 0, errors = 0;
  std::string story;  // all of it, in order

 private:
  std::string_view file_;
};

}  // namespace fuzz
