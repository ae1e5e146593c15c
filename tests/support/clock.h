/// Time that passes only when a test says so.
#ifndef SUPPORT_CLOCK_H
#define SUPPORT_CLOCK_H

#include <chrono>
#include <vector>

namespace testsupport {

/// While one exists, every sleep of the process returns at once and is recorded; the clocks can be moved. One
/// at a time.
class FakeClock {
 public:
  FakeClock();
  FakeClock(const FakeClock&) = delete;
  FakeClock& operator=(const FakeClock&) = delete;
  ~FakeClock();

  /// Moves what gettimeofday() tells. Into the past by more than a time-out, and a timed wait that is
  /// computed from it is over at once.
  void MoveWallClock(std::chrono::seconds distance);

  /// Moves what clock_gettime(CLOCK_MONOTONIC) tells.
  void MoveMonotonicClock(std::chrono::nanoseconds distance);

  /// How often the process has asked gettimeofday() since this exists.
  int WallClockReads() const;

  /// The sleeps so far, in order, of all threads.
  std::vector<std::chrono::nanoseconds> Sleeps() const;
};

}  // namespace testsupport

#endif  // SUPPORT_CLOCK_H
