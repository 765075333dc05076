// Any bytes through a whole run, from the file to the document: what is written is what another parser can read, every
// number of threads writes the same, and what was converted reads back as it was.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <nlohmann/json.hpp>

#include "fuzz/FuzzInput.h"
#include "fuzz/RecordedReports.h"
#include "host/commands/ReadInputs.h"
#include "host/output/FieldsFormatter.h"

namespace {

using fuzz::check;
using fuzz::checkSame;
using fuzz::RecordedReports;
using nlohmann::json;
using namespace vesk::host;

/// A folder in memory, where there is one.
std::string pathOf(const char *name) {
  static const std::string folder = ::access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp";
  return folder + "/vesk-fuzz-" + std::to_string(::getpid()) + "-" + name;
}

std::string contentOf(const std::string &path) {
  std::string text;
  std::FILE *file = std::fopen(path.c_str(), "rb");
  check(file != nullptr, "the output took its name");
  char piece[65536];
  for (std::size_t size; (size = std::fread(piece, 1, sizeof(piece), file)) != 0;) text.append(piece, size);
  std::fclose(file);
  ::unlink(path.c_str());
  return text;
}

void writeFile(const std::string &path, std::string_view bytes) {
  std::FILE *file = std::fopen(path.c_str(), "wb");
  check(file != nullptr && std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size(), "the input is written");
  std::fclose(file);
}

struct Run {
  std::string output;
  std::uint64_t reports = 0;
  int exitCode = 0;
  std::string messages;
};

struct Settings {
  InputOptions input;
  FormatOptions format;
  bool decimal = false;
};

Run run(const Settings &settings, std::string_view form, unsigned jobs) {
  char *printed = nullptr;
  std::size_t printedSize = 0;
  std::FILE *stream = open_memstream(&printed, &printedSize);
  Messages::Options options;
  options.verbose = true;
  options.lenient = settings.format.lenient;
  Messages messages(options, stream);
  Run result;
  {
    OutputFile output(pathOf("out"));
    const auto formatter = form == "fields" ? makeFieldsFormatter() : findOutputKind(form)->make(settings.format);
    Pipeline::Options pipelineOptions;
    pipelineOptions.decimal = settings.decimal;
    pipelineOptions.lenient = settings.format.lenient;
    pipelineOptions.jobs = jobs;
    Pipeline pipeline(pipelineOptions, settings.input.filter, *formatter, output, messages);
    pipeline.begin();
    readInputs(settings.input, pipeline);
    pipeline.finish();
    result.reports = pipeline.reports();
  }
  result.exitCode = messages.exitCode();
  for (const auto &kept : messages.kept())
    result.messages +=
        std::string(kept.first.kind->code) + " " + std::to_string(kept.count) + " " + kept.first.text + "\n";
  std::fclose(stream);
  for (const char c : std::string_view(printed, printedSize))
    check(c == '\n' || (static_cast<unsigned char>(c) >= ' ' && c != 0x7F), "messages hold nothing for terminals");
  std::free(printed);
  result.output = contentOf(pathOf("out"));
  return result;
}

/// What is not said in numbers stands in "exact", under a pointer that finds it.
void checkReport(const json &report) {
  check(report.contains("source") && report.contains("report") && report.contains("messages"), "a report's members");
  if (!report.contains("exact")) return;
  for (const auto &[pointer, exact] : report["exact"].items()) {
    check(exact.is_string(), "exact values are strings");
    const json &value = report["value"].at(json::json_pointer(pointer));
    const std::string text = exact.get<std::string>();
    if (value.is_null())
      check(text == "nan" || text == "-nan" || text == "inf" || text == "-inf", "null is no finite number: " + text);
    else
      check(value.dump() == text, "exact values are the number's: " + text + " for " + value.dump());
  }
}

void checkDocument(const Run &run) {
  const json document = json::parse(run.output);
  check(document["format"] == "vesk-report/1", "the document's format");
  check(document["reports"].size() == run.reports, "as many reports as went to the output");
  check(document["exit_status"] == run.exitCode, "the exit status is the program's");
  check((run.exitCode == 0) || !document["messages"].empty(), "an exit code has a message");
  for (const json &report : document["reports"]) checkReport(report);
}

void checkLines(const Run &run) {
  std::size_t begin = 0;
  std::uint64_t reports = 0;
  json last;
  for (std::size_t end; (end = run.output.find('\n', begin)) != std::string::npos; begin = end + 1) {
    if (!last.is_null()) ++reports;
    last = json::parse(run.output.substr(begin, end - begin));
    if (!last.contains("summary")) checkReport(last);
  }
  check(begin == run.output.size(), "every line ends");
  check(reports == run.reports && last["summary"]["reports"] == run.reports, "a line a report and one more");
}

RecordedReports readBack(const char *kind, const std::string &text, const ReadOptions &options = {}) {
  ByteSource source("converted", text);
  RecordedReports found("converted");
  findInputKind(kind)->read(source, options, found);
  return found;
}

/// Conversions that found nothing to complain of are whole.
void checkConversions(const Settings &settings, const std::vector<std::string> &wanted) {
  for (const auto &[form, kind] : {std::pair("hex", "hex"), std::pair("recording", "hid-recording")}) {
    const Run converted = run(settings, form, 1);
    if (converted.exitCode != 0 || converted.reports == 0) continue;
    const auto back = readBack(kind, converted.output);
    check(back.bytes == wanted, std::string("what was converted to ") + form + " reads back as it was");
    check(back.errors == 0, std::string("what was converted to ") + form + " reads back: " + back.story);
  }
}

/// Every byte behind the ID stands in a row, beside its offset; what a report lacks is shown as such.
void checkFields(const Settings &settings, const std::vector<std::string> &wanted) {
  const Run fields = run(settings, "fields", 1);
  constexpr std::size_t kHex = 8;  // the column behind the offset
  std::size_t headings = 0;
  std::vector<bool> shown;
  const auto allShown = [&] { return std::find(shown.begin(), shown.end(), false) == shown.end(); };
  std::size_t begin = 0;
  for (std::size_t end; (end = fields.output.find('\n', begin)) != std::string::npos; begin = end + 1) {
    const std::string row = fields.output.substr(begin, end - begin);
    if (row.empty()) continue;
    if (row.starts_with("== ")) {
      check(allShown(), "all bytes of a report are shown before the next");
      check(++headings <= wanted.size(), "a heading a report");
      shown.assign(wanted[headings - 1].size(), false);
      shown[0] = true;
      continue;
    }
    const std::string &bytes = wanted.at(headings - 1);
    std::size_t offset = std::stoul(row);
    for (std::size_t at = kHex; at + 1 < row.size() && row[at] != ' '; at += 3, ++offset) {
      const std::string digits = row.substr(at, 2);
      check((digits == "--") == (offset >= bytes.size()), "only bytes that are not there are shown as missing");
      if (offset >= bytes.size()) continue;
      check(std::stoi(digits, nullptr, 16) == static_cast<unsigned char>(bytes[offset]), "a byte stands at its offset");
      shown[offset] = true;
    }
  }
  check(headings == wanted.size() && allShown(), "every report is shown, and all of the last one");
}

/// Rows have the header's columns, and raw output is the reports themselves.
void checkRows(const Settings &settings, const std::vector<std::string> &wanted) {
  const Run rows = run(settings, "csv", 1);
  std::size_t commas = 0, begin = 0;
  for (std::size_t end; (end = rows.output.find('\n', begin)) != std::string::npos; begin = end + 1) {
    const auto count = std::count(rows.output.begin() + static_cast<std::ptrdiff_t>(begin),
                                  rows.output.begin() + static_cast<std::ptrdiff_t>(end), ',');
    if (begin == 0) commas = static_cast<std::size_t>(count);
    check(commas != 0 && commas == static_cast<std::size_t>(count), "all rows have the header's columns");
  }
  check(begin == rows.output.size(), "every row ends");
  std::string all;
  for (const std::string &bytes : wanted) all += bytes;
  checkSame(run(settings, "raw", 1).output, all, "raw output is the reports");
}

/// The reports that a run hands to its output, by the shortest way.
std::vector<std::string> reportsOf(const json &document) {
  std::vector<std::string> all;
  for (const json &report : document["reports"]) {
    std::string bytes;
    const std::string hex = report["bytes"].get<std::string>();
    for (std::size_t i = 0; i + 1 < hex.size(); i += 2) {
      while (hex[i] == ' ') ++i;
      bytes += static_cast<char>(std::stoi(hex.substr(i, 2), nullptr, 16));
    }
    all.push_back(bytes);
  }
  return all;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
  fuzz::FuzzInput input(data, size);
  const auto flags = input.take<std::uint8_t>();
  Settings settings;
  settings.input.files = {pathOf("in")};
  settings.input.read.split = (flags & 1) != 0;
  settings.decimal = (flags & 2) != 0;
  settings.format.lenient = (flags & 4) != 0;
  settings.format.withLines = (flags & 8) != 0;
  settings.format.withBytes = true;
  writeFile(settings.input.files[0], input.rest());

  const Run whole = run(settings, "json", 1);
  checkDocument(whole);
  const Run lines = run(settings, "jsonl", 1);
  checkLines(lines);
  check(lines.exitCode == whole.exitCode && lines.messages == whole.messages, "both JSON forms say the same");
  const Run text = run(settings, "text", 1);
  check(text.reports == whole.reports, "text has the same reports");
  if ((flags & 0xF0) == 0) {  // threads take their time
    const Run shared = run(settings, "text", 3);
    checkSame(shared.output, text.output, "several threads write the same");
    checkSame(shared.messages, text.messages, "several threads say the same");
  }
  const std::vector<std::string> reports = reportsOf(json::parse(whole.output));
  checkConversions(settings, reports);
  if ((flags & 0x30) == 0x10) checkFields(settings, reports);
  if ((flags & 0x30) == 0x20) checkRows(settings, reports);
  ::unlink(settings.input.files[0].c_str());
  return 0;
}
