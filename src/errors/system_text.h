/// The system's text for an error number.
#ifndef ERRORS_SYSTEM_TEXT_H
#define ERRORS_SYSTEM_TEXT_H

#include <string>

namespace quenix::authentication {

/// The same text as strerror() gives, safe to ask for on several threads at once.
std::string SystemText(int errorNumber);

}  // namespace quenix::authentication

#endif  // ERRORS_SYSTEM_TEXT_H
