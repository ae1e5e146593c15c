#ifndef FUZZ_SYSTEMCONFIGURATION_REQUIRE_NO_DIFFERENCE_H
#define FUZZ_SYSTEMCONFIGURATION_REQUIRE_NO_DIFFERENCE_H

#include <cstdlib>
#include <iostream>
#include <string>

#include "systemconfiguration/differential/input_case.h"

/// Ends the program, which is how a fuzzer learns of a finding.
inline void RequireNoDifference(const std::string& difference, const differential::InputCase& input) {
  if (difference.empty()) return;
  std::cerr << difference << input << std::endl;
  std::abort();
}

#endif
