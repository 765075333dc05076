// The consuming thread, and what is told about losses.
#include "host/device/LiveRun.h"

#include <algorithm>
#include <exception>
#include <system_error>
#include <thread>

#include "host/device/OpenDevice.h"

namespace vesk::host {

namespace {

constexpr milliseconds kIdleAfter{100};

}  // namespace

LiveCounts LiveRun::run(HidSystem &system, std::unique_ptr<HidNode> node) {
  node_ = node->identity().node;
  try {
    return runThreads(system, std::move(node));
  } catch (const std::system_error &error) {  // no thread, or no descriptor to wake one
    throw DeviceError({&kDeviceUnreadable, node_, {}, {}, std::string("the device cannot be read: ") + error.what()});
  }
}

LiveCounts LiveRun::runThreads(HidSystem &system, std::unique_ptr<HidNode> node) {
  LiveQueue queue(options_.queueCapacity);
  LiveReader reader(system, std::move(node), options_.reader, stop_, queue);
  std::exception_ptr failure;
  std::thread consumer;
  {
    const SignalsElsewhere here;
    consumer = std::thread([&] {
      try {
        consume(queue);
      } catch (...) {
        failure = std::current_exception();
      }
      stop_.request();
    });
  }
  try {
    reader.run();
  } catch (...) {
    queue.close();
    consumer.join();
    throw;
  }
  consumer.join();
  if (failure) std::rethrow_exception(failure);

  counts_.lost = losses_.total().lost;
  counts_.dropped = queue.dropped();
  if (losses_.total().gaps > 1)
    consumer_.message(
        {&kLossTotal,
         node_,
         {},
         {},
         std::to_string(counts_.lost) + " reports lost in " + std::to_string(losses_.total().gaps) + " gaps"});
  if (counts_.dropped != 0)
    consumer_.message({&kQueueOverflow,
                       node_,
                       {},
                       {},
                       std::to_string(counts_.dropped) +
                           " reports were read but not taken, because the output was too slow; those with a counter "
                           "are among the lost ones"});
  return counts_;
}

void LiveRun::consume(LiveQueue &queue) {
  while (!isEnough() && !queue.isDone()) {
    if (auto event = queue.pop(kIdleAfter))
      take(*event);
    else
      consumer_.idle();
  }
}

void LiveRun::take(LiveEvent &event) {
  if (const auto *report = std::get_if<LiveReport>(&event)) {
    this->report(*report);
  } else if (const auto *failure = std::get_if<LiveFailure>(&event)) {
    consumer_.failure(failure->id, failure->problem);
  } else {
    consumer_.message(std::get<Message>(std::move(event)));
  }
}

void LiveRun::report(const LiveReport &live) {
  SourceReport report;
  report.bytes = live.bytes;
  report.id = live.id;
  report.type = live.type;
  report.file = node_;
  report.timeNs = live.timeNs;
  if (const auto gap = losses_.observe(report))
    consumer_.message({&kLostReports,
                       node_,
                       {},
                       live.id,
                       "number " + std::to_string(gap->after) + " follows " + std::to_string(gap->before) + ": " +
                           std::to_string(gap->lost) + " lost"});
  if (!isWanted(report)) return;
  ++(live.type == ReportType::kInput ? counts_.inputs : counts_.features);
  consumer_.report(report, losses_.total());
}

bool LiveRun::isWanted(const SourceReport &report) {
  const auto &ids = options_.inputIds;
  if (report.type == ReportType::kInput && !ids.empty() && std::ranges::find(ids, report.id) == ids.end()) return false;
  return !options_.changesOnly || changes_.isNew(report);
}

}  // namespace vesk::host
