// From what a reader finds to what is written: filter, decode, format, and tell.
#pragma once

#include "host/decode/Decoder.h"
#include "host/diagnostics/Messages.h"
#include "host/input/Input.h"
#include "host/output/Formatter.h"
#include "host/output/OutputFile.h"
#include "host/report/Filter.h"
#include "host/report/LossCounter.h"

namespace vesk::host {

class Pipeline : public ReadSink {
 public:
  struct Options {
    bool decimal = false;
    bool lenient = false;
    bool flushEachReport = false;  // for live output
  };

  Pipeline(const Options &options, const Filter &filter, Formatter &formatter, OutputFile &output, Messages &messages);

  /// Before the first report. Everything here throws OutputError and PipeClosed.
  void begin();
  void report(const SourceReport &report) override;
  void message(Message message) override;
  /// When an input is done: tells what was lost in it, and the counts of its messages.
  void finishFile(std::string_view file);
  /// When all are done: the end of the document, and the output file's name.
  void finish();

  /// Reports that reached the output.
  std::uint64_t reports() const { return reports_; }

 private:
  void countLoss(const SourceReport &report);
  void flush();

  Options options_;
  const Filter &filter_;
  Formatter &formatter_;
  OutputFile &output_;
  Messages &messages_;
  Decoder decoder_;
  OutputBuffer buffer_;
  std::vector<Finding> formFindings_;
  LossCounter losses_;
  std::uint64_t reports_ = 0;
};

}  // namespace vesk::host
