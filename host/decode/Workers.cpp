// The queue between the reading thread and the decoding ones, and the delivery in order.
#include "host/decode/Workers.h"

#include <exception>

namespace vesk::host {

namespace {

/// Batches for each thread: one in hand, one waiting, one being written.
constexpr unsigned kBatchesEach = 3;

}  // namespace

Workers::Workers(unsigned count, const MakePrinter &makePrinter, Deliver deliver) : deliver_(std::move(deliver)) {
  const std::size_t batches = std::size_t{count} * kBatchesEach + 1;
  spare_.reserve(batches);  // giving one back must not fail
  for (std::size_t i = 0; i < batches; ++i) spare_.push_back(std::make_unique<Batch>());
  for (unsigned i = 0; i < count; ++i) {
    hands_.push_back({makePrinter(), {}});
    hands_.back().outputs.reserve(batches);
  }
  threads_.reserve(count - 1);
  for (unsigned i = 1; i < count; ++i) {
    try {
      threads_.emplace_back([this, i] { work(hands_[i]); });
    } catch (const std::exception &) {
      break;  // no thread, or no memory for one: those that run do all the work
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

template <class Condition>
void Workers::helpUntil(std::unique_lock<std::mutex> &lock, Condition condition) {
  while (!failure_ && !condition()) {
    if (waiting_.empty())
      changed_.wait(lock);
    else
      runNext(lock, hands_.front());
  }
  rethrow();
}

std::unique_ptr<Batch> Workers::take() {
  std::unique_lock lock(mutex_);
  helpUntil(lock, [this] { return !spare_.empty(); });
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
  helpUntil(lock, [this] { return nextOut_ == nextIn_ && !delivering_; });
}

void Workers::work(Hand &hand) {
  std::unique_lock lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] { return stopping_ || failure_ || !waiting_.empty(); });
    if (stopping_ || failure_) return;
    runNext(lock, hand);
  }
}

void Workers::runNext(std::unique_lock<std::mutex> &lock, Hand &hand) {
  auto [number, batch] = std::move(waiting_.front());
  waiting_.pop_front();
  std::unique_ptr<OutputBuffer> output;
  if (!hand.outputs.empty()) {
    output = std::move(hand.outputs.back());
    hand.outputs.pop_back();
  }
  lock.unlock();
  std::exception_ptr failure;
  try {
    if (!output) output = std::make_unique<OutputBuffer>();
    batch->run(*hand.printer, *output);
  } catch (...) {
    failure = std::current_exception();
  }
  lock.lock();
  try {
    if (!failure) done_.emplace(number, Done{std::move(batch), std::move(output), &hand});
  } catch (...) {
    failure = std::current_exception();
  }
  if (failure) failure_ = failure;
  deliverInOrder(lock);
  changed_.notify_all();
}

void Workers::deliverInOrder(std::unique_lock<std::mutex> &lock) {
  if (delivering_) return;  // whoever delivers finds this batch too
  delivering_ = true;
  while (!failure_ && !done_.empty() && done_.begin()->first == nextOut_) {
    Done done = std::move(done_.begin()->second);
    done_.erase(done_.begin());
    lock.unlock();
    std::exception_ptr failure;
    try {
      deliver_(*done.batch, done.output->text());
      done.batch->clear();
      done.output->clear();
    } catch (...) {
      failure = std::current_exception();
    }
    lock.lock();
    if (failure) failure_ = failure;
    ++nextOut_;
    done.hand->outputs.push_back(std::move(done.output));
    spare_.push_back(std::move(done.batch));
    changed_.notify_all();
  }
  delivering_ = false;
}

}  // namespace vesk::host
