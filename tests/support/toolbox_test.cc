#include <gtest/gtest.h>
#include <sys/time.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <stdexcept>
#include <thread>

#include "support/clock.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/gate.h"
#include "support/interpose.h"
#include "support/log_recorder.h"
#include "support/machine.h"

namespace testsupport {
namespace {

TEST(ThrowsWhatTest, AcceptsTheExactClassAndTextOnly) {
  const auto fail = [] { throw std::out_of_range("text"); };
  EXPECT_TRUE(ThrowsWhat<std::out_of_range>(fail, "text"));
  EXPECT_FALSE(ThrowsWhat<std::logic_error>(fail, "text"));
  EXPECT_FALSE(ThrowsWhat<std::out_of_range>(fail, "tex"));
  EXPECT_FALSE(ThrowsWhat<std::out_of_range>([] {}, "text"));
}

TEST(FakeClockTest, SleepsReturnAtOnceAndAreRecorded) {
  const FakeClock clock;
  const auto start = std::chrono::steady_clock::now();
  sleep(3000);
  std::this_thread::sleep_for(std::chrono::hours(1));
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::minutes(1));
  EXPECT_EQ(clock.Sleeps(),
            (std::vector<std::chrono::nanoseconds>{std::chrono::seconds(3000), std::chrono::hours(1)}));
}

TEST(FakeClockTest, TheWallClockMovesAndComesBack) {
  timeval before{};
  timeval moved{};
  timeval after{};
  gettimeofday(&before, nullptr);
  {
    FakeClock clock;
    clock.MoveWallClock(std::chrono::seconds(-7200));
    gettimeofday(&moved, nullptr);
  }
  gettimeofday(&after, nullptr);
  EXPECT_LT(moved.tv_sec, before.tv_sec - 7000);
  EXPECT_GE(after.tv_sec, before.tv_sec);
}

TEST(FakeClockTest, TheMonotonicClockMoves) {
  FakeClock clock;
  const auto before = std::chrono::steady_clock::now();
  clock.MoveMonotonicClock(std::chrono::hours(5));
  EXPECT_GE(std::chrono::steady_clock::now() - before, std::chrono::hours(5));
}

TEST(LogRecorderTest, KeepsPriorityAndFormattedText) {
  syslog(LOG_WARNING, "%s is %i", "answer", 42);
  EXPECT_EQ(RecordedLog(), (std::vector<LogLine>{{LOG_WARNING, "answer is 42"}}));
  ForgetLog();
  EXPECT_TRUE(RecordedLog().empty());
}

TEST(LogRecorderTest, AnObserverSeesEachLine) {
  std::vector<std::string> seen;
  ObserveLog([&](const LogLine& line) { seen.push_back(line.text); });
  syslog(LOG_INFO, "first");
  ObserveLog(nullptr);
  syslog(LOG_INFO, "second");
  EXPECT_EQ(seen, (std::vector<std::string>{"first"}));
}

TEST(InterposeTest, ATestAnswersACallOnlyWithinItsScope) {
  char name[65] = {};
  {
    const TakeOver refuse(calls::gethostname, [](char*, std::size_t) {
      errno = ENAMETOOLONG;
      return -1;
    });
    EXPECT_EQ(gethostname(name, sizeof name), -1);
  }
  EXPECT_EQ(gethostname(name, sizeof name), 0);
  EXPECT_STREQ(name, "sandbox");
}

TEST(InterposeTest, ThreadsOfTheStandardLibraryCanBeRefused) {
  const TakeOver refuse(calls::pthreadCreate,
                        [](pthread_t*, const pthread_attr_t*, void* (*)(void*), void*) { return EAGAIN; });
  EXPECT_THROW(std::thread([] {}).join(), std::system_error);
}

TEST(FilesTest, AFullFileSystemTakesNoMore) {
  const ScratchFolder folder;
  const SmallFileSystem fileSystem(folder.Path(), 4096);
  WriteFile(folder.Path() + "a", std::string(4096, 'x'));
  EXPECT_THROW(WriteFile(folder.Path() + "b", "x"), std::system_error);
}

TEST(MachineTest, AnInterfaceCanBeAdded) {
  AddInterface("net0", "192.0.2.7");
  EXPECT_NE(ReadFile("/proc/net/dev").find("net0:"), std::string::npos);
  EXPECT_NE(ReadFile("/proc/net/fib_trie").find("192.0.2.7"), std::string::npos);
}

TEST(MachineTest, FilePermissionsCountWithoutPowers) {
  const ScratchFolder folder;
  WriteFile(folder.Path() + "a", "x");
  SetMode(folder.Path() + "a", 0);
  {
    const WithoutFilePowers powers;
    EXPECT_THROW(ReadFile(folder.Path() + "a"), std::system_error);
  }
  EXPECT_EQ(ReadFile(folder.Path() + "a"), "x");
}

TEST(GateTest, HoldsAThreadUntilItIsOpened) {
  Gate gate;
  bool passed = false;
  std::thread thread([&] {
    gate.Pass();
    passed = true;
  });
  gate.AwaitArrivals(1);
  gate.Open();
  thread.join();
  EXPECT_TRUE(passed);
}

}  // namespace
}  // namespace testsupport
