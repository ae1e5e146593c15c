#include "cam/process_memory.h"

#include <cstdint>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace camtest {

namespace {

struct Region {
  const char* begin;
  const char* end;
};

/// Larger ones are the shadow memory of a sanitizer.
constexpr std::uintptr_t LARGEST_REGION = std::uintptr_t{1} << 30U;

/// Every region of the program that can be read and written.
std::vector<Region> WritableRegions() {
  std::ifstream maps("/proc/self/maps");
  std::vector<Region> regions;
  for (std::string line; std::getline(maps, line);) {
    std::istringstream words(line);
    std::uintptr_t begin = 0;
    std::uintptr_t end = 0;
    char dash = 0;
    std::string permissions;
    words >> std::hex >> begin >> dash >> end >> permissions;
    if (permissions.starts_with("rw") && end - begin < LARGEST_REGION) {
      regions.push_back({reinterpret_cast<const char*>(begin), reinterpret_cast<const char*>(end)});
    }
  }
  return regions;
}

}  // namespace

__attribute__((no_sanitize("address", "thread"))) bool MemoryHoldsReverseOf(std::string_view reversed) {
  for (const auto& region : WritableRegions()) {
    for (const char* start = region.begin; start + reversed.size() <= region.end; ++start) {
      std::size_t same = 0;
      while (same < reversed.size() && start[same] == reversed[reversed.size() - 1 - same]) ++same;
      if (same == reversed.size()) return true;
    }
  }
  return false;
}

}  // namespace camtest
