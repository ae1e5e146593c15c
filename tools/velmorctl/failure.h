/// How a command fails: by throwing. Nothing below main() ends the process.
#ifndef VELMORCTL_FAILURE_H
#define VELMORCTL_FAILURE_H

#include <exception>
#include <string>
#include <vector>

#include "exit_codes.h"

namespace velmorctl {

/// A failure that is ready to be reported: an exit code, what happened, details that belong to it (a file, a
/// line, a value), and what to try.
class Failure : public std::exception {
 public:
  Failure(ExitCode code, std::string happened);

  /// Add to the failure and return it, so that it can be built where it is thrown.
  Failure& Detail(std::string name, std::string value);
  Failure& Try(std::string advice);

  const char* what() const noexcept override { return happened_.c_str(); }
  ExitCode Code() const noexcept { return code_; }
  const std::string& Advice() const noexcept { return advice_; }

  struct NamedDetail {
    std::string name;
    std::string value;
  };
  const std::vector<NamedDetail>& Details() const noexcept { return details_; }

 private:
  ExitCode code_;
  std::string happened_;
  std::vector<NamedDetail> details_;
  std::string advice_;
};

/// How the call of an interrupted command failed: "WHAT had failed by then", and why when that is known.
std::string FailedByThen(const std::string& what, const std::exception_ptr& failure);

/// A signal asked the command to end. main() ends the process by that signal, so that the caller sees it.
class Interrupted : public std::exception {
 public:
  Interrupted(int signalNumber, std::string state);

  const char* what() const noexcept override { return state_.c_str(); }
  int SignalNumber() const noexcept { return signalNumber_; }

 private:
  int signalNumber_;
  std::string state_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_FAILURE_H
