// Live runs: what comes is passed on in order, what is lost is told, and every end is a clean one.
#include <atomic>
#include <system_error>
#include <thread>

#include "host/device/ChangeFilter.h"
#include "host/device/LiveRun.h"
#include "host/device/OpenDevice.h"
#include "tests/host/FakeHid.h"

namespace {

using namespace vesk::host;
using namespace std::chrono_literals;
using test::controller;
using test::FakeNode;
using test::FakeSystem;
using test::Read;
using testing::ElementsAre;
using testing::IsEmpty;

using Time = PollSchedule::Time;

std::string image(std::uint32_t number, char sample = 0, std::uint32_t timeMs = 0) {
  std::string report(792, '\0');
  report[0] = 0x76;
  for (int k = 0; k < 4; ++k) report[static_cast<std::size_t>(4 + k)] = static_cast<char>(number >> 8 * k);
  for (int k = 0; k < 4; ++k) report[static_cast<std::size_t>(12 + k)] = static_cast<char>(timeMs >> 8 * k);
  report[16] = sample;
  return report;
}

std::string packet(std::uint32_t number, char word = 0) {
  std::string report(2064, '\0');
  report[0] = 0x77;
  report[4] = static_cast<char>(number);
  report[16] = word;
  return report;
}

// --- the schedule

TEST(PollSchedule, allAreDueAtOnceInTheirOrder) {
  const Time start{};
  PollSchedule schedule({{0xE0, 200ms}, {0xD0, 500ms}}, start);
  EXPECT_EQ(schedule.nextDue(), start);
  EXPECT_EQ(schedule.take(start), 0xE0u);
  EXPECT_EQ(schedule.take(start), 0xD0u);
  EXPECT_EQ(schedule.take(start), std::nullopt);
  EXPECT_EQ(schedule.nextDue(), start + 200ms);
}

TEST(PollSchedule, turnsComeAtTheirIntervals) {
  const Time start{};
  PollSchedule schedule({{0xE0, 200ms}, {0xD0, 500ms}}, start);
  std::vector<std::pair<int, int>> turns;
  for (Time now = start; now <= start + 1s; now += 50ms)
    while (const auto id = schedule.take(now))
      turns.emplace_back(std::chrono::duration_cast<milliseconds>(now - start).count(), *id);
  EXPECT_THAT(turns, ElementsAre(std::pair(0, 0xE0), std::pair(0, 0xD0), std::pair(200, 0xE0), std::pair(400, 0xE0),
                                 std::pair(500, 0xD0), std::pair(600, 0xE0), std::pair(800, 0xE0),
                                 std::pair(1000, 0xE0), std::pair(1000, 0xD0)));
}

TEST(PollSchedule, missedTurnsAreLeftOut) {
  const Time start{};
  PollSchedule schedule({{0xE0, 100ms}}, start);
  schedule.take(start);
  EXPECT_EQ(schedule.take(start + 570ms), 0xE0u);
  EXPECT_EQ(schedule.take(start + 570ms), std::nullopt);
  EXPECT_EQ(schedule.nextDue(), start + 600ms);
}

TEST(PollSchedule, mayBeEmpty) {
  PollSchedule schedule({}, Time{});
  EXPECT_EQ(schedule.nextDue(), std::nullopt);
  EXPECT_EQ(schedule.take(Time{} + 1h), std::nullopt);
}

// --- the queue

TEST(LiveQueue, givesWhatItTookInOrderThenEnds) {
  LiveQueue queue;
  queue.push(LiveReport{"a"});
  queue.push(LiveReport{"b"});
  queue.close();
  EXPECT_FALSE(queue.isDone());
  EXPECT_EQ(std::get<LiveReport>(*queue.pop(1s)).bytes, "a");
  EXPECT_EQ(std::get<LiveReport>(*queue.pop(1s)).bytes, "b");
  EXPECT_TRUE(queue.isDone());
  EXPECT_EQ(queue.pop(10s), std::nullopt) << "and does not wait";
}

TEST(LiveQueue, countsWhatItCannotTake) {
  LiveQueue queue(2);
  for (const char *bytes : {"a", "b", "c", "d"}) queue.push(LiveReport{bytes});
  queue.push(LiveFailure{0xE0, {}});
  queue.push(Message{});
  EXPECT_EQ(queue.dropped(), 3u);
  EXPECT_EQ(std::get<LiveReport>(*queue.pop(1s)).bytes, "a");
  queue.push(LiveReport{"e"});
  EXPECT_EQ(std::get<LiveReport>(*queue.pop(1s)).bytes, "b") << "the oldest are kept";
  EXPECT_TRUE(std::holds_alternative<Message>(*queue.pop(1s))) << "messages are never dropped";
  EXPECT_EQ(queue.dropped(), 4u);
}

TEST(LiveQueue, waitsNoLongerThanItIsTold) {
  LiveQueue queue;
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_EQ(queue.pop(30ms), std::nullopt);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, 30ms);
}

