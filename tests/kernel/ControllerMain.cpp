// Command line and event loop of the emulated controller: `controller [options] [command]...`, see README.md.
#include <fcntl.h>
#include <getopt.h>
#include <poll.h>
#include <unistd.h>

#include <cstdlib>
#include <exception>
#include <fstream>
#include <iostream>
#include <map>
#include <stdexcept>

#include "Controller.h"

namespace {

using namespace vesk::bench;

struct Options {
  Identity identity;
  Bytes descriptor = controllerDescriptor(false);
  std::string log;
  std::string control;
  std::string contents;
  std::vector<std::string> commands;
};

constexpr char kUsage[] =
    "usage: controller [--name TEXT] [--phys TEXT] [--uniq TEXT] [--bus NAME|HEX] [--id VVVV:PPPP] [--version HEX]\n"
    "                  [--descriptor controller|split|mouse] [--log FILE] [--control FIFO] [COMMAND]...\n"
    "       controller --write-contents FOLDER\n";

std::uint16_t toBus(const std::string &text) {
  static const std::map<std::string, std::uint16_t> names = {{"usb", 0x03}, {"bluetooth", 0x05}, {"virtual", 0x06},
                                                             {"i2c", 0x18}, {"host", 0x19},      {"spi", 0x1c}};
  const auto name = names.find(text);
  return name != names.end() ? name->second : std::uint16_t(std::stoul(text, nullptr, 16));
}

Bytes toDescriptor(const std::string &text) {
  if (text == "controller") return controllerDescriptor(false);
  if (text == "split") return controllerDescriptor(true);
  if (text == "mouse") return mouseDescriptor();
  throw std::invalid_argument("no descriptor '" + text + "'");
}

Options parse(int count, char **arguments) {
  static const option known[] = {{"name", 1, nullptr, 'n'},       {"phys", 1, nullptr, 'p'},
                                 {"uniq", 1, nullptr, 'u'},       {"bus", 1, nullptr, 'b'},
                                 {"id", 1, nullptr, 'i'},         {"version", 1, nullptr, 'v'},
                                 {"descriptor", 1, nullptr, 'd'}, {"log", 1, nullptr, 'l'},
                                 {"control", 1, nullptr, 'c'},    {"write-contents", 1, nullptr, 'w'},
                                 {nullptr, 0, nullptr, 0}};
  Options options;
  Identity &identity = options.identity;
  for (int found; (found = getopt_long(count, arguments, "", known, nullptr)) != -1;) {
    const std::string value = optarg != nullptr ? optarg : "";
    switch (found) {
      case 'n':
        identity.name = value;
        break;
      case 'p':
        identity.phys = value;
        break;
      case 'u':
        identity.uniq = value;
        break;
      case 'b':
        identity.bus = toBus(value);
        break;
      case 'i':
        if (value.size() != 9 || value[4] != ':') throw std::invalid_argument("--id VVVV:PPPP in hex");
        identity.vendor = std::uint16_t(std::stoul(value.substr(0, 4), nullptr, 16));
        identity.product = std::uint16_t(std::stoul(value.substr(5), nullptr, 16));
        break;
      case 'v':
        identity.version = std::uint32_t(std::stoul(value, nullptr, 16));
        break;
      case 'd':
        options.descriptor = toDescriptor(value);
        break;
      case 'l':
        options.log = value;
        break;
      case 'c':
        options.control = value;
        break;
      case 'w':
        options.contents = value;
        break;
      default:
        throw std::invalid_argument(kUsage);
    }
  }
  options.commands.assign(arguments + optind, arguments + count);
  return options;
}

// For tests that compare what was read with what the device holds: e0.bin and so on, and input reports number 1.
void writeContents(const std::string &folder) {
  for (const ReportSize &report : reportSizes()) {
    const Bytes bytes = report.kind == ReportKind::Feature ? featureReport(report.id)
                        : report.id == kImageId            ? imageReport(1, 0x05)
                                                           : packetReport(1);
    char name[16];
    std::snprintf(name, sizeof name, "/%02x.bin", report.id);
    std::ofstream file(folder + name, std::ios::binary);
    file.write(reinterpret_cast<const char *>(bytes.data()), std::streamsize(bytes.size()));
    if (!file.flush()) throw std::runtime_error("cannot write " + folder + name);
  }
}

// Commands come one a line; what a writer sent in one piece runs without a pause between.
void readCommands(int fifo, std::string &rest, Controller &controller) {
  char buffer[4096];
  for (ssize_t got; (got = read(fifo, buffer, sizeof buffer)) > 0;) rest.append(buffer, std::size_t(got));
  for (std::size_t end; (end = rest.find('\n')) != rest.npos; rest.erase(0, end + 1))
    controller.command(rest.substr(0, end));
}

void serve(const Options &options, Controller &controller) {
  int fifo = -1;
  // Opened for writing too, so that the end of one writer is not the end of the file.
  if (!options.control.empty() && (fifo = open(options.control.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC)) < 0)
    throw std::runtime_error("cannot open " + options.control);
  controller.plug();
  for (const std::string &line : options.commands) controller.command(line);

  std::string rest;
  while (!controller.finished()) {
    controller.handleTime();
    using namespace std::chrono;
    const auto wait = std::max(nanoseconds(0), duration_cast<nanoseconds>(controller.due() - Clock::now()));
    const timespec timeout{time_t(wait.count() / 1'000'000'000), long(wait.count() % 1'000'000'000)};
    pollfd files[] = {{controller.descriptor(), POLLIN, 0}, {fifo, POLLIN, 0}};
    ppoll(files, 2, &timeout, nullptr);
    controller.handleKernelEvents();
    if (fifo >= 0) readCommands(fifo, rest, controller);
  }
}

}  // namespace

int main(int count, char **arguments) {
  std::FILE *file = stderr;
  try {
    const Options options = parse(count, arguments);
    if (!options.contents.empty()) {
      writeContents(options.contents);
      return 0;
    }
    if (!options.log.empty() && (file = std::fopen(options.log.c_str(), "w")) == nullptr)
      throw std::runtime_error("cannot write " + options.log);
    Log log(file);
    try {
      Controller controller(options.identity, options.descriptor, log);
      serve(options, controller);
    } catch (const std::exception &error) {
      log.line("error %s", error.what());
      throw;
    }
    log.line("end");
    return 0;
  } catch (const std::exception &error) {
    std::cerr << "controller: " << error.what() << '\n';
    return 2;
  }
}
