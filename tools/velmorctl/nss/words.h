/// The characters that separate words in the name-service switch file.
#ifndef VELMORCTL_NSS_WORDS_H
#define VELMORCTL_NSS_WORDS_H

#include <string>
#include <string_view>
#include <vector>

namespace velmorctl {

/// What the C library takes for white space: blank, tab, newline, vertical tab, form feed, carriage return.
inline bool IsSpace(char character) {
  return character == ' ' || (character >= '\t' && character <= '\r');
}

/// The words of a text, in order.
std::vector<std::string> SplitWords(std::string_view text);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_WORDS_H
