// From what a reader finds to what is written: filter, decode, format, and tell.
#pragma once

#include <memory>

#include "host/decode/ReportPrinter.h"
#include "host/decode/Workers.h"
#include "host/diagnostics/Messages.h"
#include "host/input/Input.h"
#include "host/output/Formatter.h"
#include "host/output/OutputFile.h"
#include "host/report/Filter.h"
#include "host/report/LossCounter.h"

namespace vesk::host {

/// Whatever the number of threads, what is written and told is the same, in the same order. Everything here throws
/// OutputError and PipeClosed.
class Pipeline : public ReadSink {
 public:
  struct Options {
    bool decimal = false;
    bool lenient = false;
    bool flushEachReport = false;  // for live output; one thread then
    unsigned jobs = 1;             // threads that decode
  };

  Pipeline(const Options &options, const Filter &filter, Formatter &formatter, OutputFile &output, Messages &messages);

  /// Before the first report.
  void begin();
  void report(const SourceReport &report) override;
  void message(Message message) override;
  /// When an input is done: tells what was lost in it, and the counts of its messages.
  void finishFile(std::string_view file);
  /// When all are done: the end of the document, and the output file's name.
  void finish();

  /// Reports that went to the output.
  std::uint64_t reports() const { return reports_; }

 private:
  void countLoss(const SourceReport &report);
  template <class... Step>
  void addToBatch(Step &&...step);
  void deliver(Batch &batch, std::string_view output);
  void flush();

  Options options_;
  const Filter &filter_;
  Formatter &formatter_;
  OutputFile &output_;
  Messages &messages_;
  OutputBuffer buffer_;
  LossCounter losses_;
  std::uint64_t given_ = 0, reports_ = 0;  // before and behind the filter
  // With one thread:
  ReportPrinter printer_;
  std::vector<Message> reportMessages_;
  // With several: the batch that is being filled, and the threads.
  std::unique_ptr<Batch> batch_;
  std::unique_ptr<Workers> workers_;
};

}  // namespace vesk::host
