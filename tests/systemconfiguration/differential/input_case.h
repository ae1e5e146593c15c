/// One input of the differential test and of the fuzz harnesses: a text, and how its streams are set up.
#ifndef DIFFERENTIAL_INPUT_CASE_H
#define DIFFERENTIAL_INPUT_CASE_H

#include <cstddef>
#include <cstdint>
#include <ios>
#include <iosfwd>
#include <string>

namespace differential {

struct InputCase {
  std::streamsize width = 0;
  bool skipWhiteSpace = true;
  bool commaSeparates = false;  // a locale whose white space is the comma and the line end
  std::ios_base::iostate state = std::ios_base::goodbit;       // before the first operation
  std::ios_base::iostate exceptions = std::ios_base::goodbit;  // the stream's exception mask
  std::size_t chunk = 0;                                       // characters per refill; 0: all at once
  std::size_t fault = std::string::npos;                       // the buffer throws when it gets here
  std::size_t capacity = std::string::npos;                    // characters that can be written
  bool throwWhenFull = false;
  std::string text;
};

/// Takes five bytes for the set-up and the rest for the text. A byte counts from '0', so that a corpus file
/// that begins with "00000" is its text read plainly.
InputCase FromBytes(const std::uint8_t* bytes, std::size_t size);

/// For failure messages: the set-up and the text with its unprintable characters escaped.
std::ostream& operator<<(std::ostream& stream, const InputCase& input);

}  // namespace differential

#endif  // DIFFERENTIAL_INPUT_CASE_H
