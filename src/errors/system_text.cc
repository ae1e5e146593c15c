#include "errors/system_text.h"

#include <array>
#include <cstring>

namespace quenix::authentication {

std::string SystemText(int errorNumber) {
  std::array<char, 256> buffer{};
  return strerror_r(errorNumber, buffer.data(), buffer.size());
}

}  // namespace quenix::authentication
