/// libnetapi's status codes as numbers. Its header declares them as an enumeration whose only enumerator is
/// 0, so that in C++ an object of that type holds 0 or 1 and nothing else: another code must be had without
/// reading it as one.
#ifndef VELMOR_NETAPI_CODE_H
#define VELMOR_NETAPI_CODE_H

#include <cstdint>
#include <cstring>
// Uses the fixed-width types without including them.
#include <netapi.h>

namespace velmor {

inline uint32_t CodeOf(const NET_API_STATUS& status) {
  uint32_t code = 0;
  static_assert(sizeof code == sizeof status);
  std::memcpy(&code, &status, sizeof code);
  return code;
}

}  // namespace velmor

#endif  // VELMOR_NETAPI_CODE_H
