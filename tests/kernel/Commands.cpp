// The commands of the emulated controller, as README.md lists them.
#include <algorithm>
#include <cerrno>
#include <sstream>
#include <stdexcept>

#include "Controller.h"

namespace vesk::bench {
namespace {

using std::chrono::milliseconds;

constexpr unsigned kLongest = UHID_DATA_MAX;

unsigned long toNumber(const std::string &text, int base, unsigned long limit) {
  std::size_t used = 0;
  const unsigned long value = text.empty() || text[0] == '-' ? limit + 1 : std::stoul(text, &used, base);
  if (used != text.size() || value > limit) throw std::invalid_argument("bad number '" + text + "'");
  return value;
}

std::uint8_t toByte(const std::string &hex) {
  return std::uint8_t(toNumber(hex, 16, 0xff));
}

std::uint8_t toInputId(const std::string &hex) {
  const std::uint8_t id = toByte(hex);
  if (id != kImageId && id != kPacketId) throw std::invalid_argument("no input report " + hex);
  return id;
}

std::vector<std::uint8_t> toInputIds(const std::string &list) {
  std::vector<std::uint8_t> ids;
  std::istringstream in(list);
  for (std::string id; std::getline(in, id, ',');) ids.push_back(toInputId(id));
  if (ids.empty()) throw std::invalid_argument("no input reports named");
  return ids;
}

}  // namespace

void Controller::run(const std::string &line) {
  std::istringstream in(line);
  std::vector<std::string> words;
  for (std::string word; in >> word;) words.push_back(word);
  const auto is = [&](const char *name, std::size_t least, std::size_t most) {
    if (words.empty() || words[0] != name) return false;
    if (words.size() - 1 < least || words.size() - 1 > most) throw std::invalid_argument("bad command: " + line);
    return true;
  };
  const auto count = [&](std::size_t k, unsigned otherwise) {
    return k < words.size() ? unsigned(toNumber(words[k], 10, 100'000'000)) : otherwise;
  };

  if (is("burst", 2, 2)) {
    burst(count(1, 0), toInputIds(words[2]));
  } else if (is("stream", 3, 3)) {
    stopStream();
    stream_ = {toInputIds(words[3]), Clock::now(), double(std::max(1U, count(1, 0))), 0, count(2, 0)};
  } else if (is("stop", 0, 0)) {
    stopStream();
  } else if (is("send", 1, 2)) {
    send(toInputId(words[1]), std::min(count(2, 0), kLongest));
  } else if (is("skip", 2, 2)) {
    number(toInputId(words[1])) += count(2, 0);
  } else if (is("cookie", 1, 1)) {
    cookie_ = toByte(words[1]);
  } else if (is("contents", 1, kLongest)) {
    Bytes report;
    for (std::size_t k = 1; k < words.size(); ++k) report.push_back(toByte(words[k]));
    features_[report[0]] = std::move(report);
  } else if (is("fault", 2, 3)) {
    static const std::vector<std::string> kinds = {"none", "error", "short", "long", "empty", "wrong", "late", "mute"};
    if (std::find(kinds.begin(), kinds.end(), words[2]) == kinds.end())
      throw std::invalid_argument("bad command: " + line);
    const bool counted = words[2] == "short" || words[2] == "long" || words[2] == "late" || words[2] == "wrong";
    if (counted && words.size() != 4) throw std::invalid_argument("number missing: " + line);
    const unsigned value = words[2] == "wrong" ? toByte(words[3]) : count(3, EIO);
    faults_[toByte(words[1])] = {words[2], words[2] == "long" ? std::min(value, 2048U) : value};
  } else if (is("unplug", 0, 0)) {
    unplug();
  } else if (is("unplug-after", 1, 1)) {
    untilUnplug_ = count(1, 0);
  } else if (is("replug", 0, 0)) {
    plug();
  } else if (is("wait", 1, 1)) {
    commandsPaused_ = Clock::now() + milliseconds(count(1, 0));
  } else if (is("wait-open", 0, 1)) {
    settle_ = count(1, 100);
    waitForOpen_ = !open_;
  } else if (is("wait-sent", 0, 0)) {
    waitForSent_ = true;
  } else if (is("quit", 0, 0)) {
    finished_ = true;
  } else {
    throw std::invalid_argument("bad command: " + line);
  }
}

}  // namespace vesk::bench
