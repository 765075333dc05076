// What a call writes to the real file descriptor 1.
#pragma once

#include <unistd.h>

#include <cstdio>
#include <exception>
#include <stdexcept>
#include <string>

namespace test {

/// Runs `call` with standard output sent to a temporary file and returns what arrived there. An exception of the call
/// is stored in `raised`, or fails the caller where there is no place for it.
template <class Call>
std::string captureStdout(Call call, std::exception_ptr *raised = nullptr) {
  std::fflush(stdout);
  const int screen = dup(STDOUT_FILENO);
  std::FILE *file = std::tmpfile();
  if (screen < 0 || file == nullptr || dup2(fileno(file), STDOUT_FILENO) < 0) throw std::runtime_error("no capture");
  std::exception_ptr exception;
  try {
    call();
  } catch (...) {
    exception = std::current_exception();
  }
  std::fflush(stdout);
  dup2(screen, STDOUT_FILENO);
  close(screen);

  std::string text;
  std::rewind(file);
  for (int c; (c = std::fgetc(file)) != EOF;) text += static_cast<char>(c);
  std::fclose(file);
  if (raised != nullptr)
    *raised = exception;
  else if (exception)
    std::rethrow_exception(exception);
  return text;
}

}  // namespace test
