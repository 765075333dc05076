// Feature requests: what devices answer, what they do not, and what that is called.
#include <csignal>
#include <thread>

#include "host/device/FeatureReader.h"
#include "tests/host/FakeHid.h"

namespace {

using namespace vesk::host;
using namespace std::chrono_literals;
using test::FakeNode;
using test::Read;

class Requests : public testing::Test {
 protected:
  FeatureReader::Answer get(std::uint32_t id, milliseconds timeout = 5000ms) {
    reader_.emplace(node_, timeout, stop_);
    return reader_->get(id);
  }
  void answers(Read read) {
    node_.onGetFeature = [read](std::uint8_t) { return read; };
  }
  static void expectProblem(const FeatureReader::Answer &answer, std::string_view code, std::string_view text) {
    ASSERT_TRUE(answer.problem);
    EXPECT_EQ(answer.problem->kind->code, code);
    EXPECT_EQ(answer.problem->kind->exitCode, 4);
    EXPECT_EQ(answer.problem->severity, Severity::kError);
    EXPECT_EQ(answer.problem->text, text);
    EXPECT_EQ(answer.bytes, "");
    EXPECT_FALSE(answer.gone || answer.stopped);
  }

  /// Waits as the kernel does: until its own time is over or any signal comes, and then it is always EIO.
  static int waitInKernel(milliseconds time) {
    ::poll(nullptr, 0, static_cast<int>(time.count()));
    return EIO;
  }

