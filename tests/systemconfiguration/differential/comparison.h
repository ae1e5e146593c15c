/// The part of a comparison that is the same for every model.
#ifndef DIFFERENTIAL_COMPARISON_H
#define DIFFERENTIAL_COMPARISON_H

#include <istream>
#include <ostream>
#include <string>

#include "systemconfiguration/differential/input_case.h"
#include "systemconfiguration/differential/observation.h"
#include "systemconfiguration/differential/test_streams.h"

namespace differential {

/// Reads from the input again and again into one model, as a caller may who catches exceptions and goes on.
/// `read` is called with the stream.
template <class Read>
std::string ObserveReading(const InputCase& input, const Read& read) {
  constexpr int readings = 2;
  SourceBuffer buffer(input);
  std::istream stream(&buffer);
  SetUp(stream, input);
  std::string seen;
  for (int reading = 0; reading < readings; ++reading) {
    seen += Ending([&] { read(stream); });
    seen += StateOf(stream) + "consumed: " + std::to_string(buffer.Consumed()) + "\n";
  }
  return seen;
}

/// `write` is called with the stream.
template <class Write>
std::string ObserveWriting(const InputCase& input, const Write& write) {
  SinkBuffer buffer(input);
  std::ostream stream(&buffer);
  SetUp(stream, input);
  std::string seen = Ending([&] { write(stream); });
  seen += StateOf(stream);
  return seen + buffer.Log();
}

}  // namespace differential

#endif  // DIFFERENTIAL_COMPARISON_H
