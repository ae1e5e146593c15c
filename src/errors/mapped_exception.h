/// From a provider's status to an exception.
#ifndef ERRORS_MAPPED_EXCEPTION_H
#define ERRORS_MAPPED_EXCEPTION_H

namespace quenix::authentication {

/// Throws the exception that stands for a provider's status; UnknownException when none does. *Deliberate:* 0
/// throws FileNotFoundException, whose code is 2.
[[noreturn]] void ThrowMappedException(unsigned int code);

}  // namespace quenix::authentication

#endif  // ERRORS_MAPPED_EXCEPTION_H
