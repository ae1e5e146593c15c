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

Interrupted::Interrupted(int signalNumber, std::string state)
    : signalNumber_(signalNumber), state_(std::move(state)) {}

}  // namespace velmorctl
