/// What a statement of the command's own code throws.
#ifndef VELMORCTL_FAILURE_OF_H
#define VELMORCTL_FAILURE_OF_H

#include <gtest/gtest.h>

#include <string>

#include "failure.h"

namespace velmorctltest {

/// The Failure that `statement` throws; one with the code Fine, after a failed expectation, when it throws
/// none.
template <class Statement>
velmorctl::Failure FailureOf(const Statement& statement) {
  try {
    statement();
  } catch (const velmorctl::Failure& failure) {
    return failure;
  }
  ADD_FAILURE() << "no failure was thrown";
  return {velmorctl::ExitCode::Fine, ""};
}

/// The value of a failure's detail; empty when it has none of this name.
inline std::string DetailOf(const velmorctl::Failure& failure, const std::string& name) {
  for (const auto& detail : failure.Details()) {
    if (detail.name == name) {
      return detail.value;
    }
  }
  return {};
}

}  // namespace velmorctltest

#endif  // VELMORCTL_FAILURE_OF_H
