#include <gtest/gtest.h>

#include <cstdio>

#include "support/machine.h"

// g++ says with macros what is watched, clang with this.
#ifndef __has_feature
#define __has_feature(name) 0
#endif

#if defined(__SANITIZE_ADDRESS__) || __has_feature(address_sanitizer)
// Two plug-ins in one process define the same two symbols: that is their interface.
extern "C" __attribute__((visibility("default"))) const char* __asan_default_options();
const char* __asan_default_options() {
  return "detect_odr_violation=0";
}
#endif

#ifdef __SANITIZE_THREAD__
// The loader's memory is guarded by a lock that the sanitizer does not see.
extern "C" __attribute__((visibility("default"))) const char* __tsan_default_suppressions();
const char* __tsan_default_suppressions() {
  return "called_from_lib:ld-linux-x86-64.so.2\nrace:_dl_close_worker\n";
}
#endif

int main(int count, char** arguments) {
  ::testing::InitGoogleTest(&count, arguments);
  if (!::testing::GTEST_FLAG(list_tests) && !testsupport::InSandbox()) {
    std::fprintf(stderr, "Tests change system files: run them as velmor-sandbox %s\n", arguments[0]);
    return 125;
  }
  return RUN_ALL_TESTS();
}
