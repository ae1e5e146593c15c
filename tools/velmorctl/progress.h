/// Telling a waiting person how far a join or leave is.
#ifndef VELMORCTL_PROGRESS_H
#define VELMORCTL_PROGRESS_H

#include <chrono>
#include <string>

#include "attempt_record.h"

namespace velmorctl {

/// Writes lines to standard error: the time since the start, and the step. On a terminal the last line shows
/// the time passing. For one thread.
class Progress {
 public:
  /// Time starts to count.
  explicit Progress(const std::string& provider);
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;
  ~Progress();

  /// Writes a line.
  void Step(const std::string& text);

  /// Writes what the provider has put into its record meanwhile, and the passing time. To be called about
  /// once a second while something is waited for.
  void Tick();

  /// The text of the last line with a status other than 0 in the provider's record; it gives the reason for
  /// that status.
  const std::string& ProviderReason() const noexcept { return providerReason_; }

 private:
  std::string Elapsed() const;
  void EraseClock();

  std::chrono::steady_clock::time_point start_;
  std::chrono::steady_clock::time_point lastLine_;
  AttemptRecord record_;
  std::string provider_;
  std::string providerReason_;
  std::string step_;
  bool terminal_;
  bool clockShown_ = false;
};

}  // namespace velmorctl

#endif  // VELMORCTL_PROGRESS_H
