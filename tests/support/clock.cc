#include "support/clock.h"

#include <sys/time.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <mutex>

#include "support/interpose.h"

#define INTERPOSED extern "C" __attribute__((visibility("default")))

namespace testsupport {
namespace {

constinit Interposed<int(timeval*, void*)> realGettimeofday("gettimeofday");
constinit Interposed<int(clockid_t, timespec*)> realClockGettime("clock_gettime");
constinit Interposed<int(const timespec*, timespec*)> realNanosleep("nanosleep");
constinit Interposed<int(clockid_t, int, const timespec*, timespec*)> realClockNanosleep("clock_nanosleep");
constinit Interposed<unsigned int(unsigned int)> realSleep("sleep");
constinit Interposed<int(useconds_t)> realUsleep("usleep");

constinit std::atomic<bool> sleepsAreFaked{false};
constinit std::atomic<long> wallClockSeconds{0};
constinit std::atomic<long> monotonicNanoseconds{0};
constinit std::atomic<int> wallClockReads{0};
constinit std::mutex sleepsMutex;

constexpr long NANOSECONDS_PER_SECOND = 1'000'000'000;

std::vector<std::chrono::nanoseconds>& RecordedSleeps() {
  static std::vector<std::chrono::nanoseconds> sleeps;
  return sleeps;
}

/// Records the sleep and returns true when sleeps are faked.
bool Slept(std::chrono::nanoseconds duration) {
  if (!sleepsAreFaked) {
    return false;
  }
  const std::lock_guard lock(sleepsMutex);
  RecordedSleeps().push_back(duration);
  return true;
}

std::chrono::nanoseconds DurationOf(const timespec& time) {
  return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

}  // namespace

FakeClock::FakeClock() {
  const std::lock_guard lock(sleepsMutex);
  RecordedSleeps().clear();
  wallClockReads = 0;
  sleepsAreFaked = true;
}

FakeClock::~FakeClock() {
  sleepsAreFaked = false;
  wallClockSeconds = 0;
  monotonicNanoseconds = 0;
}

void FakeClock::MoveWallClock(std::chrono::seconds distance) {
  wallClockSeconds += distance.count();
}

void FakeClock::MoveMonotonicClock(std::chrono::nanoseconds distance) {
  monotonicNanoseconds += distance.count();
}

int FakeClock::WallClockReads() const {
  return wallClockReads;
}

std::vector<std::chrono::nanoseconds> FakeClock::Sleeps() const {
  const std::lock_guard lock(sleepsMutex);
  return RecordedSleeps();
}

}  // namespace testsupport

INTERPOSED int gettimeofday(timeval* __restrict now, void* __restrict zone) noexcept {
  const int result = testsupport::realGettimeofday.Real(now, zone);
  now->tv_sec += testsupport::wallClockSeconds;
  ++testsupport::wallClockReads;
  return result;
}

INTERPOSED int clock_gettime(clockid_t clock, timespec* now) noexcept {
  const int result = testsupport::realClockGettime.Real(clock, now);
  const long moved = clock == CLOCK_MONOTONIC ? testsupport::monotonicNanoseconds.load() : 0;
  if (result == 0 && moved != 0) {
    const long total = now->tv_sec * testsupport::NANOSECONDS_PER_SECOND + now->tv_nsec + moved;
    now->tv_sec = total / testsupport::NANOSECONDS_PER_SECOND;
    now->tv_nsec = total % testsupport::NANOSECONDS_PER_SECOND;
  }
  return result;
}

INTERPOSED int nanosleep(const timespec* duration, timespec* rest) {
  return testsupport::Slept(testsupport::DurationOf(*duration))
             ? 0
             : testsupport::realNanosleep.Real(duration, rest);
}

INTERPOSED int clock_nanosleep(clockid_t clock, int flags, const timespec* time, timespec* rest) {
  const bool relative = (flags & TIMER_ABSTIME) == 0;
  return relative && testsupport::Slept(testsupport::DurationOf(*time))
             ? 0
             : testsupport::realClockNanosleep.Real(clock, flags, time, rest);
}

INTERPOSED unsigned int sleep(unsigned int seconds) {
  return testsupport::Slept(std::chrono::seconds(seconds)) ? 0 : testsupport::realSleep.Real(seconds);
}

INTERPOSED int usleep(useconds_t microseconds) {
  return testsupport::Slept(std::chrono::microseconds(microseconds))
             ? 0
             : testsupport::realUsleep.Real(microseconds);
}
