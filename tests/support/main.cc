#include <gtest/gtest.h>

#include <cstdio>

#include "support/machine.h"

int main(int count, char** arguments) {
  ::testing::InitGoogleTest(&count, arguments);
  if (!::testing::GTEST_FLAG(list_tests) && !testsupport::InSandbox()) {
    std::fprintf(stderr, "Tests change system files: run them as velmor-sandbox %s\n", arguments[0]);
    return 125;
  }
  return RUN_ALL_TESTS();
}
