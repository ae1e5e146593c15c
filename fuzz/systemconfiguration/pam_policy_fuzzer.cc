// The library and the plain reference must read and write the same policies, and a policy that was written
// must be read as itself.
#include <cstddef>
#include <cstdint>

#include "require_no_difference.h"
#include "systemconfiguration/differential/pam_comparison.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const differential::InputCase input = differential::FromBytes(data, size);
  RequireNoDifference(differential::ComparePolicy(input), input);
  RequireNoDifference(differential::ComparePolicyWithItsRoundTrip(input), input);
  return 0;
}
