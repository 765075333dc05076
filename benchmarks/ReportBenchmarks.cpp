// Each report in each form through the public class, beside the naive reference, RapidJSON, and a plain copy of what
// comes out; ends with the goals that follow from these times.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstring>
#include <map>
#include <memory>
#include <string>

#include "benchmarks/Allocations.h"
#include "benchmarks/NaiveText.h"
#include "benchmarks/SampleReports.h"
#include "benchmarks/SaxJson.h"
#include "host/output/JsonValue.h"
#include "plugin/HIDReportVeskPlugin.h"

namespace vesk::benchmarks {

namespace {

constexpr std::size_t kSamples = 64;

/// One form of one report, with reports to decode.
struct Case {
  SampleKind kind;
  bool strings, decimal;
  std::vector<PaddedReport> reports;
  std::unique_ptr<HIDReportVeskPlugin> plugin = HIDReportVeskPlugin::init();

  Case(const SampleKind &sample, bool wantsStrings, bool wantsDecimal = false)
      : kind(sample), strings(wantsStrings), decimal(wantsDecimal) {
    for (const std::string &bytes : makeSamples(kind, kSamples)) reports.emplace_back(bytes);
    plugin->setUseStrings(strings);
    plugin->setDisplayDecimal(decimal);
  }

  ReportResult decode(const PaddedReport &report) const {
    return plugin->runParser(report.data(), kind.id, kind.type, report.length());
  }

  std::string name(const char *what) const {
    char text[64];
    std::snprintf(text, sizeof text, "0x%02X%s %s", kind.id, decimal ? " -decimal" : "", what);
    return text;
  }
};

using SharedCase = std::shared_ptr<const Case>;

[[noreturn]] void fail(const std::string &name) {
  std::fprintf(stderr, "%s: the reference differs from what the plug-in makes\n", name.c_str());
  std::exit(1);
}

std::string joined(const std::vector<std::string> &lines) {
  std::string text;
  for (const std::string &line : lines) text += line + '\n';
  return text;
}

/// Runs `work` on one report after the other, and counts allocations.
template <class Work>
void addBenchmark(const SharedCase &shared, const char *what, Work work) {
  benchmark::RegisterBenchmark(shared->name(what).c_str(), [shared, work](benchmark::State &state) {
    std::size_t next = 0;
    const std::uint64_t before = allocations();
    for (auto _ : state) work(*shared, shared->reports[next++ % kSamples]);
    state.counters["allocations"] =
        static_cast<double>(allocations() - before) / static_cast<double>(state.iterations());
  });
}

void addCopy(const SharedCase &shared, const char *what, std::string text) {
  addBenchmark(shared, what, [text = std::move(text)](const Case &, const PaddedReport &) {
    static char copy[1 << 16];
    std::memcpy(copy, text.data(), text.size());
    benchmark::ClobberMemory();
  });
}

void addText(const SampleKind &kind, bool decimal = false) {
  const auto shared = std::make_shared<Case>(kind, true, decimal);
  addBenchmark(shared, "text", [](const Case &own, const PaddedReport &report) {
    const ReportResult result = own.decode(report);
    benchmark::DoNotOptimize(std::get<DisplayLines>(result).text().data());
  });
  const ReportResult first = shared->decode(shared->reports.front());
  addCopy(shared, "text, memcpy", std::string(std::get<DisplayLines>(first).text()));

  if (naiveLines(shared->reports.front().data(), kind.id, decimal).empty()) return;
  for (const PaddedReport &report : shared->reports) {
    const ReportResult result = shared->decode(report);
    if (joined(naiveLines(report.data(), kind.id, decimal)) != std::get<DisplayLines>(result).text())
      fail(shared->name("text, naive"));
  }
  addBenchmark(shared, "text, naive", [](const Case &own, const PaddedReport &report) {
    benchmark::DoNotOptimize(naiveLines(report.data(), own.kind.id, own.decimal));
  });
}

std::string_view treeAsJson(host::OutputBuffer &buffer, const Case &own, const PaddedReport &report) {
  const ReportResult result = own.decode(report);
  buffer.clear();
  host::appendJsonValue(buffer, std::get<ReportValue>(result));
  return buffer.text();
}

void addValue(const SampleKind &kind) {
  const auto shared = std::make_shared<Case>(kind, false);
  addBenchmark(shared, "value", [](const Case &own, const PaddedReport &report) {
    const ReportResult result = own.decode(report);
    benchmark::DoNotOptimize(&std::get<ReportValue>(result));
  });
  static host::OutputBuffer buffer;
  addBenchmark(shared, "value to JSON", [](const Case &own, const PaddedReport &report) {
    benchmark::DoNotOptimize(treeAsJson(buffer, own, report).data());
  });
  if (kind.id != 0x76 && kind.id != 0x77 && kind.id != 0xE1 && kind.id != 0xE2) return;
  addCopy(shared, "JSON, memcpy", std::string(treeAsJson(buffer, *shared, shared->reports.front())));
  for (const PaddedReport &report : shared->reports)
    if (saxJson(report.data(), kind.id) != treeAsJson(buffer, *shared, report)) fail(shared->name("JSON, RapidJSON"));
  addBenchmark(shared, "JSON, RapidJSON", [](const Case &own, const PaddedReport &report) {
    benchmark::DoNotOptimize(saxJson(report.data(), own.kind.id).data());
  });
}

/// Prints as usual and keeps the least time of each benchmark, and its allocations.
class Keeper : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run> &runs) override {
    for (const Run &run : runs) {
      if (run.run_type != Run::RT_Iteration || run.error_occurred) continue;
      const double time = run.GetAdjustedCPUTime();
      auto &[least, allocated] = kept_.try_emplace(run.run_name.function_name, time, 0.0).first->second;
      least = std::min(least, time);
      allocated = run.counters.at("allocations");
    }
    ConsoleReporter::ReportRuns(runs);
  }

