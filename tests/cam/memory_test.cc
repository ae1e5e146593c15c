// A process without memory. A sanitizer needs more of it than a limit leaves, so this runs without one.
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <fstream>
#include <string>

#include "cam/plugin.h"

namespace camtest {
namespace {

constexpr std::uint32_t OUT_OF_MEMORY = 8;
constexpr std::size_t MEBIBYTE = std::size_t{1} << 20U;

/// From now on the process may have this much memory beyond what it has.
void LimitMemory(std::size_t more) {
  std::size_t pages = 0;
  std::ifstream("/proc/self/statm") >> pages;
  const rlim_t limit = pages * static_cast<std::size_t>(sysconf(_SC_PAGESIZE)) + more;
  const rlimit limits{limit, limit};
  ASSERT_EQ(setrlimit(RLIMIT_AS, &limits), 0);
}

TEST(CamMemoryTest, CallThatRunsOutOfMemoryEndsWithItsStatus) {
  WriteSettings(1);
  const std::string hostName(64 * MEBIBYTE, 'h');
  const Plugin plugin;
  LimitMemory(80 * MEBIBYTE);
  EXPECT_EQ(plugin.Create(hostName).status, OUT_OF_MEMORY);
}

}  // namespace
}  // namespace camtest
