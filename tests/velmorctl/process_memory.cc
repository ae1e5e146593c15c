#include "process_memory.h"

#include <cstdint>
#include <fstream>
#include <sstream>

namespace velmorctltest {

bool MemoryHolds(pid_t process, const std::string& text) {
  constexpr std::uint64_t greatestRegion = 64U << 20;  // A sanitizer's shadow is greater, and has no text.
  std::ifstream maps("/proc/" + std::to_string(process) + "/maps");
  std::ifstream memory("/proc/" + std::to_string(process) + "/mem", std::ios::binary);
  for (std::string line; std::getline(maps, line);) {
    std::uint64_t begin = 0;
    std::uint64_t end = 0;
    char dash = 0;
    std::string permissions;
    std::istringstream(line) >> std::hex >> begin >> dash >> end >> permissions;
    if (permissions.compare(0, 2, "rw") != 0 || end - begin > greatestRegion) {
      continue;
    }
    std::string content(end - begin, '\0');
    memory.clear();
    memory.seekg(static_cast<std::streamoff>(begin));
    memory.read(content.data(), static_cast<std::streamsize>(content.size()));
    if (content.find(text) != std::string::npos) {
      return true;
    }
  }
  return false;
}

}  // namespace velmorctltest
