/// Lets the library and the reference read and write the same name-service switch.
#ifndef DIFFERENTIAL_NSS_COMPARISON_H
#define DIFFERENTIAL_NSS_COMPARISON_H

#include <string>

#include "systemconfiguration/differential/input_case.h"

namespace differential {

/// Returns what is different, or nothing. Compared are, for each of several readings in a row, how it ended
/// and the state and place of the stream, then the model, what it writes, and where the writing flushed.
std::string CompareConfiguration(const InputCase& input);

/// A configuration without brackets that was read from a plain stream and written must be read again as the
/// same configuration. Returns what is different, or nothing.
std::string CompareConfigurationWithItsRoundTrip(const InputCase& input);

}  // namespace differential

#endif  // DIFFERENTIAL_NSS_COMPARISON_H
