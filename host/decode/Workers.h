// Threads that decode batches side by side, and hand on what comes out in the order in which it went in. The thread
// that puts batches in is one of them: it decodes too whenever it would have to wait.
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
  using Deliver = std::function<void(Batch &, std::string_view output)>;

  /// Starts `count` - 1 threads; each, like the caller, has a printer of its own. `deliver` is called by one thread at
  /// a time, in order.
  Workers(unsigned count, const MakePrinter &makePrinter, Deliver deliver);
  /// Lets go of what was not delivered.
  ~Workers();

  /// An empty batch to fill. Decodes or waits while too many are on their way, which is what bounds the memory. Throws
  /// what a worker or `deliver` has thrown.
  std::unique_ptr<Batch> take();
  void put(std::unique_ptr<Batch> batch);
  /// Waits until all that was put in was delivered; throws like take().
  void drain();

 private:
  /// What a thread has of its own. Its outputs come back to it, because memory that another processor has filled is
  /// slow to write to.
  struct Hand {
    std::unique_ptr<ReportPrinter> printer;
    std::vector<std::unique_ptr<OutputBuffer>> outputs;
  };
  struct Done {
    std::unique_ptr<Batch> batch;
    std::unique_ptr<OutputBuffer> output;
    Hand *hand;
  };

  void work(Hand &hand);
  void runNext(std::unique_lock<std::mutex> &lock, Hand &hand);
  template <class Condition>
  void helpUntil(std::unique_lock<std::mutex> &lock, Condition condition);
  void deliverInOrder(std::unique_lock<std::mutex> &lock);
  void rethrow();

  Deliver deliver_;
  std::mutex mutex_;
  std::condition_variable changed_;
  std::vector<std::unique_ptr<Batch>> spare_;
  std::deque<std::pair<std::uint64_t, std::unique_ptr<Batch>>> waiting_;
  std::map<std::uint64_t, Done> done_;
  std::uint64_t nextIn_ = 0, nextOut_ = 0;
  bool delivering_ = false, stopping_ = false;
  std::exception_ptr failure_;
  std::vector<Hand> hands_;  // the caller's first
  std::vector<std::thread> threads_;
};

}  // namespace vesk::host
