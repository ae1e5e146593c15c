/// Random policies.
#ifndef VELMORCTL_TEST_POLICY_GENERATOR_H
#define VELMORCTL_TEST_POLICY_GENERATOR_H

#include <cstdint>

#include "policy_set.h"

namespace velmorctltest {

/// A service "svc" whose lines call the scripted module, include other files and build substacks, with
/// controls of all kinds. The same number gives the same policy.
PolicySet GeneratePolicy(std::uint32_t number);

/// A service "svc" of words, blanks, brackets, backslashes, comments, line ends and other bytes in any order.
PolicySet GenerateOddText(std::uint32_t number);

}  // namespace velmorctltest

#endif  // VELMORCTL_TEST_POLICY_GENERATOR_H