// --- changes

SourceReport report(const std::string &bytes, ReportType type = ReportType::kInput) {
  SourceReport source;
  source.bytes = bytes;
  source.id = static_cast<unsigned char>(bytes[0]);
  source.type = type;
  return source;
}

TEST(ChangeFilter, countersAreNoNews) {
  ChangeFilter changes;
  EXPECT_TRUE(changes.isNew(report(image(1, 5, 10))));
  EXPECT_FALSE(changes.isNew(report(image(2, 5, 26))));
  EXPECT_TRUE(changes.isNew(report(image(3, 6, 42))));
  EXPECT_TRUE(changes.isNew(report(packet(1))));
  EXPECT_FALSE(changes.isNew(report(packet(2))));
  EXPECT_TRUE(changes.isNew(report(packet(3, 1))));
  EXPECT_FALSE(changes.isNew(report(image(4, 6, 58)))) << "each ID has a memory of its own";
}

TEST(ChangeFilter, everyByteOfOtherReportsCounts) {
  ChangeFilter changes;
  EXPECT_TRUE(changes.isNew(report("\xDE\x01", ReportType::kFeature)));
  EXPECT_FALSE(changes.isNew(report("\xDE\x01", ReportType::kFeature)));
  EXPECT_TRUE(changes.isNew(report("\xDE\x01\x01", ReportType::kFeature)));
  EXPECT_TRUE(changes.isNew(report("\x76\x01", ReportType::kInput))) << "shorter than its counters";
}

// --- runs

/// Keeps what comes.
class Keeper : public LiveConsumer {
 public:
  std::vector<std::string> reports;
  std::vector<std::uint64_t> lostAt;  // how many were lost when each report came
  std::vector<std::string> failures, messages, texts;
  std::function<void(const SourceReport &)> onReport = [](const SourceReport &) {};

  void report(const SourceReport &report, const LossCounter::Total &losses) override {
    reports.emplace_back(report.bytes);
    lostAt.push_back(losses.lost);
    EXPECT_EQ(report.file, "/dev/hidraw1");
    EXPECT_TRUE(report.timeNs && *report.timeNs >= 0);
    onReport(report);
  }
  void failure(std::uint32_t, const Finding &problem) override { failures.emplace_back(problem.kind->code); }
  void message(Message message) override {
    messages.emplace_back(message.kind->code);
    texts.push_back(message.text);
  }
};

class Runs : public testing::Test {
 protected:
  Runs() { options_.reader.duration = 20s; }  // against a run that would not end

  LiveCounts run() { return LiveRun(options_, stop_, keeper_).run(system_, std::move(node_)); }

  FakeSystem system_;
  std::unique_ptr<FakeNode> node_ = std::make_unique<FakeNode>();
  LiveRun::Options options_;
  Stop stop_;
  Keeper keeper_;
};

TEST_F(Runs, deliverWhatWasQueuedWhenTheDeviceGoes) {
  node_->inputs = {image(1), image(2), packet(9), image(3)};
  node_->leaves = true;
  const LiveCounts counts = run();
  EXPECT_THAT(keeper_.reports, ElementsAre(image(1), image(2), packet(9), image(3)));
  EXPECT_THAT(keeper_.messages, ElementsAre("device-gone"));
  EXPECT_EQ(counts.inputs, 4u);
  EXPECT_EQ(counts.lost, 0u);
}

TEST_F(Runs, endAtTheCount) {
  for (std::uint32_t k = 0; k < 100; ++k) node_->inputs.push_back(image(k));
  options_.count = 7;
  EXPECT_EQ(run().inputs, 7u);
  EXPECT_THAT(keeper_.messages, IsEmpty());
}

TEST_F(Runs, endAfterTheDuration) {
  options_.reader.duration = 50ms;
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_EQ(run().inputs, 0u);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, 50ms);
  EXPECT_THAT(keeper_.messages, IsEmpty());
}

TEST_F(Runs, endAtASignalAndDeliverWhatWasRead) {
  node_->inputs = {image(1), image(2)};
  keeper_.onReport = [&](const SourceReport &) {
    if (keeper_.reports.size() == 2) stop_.request();
  };
  EXPECT_EQ(run().inputs, 2u);
  EXPECT_THAT(keeper_.messages, IsEmpty()) << "a stop is no device that goes";
}

