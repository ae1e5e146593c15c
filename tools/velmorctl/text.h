/// Small operations on text that is shown to people.
#ifndef VELMORCTL_TEXT_H
#define VELMORCTL_TEXT_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace velmorctl {

/// `text` with a "?" in the place of each control character, so that a name which a plug-in or a file gave
/// cannot steer the terminal.
std::string Printable(std::string_view text);

/// How many bytes the control character at `index` has: one, or two for one of the second set in UTF-8; 0
/// when there is none.
std::size_t ControlCharacterAt(std::string_view text, std::size_t index);

/// The system's text for an error number.
std::string SystemErrorText(int errorNumber);

/// The parts, `separator` between them.
std::string Join(const std::vector<std::string>& parts, std::string_view separator);

/// `text` without blanks and tabs at both ends.
std::string_view Trimmed(std::string_view text);

}  // namespace velmorctl

#endif  // VELMORCTL_TEXT_H
