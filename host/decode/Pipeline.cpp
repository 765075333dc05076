// The steps that each report goes through, on one thread or on several.
#include "host/decode/Pipeline.h"

#include <utility>

namespace vesk::host {

namespace {

constexpr MessageKind kNothingFits{"nothing-fits", Severity::kWarning, kExitOk};

constexpr std::size_t kWriteAt = std::size_t{256} << 10;  // how much output is gathered for one write

}  // namespace

Pipeline::Pipeline(const Options &options, const Filter &filter, Formatter &formatter, OutputFile &output,
                   Messages &messages)
    : options_(options),
      filter_(filter),
      formatter_(formatter),
      output_(output),
      messages_(messages),
      printer_(formatter, options.decimal, options.lenient) {
  if (options.jobs < 2 || options.flushEachReport || !formatter.isStateless()) return;
  workers_ = std::make_unique<Workers>(
      options.jobs, [this] { return std::make_unique<ReportPrinter>(formatter_, options_.decimal, options_.lenient); },
      [this](Batch &batch, std::string_view text) { deliver(batch, text); });
  batch_ = workers_->take();
}

void Pipeline::begin() {
  formatter_.begin(buffer_);
}

void Pipeline::report(const SourceReport &report) {
  ++given_;
  countLoss(report);
  if (!filter_.wants(report)) return;
  const bool first = reports_++ == 0;
  if (workers_) {
    addToBatch(report, first);
    return;
  }
  printer_.print(report, first, buffer_, reportMessages_);
  for (Message &message : reportMessages_) messages_.add(std::move(message));
  reportMessages_.clear();
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
  if (workers_)
    addToBatch(Batch::Event(std::move(message)));
  else
    messages_.add(std::move(message));
}

void Pipeline::finishFile(std::string_view file) {
  const LossCounter::Total total = std::exchange(losses_, {}).total();
  if (total.gaps > 1)
    message({&kLossTotal,
             std::string(file),
             {},
             {},
             std::to_string(total.lost) + " reports lost in " + std::to_string(total.gaps) + " gaps"});
  if (workers_)
    addToBatch(Batch::Event(Batch::FileEnd{std::string(file)}));
  else
    messages_.finishFile(file);
}

template <class... Step>
void Pipeline::addToBatch(Step &&...step) {
  batch_->add(std::forward<Step>(step)...);
  if (!batch_->isFull()) return;
  workers_->put(std::move(batch_));
  batch_ = workers_->take();
}

void Pipeline::deliver(Batch &batch, std::string_view output) {
  for (Batch::Event &event : batch.events()) {
    if (auto *message = std::get_if<Message>(&event))
      messages_.add(std::move(*message));
    else
      messages_.finishFile(std::get<Batch::FileEnd>(event).file);
  }
  if (buffer_.size() != 0) flush();  // what begin() has left there
  output_.write(output);
}

void Pipeline::finish() {
  if (workers_) {
    if (!batch_->isEmpty()) workers_->put(std::move(batch_));
    workers_->drain();
  }
  if (given_ != 0 && reports_ == 0)
    messages_.add({&kNothingFits,
                   {},
                   {},
                   {},
                   std::string(given_ == 1 ? "the only report does not fit"
                                           : "none of the " + std::to_string(given_) + " reports fits") +
                       " what --report, --type, --device, --from and --to ask for"});
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
