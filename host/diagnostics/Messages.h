// Collects messages, prints them to standard error, and knows the exit code that they add up to.
#pragma once

#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include "host/diagnostics/Message.h"

namespace vesk::host {

/// One line a cause and file: the first message of a kind in a file is printed at once, the others are counted, and
/// finishFile() tells the count. Not for use from two threads.
class Messages {
 public:
  struct Options {
    bool quiet = false;    // errors only
    bool verbose = false;  // notes too, and every message rather than the first of its kind
    bool lenient = false;
    bool colour = false;
    bool overProgress = false;  // a progress line may stand where a message is going to be printed
  };

  /// A message that was kept, with how often its kind was seen in its file.
  struct Kept {
    Message first;
    Severity severity;
    std::uint64_t count = 1;
    std::uint64_t told = 1;  // of these, printed or counted in a line of finishFile()
  };

  explicit Messages(const Options &options, std::FILE *stream = stderr) : options_(options), stream_(stream) {}

  /// Returns the severity that the message has under these options.
  Severity add(Message message);
  /// Says how many of each kind were not printed for `file` since it was said last. To be called when the file is done.
  void finishFile(std::string_view file);

  const std::vector<Kept> &kept() const { return kept_; }
  ExitCode exitCode() const { return exitCode_; }
  Severity severityOf(const MessageKind &kind) const;

 private:
  void print(const Message &message, Severity severity, std::string_view text) const;
  bool shows(Severity severity) const;

  Options options_;
  std::FILE *stream_;
  std::vector<Kept> kept_;
  std::map<std::pair<std::string, std::string_view>, std::size_t> index_;  // (file, code) to kept_
  ExitCode exitCode_ = kExitOk;
};

}  // namespace vesk::host
