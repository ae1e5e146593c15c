// The library and the plain reference must read and write the same configurations, and one that was written
// must be read as itself.
#include <cstddef>
#include <cstdint>

#include "require_no_difference.h"
#include "systemconfiguration/differential/nss_comparison.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const differential::InputCase input = differential::FromBytes(data, size);
  RequireNoDifference(differential::CompareConfiguration(input), input);
  RequireNoDifference(differential::CompareConfigurationWithItsRoundTrip(input), input);
  return 0;
}
