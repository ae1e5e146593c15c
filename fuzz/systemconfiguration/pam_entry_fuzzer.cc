// The library and the plain reference must read and write the same entries.
#include <cstddef>
#include <cstdint>

#include "require_no_difference.h"
#include "systemconfiguration/differential/pam_comparison.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const differential::InputCase input = differential::FromBytes(data, size);
  RequireNoDifference(differential::CompareEntry(input), input);
  return 0;
}
