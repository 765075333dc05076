// The steps that each report goes through.
#include "host/decode/Pipeline.h"

#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr std::size_t kWriteAt = std::size_t{256} << 10;  // how much output is gathered for one write

Message about(const SourceReport &report, const Finding &finding) {
  return {finding.kind, std::string(report.file), report.place, report.id, finding.text};
}

}  // namespace

Pipeline::Pipeline(const Options &options, const Filter &filter, Formatter &formatter, OutputFile &output,
                   Messages &messages)
    : options_(options),
      filter_(filter),
      formatter_(formatter),
      output_(output),
      messages_(messages),
      decoder_({formatter.wantsLines(), formatter.wantsValue(), options.decimal, options.lenient}) {}

void Pipeline::begin() {
  formatter_.begin(buffer_);
}

void Pipeline::report(const SourceReport &report) {
  countLoss(report);
  if (!filter_.wants(report)) return;
  const Decoded &decoded = decoder_.decode(report);
  formFindings_.clear();
  formatter_.report(buffer_, report, decoded, reports_ == 0, formFindings_);
  ++reports_;
  for (const Finding &finding : decoded.findings) messages_.add(about(report, finding));
  for (const Finding &finding : formFindings_) messages_.add(about(report, finding));
  if (buffer_.size() >= kWriteAt || options_.flushEachReport) flush();
}

void Pipeline::countLoss(const SourceReport &report) {
  const auto gap = losses_.observe(report);
  if (!gap) return;
  message({&kLostReports, std::string(report.file), report.place, report.id,
           "number " + std::to_string(gap->after) + " follows " + std::to_string(gap->before) + ": " +
               std::to_string(gap->lost) + " lost"});
}

void Pipeline::message(Message message) {
  messages_.add(std::move(message));
}

void Pipeline::finishFile(std::string_view file) {
  messages_.finishFile(file);
  const LossCounter::Total total = std::exchange(losses_, {}).total();
  if (total.gaps > 1)
    message({&kLossTotal,
             std::string(file),
             {},
             {},
             std::to_string(total.lost) + " reports lost in " + std::to_string(total.gaps) + " gaps"});
}

void Pipeline::finish() {
  const Summary summary{reports_, &messages_};
  formatter_.end(buffer_, summary);
  flush();
  output_.commit();
}

void Pipeline::flush() {
  output_.write(buffer_.text());
  buffer_.clear();
}

}  // namespace vesk::host
