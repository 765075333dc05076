// Runs one command of a guest script as a user at a prompt would have it run, and records all that it leaves behind.
//
//   step FOLDER [--user NAME] [--limit SECONDS] [--tty COLUMNSxROWS] -- COMMAND [ARGUMENT]...
//
// A shell that runs a job in the background makes it ignore SIGINT, and a user who is looked up in the shell is one
// process more to signal; here the command starts with default signals and its own process ID is in FOLDER/pid.
// FOLDER gets `out`, `err`, `pid`, `ms` and last `status`: "exit N", "signal N" or "limit".
#include <fcntl.h>
#include <grp.h>
#include <poll.h>
#include <pty.h>
#include <pwd.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <stdexcept>
#include <string>

namespace {

using Clock = std::chrono::steady_clock;

struct Options {
  std::string folder;
  std::string user;
  int limit = 30;
  winsize terminal{};
  char **command = nullptr;
};

Options parse(int count, char **arguments) {
  Options options;
  int k = 1;
  const auto next = [&] {
    if (k >= count) throw std::invalid_argument("step FOLDER [--user NAME] [--limit S] [--tty CxR] -- COMMAND...");
    return std::string(arguments[k++]);
  };
  options.folder = next();
  for (std::string word; (word = next()) != "--";) {
    const std::string value = next();
    if (word == "--user") {
      options.user = value;
    } else if (word == "--limit") {
      options.limit = std::stoi(value);
    } else if (word == "--tty") {
      options.terminal.ws_col = static_cast<unsigned short>(std::stoi(value));
      options.terminal.ws_row = static_cast<unsigned short>(std::stoi(value.substr(value.find('x') + 1)));
    } else {
      throw std::invalid_argument("unknown option " + word);
    }
  }
  if (k >= count) throw std::invalid_argument("no command");
  options.command = arguments + k;
  return options;
}

int create(const std::string &path) {
  const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
  if (file < 0) throw std::runtime_error("cannot write " + path);
  return file;
}

void become(const std::string &user) {
  const passwd *entry = getpwnam(user.c_str());
  if (entry == nullptr || setgroups(0, nullptr) != 0 || setgid(entry->pw_gid) != 0 || setuid(entry->pw_uid) != 0)
    throw std::runtime_error("cannot become " + user);
}

[[noreturn]] void runCommand(const Options &options) {
  for (int number = 1; number < NSIG; ++number) std::signal(number, SIG_DFL);
  sigset_t none;
  sigemptyset(&none);
  sigprocmask(SIG_SETMASK, &none, nullptr);
  if (!options.user.empty()) become(options.user);
  execvp(options.command[0], options.command);
  std::perror(options.command[0]);
  _exit(127);
}

// Both streams of a command on a terminal come out of the terminal, in one file.
pid_t startOnTerminal(const Options &options, int &terminal) {
  const pid_t child = forkpty(&terminal, nullptr, nullptr, &options.terminal);
  if (child == 0) runCommand(options);
  return child;
}

pid_t start(const Options &options, int out, int err) {
  const pid_t child = fork();
  if (child == 0) {
    dup2(out, STDOUT_FILENO);
    dup2(err, STDERR_FILENO);
    runCommand(options);
  }
  return child;
}

// Copies what the terminal has shown; false when nobody writes to it any more.
bool copyTerminal(int terminal, int out) {
  pollfd waiting{terminal, POLLIN, 0};
  if (poll(&waiting, 1, 10) <= 0) return true;
  char buffer[4096];
  const ssize_t got = read(terminal, buffer, sizeof buffer);
  return got > 0 && write(out, buffer, static_cast<std::size_t>(got)) == got;
}

std::string wait(const Options &options, pid_t child, int terminal, int out) {
  const auto end = Clock::now() + std::chrono::seconds(options.limit);
  bool killed = false;
  for (int status = 0;;) {
    if (terminal < 0 || !copyTerminal(terminal, out)) usleep(1000);
    if (waitpid(child, &status, WNOHANG) == child) {
      for (pollfd rest{terminal, POLLIN, 0}; terminal >= 0 && poll(&rest, 1, 0) > 0;)
        if (!copyTerminal(terminal, out)) break;
      if (killed) return "limit";
      if (WIFSIGNALED(status)) return "signal " + std::to_string(WTERMSIG(status));
      return "exit " + std::to_string(WEXITSTATUS(status));
    }
    if (!killed && Clock::now() > end) killed = kill(child, SIGKILL) == 0;
  }
}

// Written aside and renamed: who sees the file sees all of it.
void record(const std::string &path, const std::string &text) {
  std::ofstream(path + ".new") << text << '\n';
  if (std::rename((path + ".new").c_str(), path.c_str()) != 0) throw std::runtime_error("cannot write " + path);
}

}  // namespace

int main(int count, char **arguments) {
  try {
    const Options options = parse(count, arguments);
    if (mkdir(options.folder.c_str(), 0755) != 0)
      throw std::runtime_error(options.folder + ": a step of this name exists");
    const int out = create(options.folder + "/out");
    const int err = create(options.folder + "/err");
    int terminal = -1;
    const auto begin = Clock::now();
    const pid_t child = options.terminal.ws_col != 0 ? startOnTerminal(options, terminal) : start(options, out, err);
    if (child < 0) throw std::runtime_error("cannot fork");
    record(options.folder + "/pid", std::to_string(child));
    const std::string status = wait(options, child, terminal, out);
    const auto took = std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - begin);
    record(options.folder + "/ms", std::to_string(took.count()));
    record(options.folder + "/status", status);
    return 0;
  } catch (const std::exception &error) {
    std::cerr << "step: " << error.what() << '\n';
    return 2;
  }
}
