// The queue between the reading thread and the decoding ones, and the delivery in order.
#include "host/decode/Workers.h"

#include <system_error>

namespace vesk::host {

namespace {

/// Batches for each thread: one in hand, one waiting, one being written.
constexpr unsigned kBatchesEach = 3;

}  // namespace

Workers::Workers(unsigned count, const MakePrinter &makePrinter, Deliver deliver) : deliver_(std::move(deliver)) {
  for (unsigned i = 0; i < count * kBatchesEach + 1; ++i) spare_.push_back(std::make_unique<Batch>());
  for (unsigned i = 0; i < count; ++i) printers_.push_back(makePrinter());
  threads_.reserve(count);
  for (const auto &printer : printers_) {
    try {
      threads_.emplace_back([this, &printer] { work(*printer); });
    } catch (const std::system_error &) {
      if (threads_.empty()) throw;
      break;  // the machine has no more to give; those that run do all the work
    }
  }
}

Workers::~Workers() {
  {
    const std::lock_guard lock(mutex_);
    stopping_ = true;
  }
  changed_.notify_all();
  for (std::thread &thread : threads_) thread.join();
}

void Workers::rethrow() {
  if (failure_) std::rethrow_exception(failure_);
}

std::unique_ptr<Batch> Workers::take() {
  std::unique_lock lock(mutex_);
  changed_.wait(lock, [this] { return failure_ || !spare_.empty(); });
  rethrow();
  auto batch = std::move(spare_.back());
  spare_.pop_back();
  return batch;
}

void Workers::put(std::unique_ptr<Batch> batch) {
  {
    const std::lock_guard lock(mutex_);
    waiting_.emplace_back(nextIn_++, std::move(batch));
  }
  changed_.notify_all();
}

void Workers::drain() {
  std::unique_lock lock(mutex_);
  changed_.wait(lock, [this] { return failure_ || (nextOut_ == nextIn_ && !delivering_); });
  rethrow();
}

void Workers::work(ReportPrinter &printer) {
  std::unique_lock lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] { return stopping_ || failure_ || !waiting_.empty(); });
    if (stopping_ || failure_) return;
    auto [number, batch] = std::move(waiting_.front());
    waiting_.pop_front();
    lock.unlock();
    std::exception_ptr failure;
    try {
      batch->run(printer);
    } catch (...) {
      failure = std::current_exception();
    }
    lock.lock();
    if (failure) failure_ = failure;
    done_.emplace(number, std::move(batch));
    deliverInOrder(lock);
    changed_.notify_all();
  }
}

void Workers::deliverInOrder(std::unique_lock<std::mutex> &lock) {
  if (delivering_) return;  // whoever delivers finds this batch too
  delivering_ = true;
  while (!failure_ && !done_.empty() && done_.begin()->first == nextOut_) {
    auto batch = std::move(done_.begin()->second);
    done_.erase(done_.begin());
    lock.unlock();
    std::exception_ptr failure;
    try {
      deliver_(*batch);
      batch->clear();
    } catch (...) {
      failure = std::current_exception();
    }
    lock.lock();
    if (failure) failure_ = failure;
    ++nextOut_;
    spare_.push_back(std::move(batch));
    changed_.notify_all();
  }
  delivering_ = false;
}

}  // namespace vesk::host
