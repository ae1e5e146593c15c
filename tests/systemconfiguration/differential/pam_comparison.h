/// Lets the library and the reference read and write the same PAM input.
#ifndef DIFFERENTIAL_PAM_COMPARISON_H
#define DIFFERENTIAL_PAM_COMPARISON_H

#include <string>

#include "systemconfiguration/differential/input_case.h"

namespace differential {

/// Each returns what is different, or nothing. Compared are, for each of several readings in a row, how it
/// ended and the state and place of the stream, then the model, what it writes, and where the writing
/// flushed.
std::string CompareFacility(const InputCase& input);
std::string CompareEntry(const InputCase& input);
std::string ComparePolicy(const InputCase& input);

/// A policy that was read from a plain stream and written must be read again as the same policy. Returns what
/// is different, or nothing.
std::string ComparePolicyWithItsRoundTrip(const InputCase& input);

}  // namespace differential

#endif  // DIFFERENTIAL_PAM_COMPARISON_H
