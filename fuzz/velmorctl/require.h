#ifndef FUZZ_VELMORCTL_REQUIRE_H
#define FUZZ_VELMORCTL_REQUIRE_H

#include <cstdlib>
#include <iostream>

/// Ends the program unless it holds, which is how a fuzzer learns of a finding.
inline void Require(bool holds, const char* what) {
  if (!holds) {
    std::cerr << "not so: " << what << std::endl;
    std::abort();
  }
}

#endif