TEST_F(Runs, goOnAfterASignalThatIsNotForThem) {
  node_->inputs = {image(1), EINTR, EINTR, image(2)};
  options_.count = 2;
  run();
  EXPECT_THAT(keeper_.reports, ElementsAre(image(1), image(2)));
  EXPECT_THAT(keeper_.messages, IsEmpty());
}

TEST_F(Runs, tellWhyADeviceThatIsThereCannotBeRead) {
  node_->inputs = {image(1), ENOMEM};
  run();
  EXPECT_THAT(keeper_.reports, ElementsAre(image(1)));
  EXPECT_THAT(keeper_.messages, ElementsAre("device-unreadable"));
  EXPECT_EQ(keeper_.texts[0], "the device cannot be read: Cannot allocate memory");
}

TEST_F(Runs, endWhereTheyCannotWaitForReports) {
  node_->inputs = {image(1)};
  node_->cannotWait = ENOMEM;
  EXPECT_EQ(run().inputs, 1u);
  EXPECT_THAT(keeper_.messages, ElementsAre("device-unreadable"));
}

TEST_F(Runs, passOnWhatTheReaderOfInputsThrows) {
  class Throwing : public FakeNode {
   public:
    int read(std::span<char>) override { throw std::bad_alloc(); }
  };
  EXPECT_THROW(LiveRun(options_, stop_, keeper_).run(system_, std::make_unique<Throwing>()), std::bad_alloc);
}

TEST_F(Runs, passOnWhatTheReaderOfFeaturesThrows) {
  node_->onGetFeature = [](std::uint8_t) -> Read { throw std::bad_alloc(); };
  options_.reader.features = {{0xE0, 10s}};
  EXPECT_THROW(run(), std::bad_alloc);
}

TEST_F(Runs, tellWhichDeviceAMachineWithoutThreadsCannotRead) {
  class Throwing : public FakeNode {
   public:
    int read(std::span<char>) override { throw std::system_error(EAGAIN, std::generic_category()); }
  };
  try {
    LiveRun(options_, stop_, keeper_).run(system_, std::make_unique<Throwing>());
    FAIL();
  } catch (const DeviceError &error) {
    EXPECT_EQ(error.message().file, "/dev/hidraw1");
    EXPECT_EQ(error.message().text, "the device cannot be read: Resource temporarily unavailable");
  }
}

TEST_F(Runs, tellWhatIsLost) {
  node_->inputs = {image(10), image(11), image(15), packet(1), packet(4), image(16)};
  node_->leaves = true;
  EXPECT_EQ(run().lost, 5u);
  EXPECT_THAT(keeper_.lostAt, ElementsAre(0, 0, 3, 3, 5, 5));
  EXPECT_THAT(keeper_.messages, ElementsAre("lost-reports", "lost-reports", "device-gone", "lost-reports-total"));
  EXPECT_EQ(keeper_.texts[0], "number 15 follows 11: 3 lost");
  EXPECT_EQ(keeper_.texts[1], "number 4 follows 1: 2 lost");
  EXPECT_EQ(keeper_.texts[3], "5 reports lost in 2 gaps");
}

TEST_F(Runs, countLossesBeforeAnyChoice) {
  node_->inputs = {image(1), image(2), packet(7), image(3), image(6, 1)};
  node_->leaves = true;
  options_.inputIds = {0x76};
  options_.changesOnly = true;
  const LiveCounts counts = run();
  EXPECT_THAT(keeper_.reports, ElementsAre(image(1), image(6, 1)));
  EXPECT_EQ(counts.inputs, 2u);
  EXPECT_EQ(counts.lost, 2u) << "what is left out is not lost";
}

TEST_F(Runs, countWhatASlowConsumerMakesThemDrop) {
  for (std::uint32_t k = 1; k <= 100; ++k) node_->inputs.push_back(image(k));
  node_->leaves = true;
  options_.queueCapacity = 10;
  keeper_.onReport = [&](const SourceReport &) {
    std::this_thread::sleep_for(300ms), keeper_.onReport = [](auto &) {};
  };
  const LiveCounts counts = run();
  EXPECT_GT(counts.dropped, 0u);
  EXPECT_EQ(counts.inputs + counts.dropped, 100u);
  EXPECT_THAT(keeper_.messages, testing::Contains("queue-overflow"));
}

