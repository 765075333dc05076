// Where output goes: standard output, or a file that appears whole or not at all.
#pragma once

#include <sys/types.h>

#include <stdexcept>
#include <string>
#include <string_view>

namespace vesk::host {

/// Output that could not be written; what() names the file and the reason.
class OutputError : public std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// Whoever read our standard output has stopped reading, which is no error.
class PipeClosed : public std::exception {};

class OutputFile {
 public:
  /// Standard output for "-". Otherwise a new file beside the one that `path` leads to, whose name it takes in
  /// commit(); a signal that kills before removes it. Throws OutputError.
  explicit OutputFile(const std::string &path);
  /// Removes what was not committed.
  ~OutputFile();
  OutputFile(const OutputFile &) = delete;
  OutputFile &operator=(const OutputFile &) = delete;

  /// Writes all of it; of a file that has its name already, all or nothing. Throws OutputError or PipeClosed.
  void write(std::string_view bytes);
  /// Gives the file its name before it is done, for one that grows for a long time and is whole at any moment.
  /// Throws OutputError.
  void publish();
  /// Gives the file its name; what was written before is on disk then. Throws OutputError.
  void commit();

  bool isTerminal() const;

 private:
  bool isPublished() const { return !path_.empty() && temporary_.empty(); }
  /// Removes what was written last, so that the file ends where it was whole.
  void takeBack(off_t size);
  [[noreturn]] void fail(const char *what) const;

  std::string name_;
  std::string path_;       // empty for standard output
  std::string temporary_;  // empty once it was renamed
  int fd_ = 1;
  bool isShared_ = false;  // a descriptor that we were given: standard output
};

}  // namespace vesk::host
