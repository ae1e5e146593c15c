#include "failure.h"

#include <utility>

namespace velmorctl {

Failure::Failure(ExitCode code, std::string happened) : code_(code), happened_(std::move(happened)) {}

Failure& Failure::Detail(std::string name, std::string value) {
  details_.push_back({std::move(name), std::move(value)});
  return *this;
}

Failure& Failure::Try(std::string advice) {
  advice_ = std::move(advice);
  return *this;
}

std::string FailedByThen(const std::string& what, const std::exception_ptr& failure) {
  const std::string failed = what + " had failed by then";
  try {
    std::rethrow_exception(failure);
  } catch (const std::exception& exception) {
    return failed + ": " + exception.what();
  } catch (...) {
    return failed;
  }
}

Interrupted::Interrupted(int signalNumber, std::string state)
    : signalNumber_(signalNumber), state_(std::move(state)) {}

}  // namespace velmorctl