TEST_F(Runs, endWhereTheConsumerFails) {
  node_->inputs = {image(1), image(2)};
  keeper_.onReport = [](const SourceReport &) { throw std::runtime_error("disk full"); };
  EXPECT_THROW(run(), std::runtime_error);
  EXPECT_EQ(keeper_.reports.size(), 1u);
}

TEST_F(Runs, pollFeatureReportsBesideTheInputs) {
  node_->inputs = {image(1)};
  node_->onGetFeature = [](std::uint8_t id) -> Read {
    if (id == 0xE0) return std::string("\xE0\x0D", 2);
    return EIO;
  };
  options_.reader.features = {{0xE0, 20ms}, {0xD0, 10s}};
  options_.count = 4;
  const LiveCounts counts = run();
  EXPECT_EQ(counts.inputs, 1u);
  EXPECT_EQ(counts.features, 3u);
  EXPECT_THAT(keeper_.failures, ElementsAre("request-failed"));
}

TEST_F(Runs, pollWithoutInputs) {
  node_->inputs = {image(1), image(2)};
  node_->onGetFeature = [](std::uint8_t) -> Read { return std::string("\xE0"); };
  options_.reader.features = {{0xE0, 10ms}};
  options_.reader.inputs = false;
  options_.count = 2;
  run();
  EXPECT_THAT(keeper_.reports, ElementsAre("\xE0", "\xE0"));
}

TEST_F(Runs, inputsComeWhileAFeatureReportStaysMute) {
  std::atomic<bool> came = false;
  keeper_.onReport = [&](const SourceReport &) { came = true; };
  node_->inputs = {image(1)};
  node_->onGetFeature = [&](std::uint8_t) -> Read {
    for (int k = 0; k < 1000 && !came; ++k) std::this_thread::sleep_for(10ms);
    EXPECT_TRUE(came);
    return EIO;
  };
  options_.reader.features = {{0xDF, 10s}};
  options_.count = 1;
  EXPECT_EQ(run().inputs, 1u);
}

TEST_F(Runs, aDeviceThatGoesWhileItIsAskedEndsOnceAndWithoutAFailure) {
  node_->onGetFeature = [](std::uint8_t) { return ENODEV; };
  node_->leaves = true;
  options_.reader.features = {{0xE0, 10ms}};
  run();
  EXPECT_THAT(keeper_.messages, ElementsAre("device-gone"));
  EXPECT_THAT(keeper_.failures, IsEmpty());
}

TEST_F(Runs, waitForTheSameDeviceAndNoOther) {
  node_->inputs = {image(1)};
  node_->leaves = true;
  std::vector<DeviceIdentity> others(6, controller("/dev/hidraw5"));
  others[0].serial = "S2";
  others[1].bus = 5;
  others[2].vendor = 1;
  others[3].product = 1;
  others[4].name = "Vesk";
  others[5].descriptor.pop_back();
  int looked = 0;
  class Returning : public FakeSystem {
   public:
    int *looked = nullptr;
    std::vector<DeviceIdentity> others;
    std::vector<DeviceIdentity> list() override {
      std::vector<DeviceIdentity> all = others;
      if (++*looked >= 3) all.push_back(controller("/dev/hidraw7"));
      return all;
    }
  } system;
  system.looked = &looked;
  system.others = others;
  system.onOpen = [&](const std::string &path) -> HidSystem::Opened {
    EXPECT_EQ(path, "/dev/hidraw7");
    if (system.opens == 1) return {nullptr, EACCES};  // the rule has not run yet
    auto node = std::make_unique<FakeNode>();
    node->identityValue = controller("/dev/hidraw7");
    node->inputs = {image(1), image(2)};
    return {std::move(node)};
  };
  options_.reader.reconnect = true;
  options_.count = 3;
  const LiveCounts counts = LiveRun(options_, stop_, keeper_).run(system, std::move(node_));
  EXPECT_EQ(counts.inputs, 3u);
  EXPECT_EQ(counts.lost, 0u) << "numbers that start anew are no loss";
  EXPECT_THAT(keeper_.messages, ElementsAre("device-away", "device-back"));
  EXPECT_EQ(keeper_.texts[1], "the device is back, as /dev/hidraw7");
}

TEST_F(Runs, aStopEndsTheWaitForAReturn) {
  node_->leaves = true;
  options_.reader.reconnect = true;
  std::thread stopper([&] {
    std::this_thread::sleep_for(50ms);
    stop_.request();
  });
  run();
  stopper.join();
  EXPECT_THAT(keeper_.messages, ElementsAre("device-away"));
}

}  // namespace
