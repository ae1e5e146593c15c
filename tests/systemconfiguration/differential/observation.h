/// What can be seen of a reader and a writer, in a form in which library and reference can be compared.
#ifndef DIFFERENTIAL_OBSERVATION_H
#define DIFFERENTIAL_OBSERVATION_H

#include <functional>
#include <ios>
#include <string>

namespace differential {

/// The text with everything unprintable as \xNN.
std::string Escaped(const std::string& text);

/// Runs an operation and describes how it ended: "returned", or the exception's class and message. The
/// reference's exceptions are described by the names of the library's. Exceptions that neither may throw end
/// the program.
std::string Ending(const std::function<void()>& operation);

/// "good", or the bits that are set, and the width that is left.
std::string StateOf(const std::ios& stream);

/// Empty when both are equal, else a text that shows both.
std::string Difference(const std::string& library, const std::string& reference);

}  // namespace differential

#endif  // DIFFERENTIAL_OBSERVATION_H
