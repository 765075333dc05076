// Threads that decode batches side by side, and hand on what comes out in the order in which it went in.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <exception>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "host/decode/Batch.h"

namespace vesk::host {

class Workers {
 public:
  using MakePrinter = std::function<std::unique_ptr<ReportPrinter>()>;
  using Deliver = std::function<void(Batch &)>;

  /// Starts `count` threads, each with a printer of its own. `deliver` is called by one thread at a time, in order.
  Workers(unsigned count, const MakePrinter &makePrinter, Deliver deliver);
  /// Lets go of what was not delivered.
  ~Workers();

  /// An empty batch to fill. Waits while too many are on their way, which is what bounds the memory. Throws what a
  /// worker or `deliver` has thrown.
  std::unique_ptr<Batch> take();
  void put(std::unique_ptr<Batch> batch);
  /// Waits until all that was put in was delivered; throws like take().
  void drain();

 private:
  void work(ReportPrinter &printer);
  void deliverInOrder(std::unique_lock<std::mutex> &lock);
  void rethrow();

  Deliver deliver_;
  std::mutex mutex_;
  std::condition_variable changed_;
  std::vector<std::unique_ptr<Batch>> spare_;
  std::deque<std::pair<std::uint64_t, std::unique_ptr<Batch>>> waiting_;
  std::map<std::uint64_t, std::unique_ptr<Batch>> done_;
  std::uint64_t nextIn_ = 0, nextOut_ = 0;
  bool delivering_ = false, stopping_ = false;
  std::exception_ptr failure_;
  std::vector<std::unique_ptr<ReportPrinter>> printers_;
  std::vector<std::thread> threads_;
};

}  // namespace vesk::host