  FakeNode node_;
  Stop stop_;
  std::optional<FeatureReader> reader_;
};

TEST_F(Requests, giveWhatTheDeviceAnswers) {
  answers(std::string("\xE0\x0D\x05\x00\x21\x40\x24", 7));
  const auto answer = get(0xE0);
  EXPECT_FALSE(answer.problem);
  EXPECT_EQ(answer.bytes, std::string("\xE0\x0D\x05\x00\x21\x40\x24", 7));
}

TEST_F(Requests, nameTheReportAndAskWithAFullBuffer) {
  std::uint8_t asked = 0;
  node_.onGetFeature = [&](std::uint8_t id) -> Read {
    asked = id;
    return std::string(1, static_cast<char>(id));
  };
  EXPECT_EQ(get(0xA9).bytes, "\xA9");
  EXPECT_EQ(asked, 0xA9);
  EXPECT_EQ(node_.askedWith, 4096u);
}

TEST_F(Requests, shortAnswersAreAnswers) {
  answers(std::string("\xE1\x16", 2));
  EXPECT_EQ(get(0xE1).bytes, "\xE1\x16");
}

TEST_F(Requests, longAnswersArriveWhole) {
  answers("\xE0" + std::string(4095, 'x'));
  EXPECT_EQ(get(0xE0).bytes.size(), 4096u);
}

TEST_F(Requests, anEmptyAnswerIsNone) {
  answers(std::string());
  expectProblem(get(0xE2), "empty-answer", "the device's answer is empty");
}

TEST_F(Requests, anotherReportIsNoAnswer) {
  answers("\xE4" + std::string(56, 'x'));
  expectProblem(get(0xE3), "wrong-answer", "the device answered with report 0xE4, 57 bytes long");
  answers(std::string(1, '\0'));
  expectProblem(get(0xE3), "wrong-answer", "the device answered with report 0x00, 1 byte long");
}

TEST_F(Requests, anErrorIsARefusal) {
  answers(EIO);
  expectProblem(get(0xE0), "request-failed", "the device refused the request: Input/output error");
  answers(EPIPE);
  expectProblem(get(0xE0), "request-failed", "the device refused the request: Broken pipe");
}

TEST_F(Requests, anErrorAfterTheTimeIsATimeOut) {
  node_.onGetFeature = [](std::uint8_t) { return waitInKernel(60s); };
  const auto begin = std::chrono::steady_clock::now();
  expectProblem(get(0xDF, 200ms), "request-timeout", "no answer within 0.2 s");
  EXPECT_LT(std::chrono::steady_clock::now() - begin, 5s) << "the wait is cut short";
  answers(ETIMEDOUT);
  expectProblem(get(0xDF), "request-timeout", "no answer within 5 s");
  expectProblem(get(0xDF, 60s), "request-timeout", "no answer within 5 s");
}

TEST_F(Requests, anErrorBeforeTheTimeIsNot) {
  node_.onGetFeature = [](std::uint8_t) { return waitInKernel(50ms); };
  expectProblem(get(0xDF, 2s), "request-failed", "the device refused the request: Input/output error");
}

TEST_F(Requests, anInterruptIsNoDeviceError) {
  for (const int error : {EIO, EINTR, ENODEV}) {
    Stop stop;
    FeatureReader reader(node_, 5s, stop);
    node_.onGetFeature = [&](std::uint8_t) {
      stop.request();
      return error;
    };
    const auto answer = reader.get(0xE0);
    EXPECT_TRUE(answer.stopped) << error;
    EXPECT_FALSE(answer.problem || answer.gone) << error;
  }
}

TEST_F(Requests, anInterruptThatIsNoStopIsPassedOver) {
  int asked = 0;
  node_.onGetFeature = [&](std::uint8_t) -> Read {
    if (++asked < 3) return EINTR;
    return std::string("\xE0\x0D", 2);
  };
  EXPECT_EQ(get(0xE0).bytes, "\xE0\x0D");
  EXPECT_EQ(asked, 3);
}

TEST_F(Requests, interruptsWithoutEndAreATimeOut) {
  node_.onGetFeature = [](std::uint8_t) {
    std::this_thread::sleep_for(5ms);
    return EINTR;
  };
  const auto begin = std::chrono::steady_clock::now();
  expectProblem(get(0xE0, 200ms), "request-timeout", "no answer within 0.2 s");
  EXPECT_LT(std::chrono::steady_clock::now() - begin, 5s);
}

TEST_F(Requests, aSignalEndsTheWait) {
  const StopOnSignals signals(stop_);
  node_.onGetFeature = [](std::uint8_t) { return waitInKernel(60s); };
  const pthread_t waiting = ::pthread_self();
  std::thread sender([waiting] {
    std::this_thread::sleep_for(100ms);
    ::pthread_kill(waiting, SIGINT);
  });
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_TRUE(get(0xDF, 30s).stopped);
  EXPECT_LT(std::chrono::steady_clock::now() - begin, 20s);
  sender.join();
}

TEST_F(Requests, aDeviceThatGoesIsNoRefusal) {
  answers(ENODEV);
  EXPECT_TRUE(get(0xE0).gone);
  answers(EIO);
  node_.gone = true;
  const auto answer = get(0xE0);
  EXPECT_TRUE(answer.gone);
  EXPECT_FALSE(answer.problem || answer.stopped);
}

TEST_F(Requests, theBufferHoldsNothingOfTheAnswerBefore) {
  FeatureReader reader(node_, 5s, stop_);
  answers("\xE0secret");
  reader.get(0xE0);
  std::string seen;
  class Peeking : public FakeNode {
   public:
    std::string *seen = nullptr;
    int getFeature(std::span<char> report) override {
      seen->assign(report.data(), 8);
      return 0;
    }
  };
  Peeking node;
  node.seen = &seen;
  FeatureReader(node, 5s, stop_).get(0xE1);
  EXPECT_EQ(seen, std::string("\xE1\0\0\0\0\0\0\0", 8));
}

TEST(StopOnSignals, requestsTheStopAndRestoresWhatWas) {
  struct sigaction before {
  }, after{};
  ::sigaction(SIGTERM, nullptr, &before);
  for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
    Stop stop;
    const StopOnSignals signals(stop);
    EXPECT_FALSE(stop.requested());
    ::raise(signal);
    EXPECT_TRUE(stop.requested()) << signal;
    EXPECT_TRUE(stop.waitFor(10s)) << "no wait once it is requested";
  }
  ::sigaction(SIGTERM, nullptr, &after);
  EXPECT_EQ(before.sa_handler, after.sa_handler);
}

TEST(StopOnSignals, leavesAnIgnoredSignalIgnored) {
  ::signal(SIGHUP, SIG_IGN);
  {
    Stop stop;
    const StopOnSignals signals(stop);
    ::raise(SIGHUP);
    EXPECT_FALSE(stop.requested());
  }
  ::signal(SIGHUP, SIG_DFL);
}

TEST(StopOnSignals, theSecondSignalKills) {
  EXPECT_EXIT(
      {
        Stop stop;
        const StopOnSignals signals(stop);
        ::raise(SIGINT);
        ::raise(SIGINT);
      },
      testing::KilledBySignal(SIGINT), "");
}

}  // namespace