  /// True where `slow` takes at least `goal` times as long as `fast`, or one of them was not measured.
  bool judge(const char *fast, const char *slow, double goal) const {
    const auto a = kept_.find(fast), b = kept_.find(slow);
    if (a == kept_.end() || b == kept_.end()) return true;
    const double ratio = b->second.first / a->second.first;
    std::printf("| %s | %.0f | %s | %.0f | %.1f | at least %.1f | %s |\n", fast, a->second.first, slow, b->second.first,
                ratio, goal, ratio >= goal ? "met" : "**missed**");
    return ratio >= goal;
  }

  bool judgeAllocations() const {
    double most = 0;
    for (const auto &[name, figures] : kept_)
      if (name.ends_with(" text")) most = std::max(most, figures.second);
    if (most == 0) return true;  // no text was measured
    std::printf("\nThe most allocations for a text: %.0f (goal: at most 3), %s.\n", most,
                most <= 3 ? "met" : "**missed**");
    return most <= 3;
  }

 private:
  std::map<std::string, std::pair<double, double>> kept_;
};

bool judgeAll(const Keeper &kept) {
  bool met = true;
  std::printf("\n| ours | ns | reference | ns | times | goal | |\n| --- | ---: | --- | ---: | ---: | --- | --- |\n");
  met &= kept.judge("0x77 text", "0x77 text, naive", 50);
  met &= kept.judge("0x76 text", "0x76 text, naive", 50);
  met &= kept.judge("0x76 -decimal text", "0x76 -decimal text, naive", 22);
  met &= kept.judge("0xE1 text", "0xE1 text, naive", 30);
  met &= kept.judge("0xE2 text", "0xE2 text, naive", 40);
  met &= kept.judge("0xA2 text", "0xA2 text, naive", 25);
  met &= kept.judge("0xEC text", "0xEC text, naive", 25);
  met &= kept.judge("0x77 value to JSON", "0x77 JSON, RapidJSON", 1.8);
  met &= kept.judge("0x76 value to JSON", "0x76 JSON, RapidJSON", 2.5);
  met &= kept.judge("0xE1 value to JSON", "0xE1 JSON, RapidJSON", 2);
  met &= kept.judge("0xE2 value to JSON", "0xE2 JSON, RapidJSON", 2.2);
  return kept.judgeAllocations() && met;
}

}  // namespace

}  // namespace vesk::benchmarks

int main(int argc, char **argv) {
  using namespace vesk::benchmarks;
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
  for (const SampleKind &kind : kSampleKinds) {
    addText(kind);
    if (kind.id == 0x76) addText(kind, true);
    addValue(kind);
  }
  Keeper keeper;
  benchmark::RunSpecifiedBenchmarks(&keeper);
  return judgeAll(keeper) ? 0 : 1;
}
