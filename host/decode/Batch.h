// A run of reports and messages on their way through a worker thread, with copies of all that they borrowed.
#pragma once

#include <deque>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "host/decode/ReportPrinter.h"

namespace vesk::host {

class Batch {
 public:
  /// The input is done, and its message counts are due.
  struct FileEnd {
    std::string file;
  };
  using Event = std::variant<Message, FileEnd>;

  /// So much that handing it on costs nothing, so little that a few of them are no memory: a report makes up to 18 kB.
  static constexpr std::size_t kMostReports = 32;

  bool isFull() const { return steps_.size() >= kMostReports || bytes_.size() >= kMostBytes; }
  bool isEmpty() const { return steps_.empty(); }
  void add(const SourceReport &report, bool first);
  void add(Event event) { steps_.emplace_back(std::move(event)); }

  /// Decodes everything; afterwards `output` and events() are what is to be written and told, in order.
  void run(ReportPrinter &printer, OutputBuffer &output);
  std::vector<Event> &events() { return events_; }
  /// Makes it empty, and keeps its memory.
  void clear();

 private:
  static constexpr std::size_t kMostBytes = std::size_t{128} << 10;

  struct Report {
    SourceReport source;  // its bytes are [begin, begin + bytes.size()) of bytes_ once run() puts them there
    std::size_t begin;
    bool first;
  };

  std::string_view keep(std::string_view name);

  std::vector<std::variant<Report, Event>> steps_;
  OutputBuffer bytes_;
  std::deque<std::string> names_;  // of files and devices; a deque, because views of them are kept
  std::vector<Event> events_;
  std::vector<Message> messages_;
};

}  // namespace vesk::host
