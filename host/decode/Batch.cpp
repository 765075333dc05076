// Copying reports into a batch, and running it.
#include "host/decode/Batch.h"

namespace vesk::host {

std::string_view Batch::keep(std::string_view name) {
  for (const std::string &known : names_)
    if (known == name) return known;
  return names_.emplace_back(name);
}

void Batch::add(const SourceReport &report, bool first) {
  Report copy{report, bytes_.size(), first};
  copy.source.file = keep(report.file);
  copy.source.device = keep(report.device);
  bytes_.append(report.bytes);
  steps_.emplace_back(copy);
}

void Batch::run(ReportPrinter &printer, OutputBuffer &output) {
  for (auto &step : steps_) {
    if (auto *event = std::get_if<Event>(&step)) {
      events_.push_back(std::move(*event));
      continue;
    }
    auto &[source, begin, first] = std::get<Report>(step);
    source.bytes = bytes_.text().substr(begin, source.bytes.size());
    printer.print(source, first, output, messages_);
    for (Message &message : messages_) events_.emplace_back(std::move(message));
    messages_.clear();
  }
}

void Batch::clear() {
  steps_.clear();
  bytes_.clear();
  names_.clear();
  events_.clear();
}

}  // namespace vesk::host
