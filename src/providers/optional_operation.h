/// Operations that a plug-in may lack.
#ifndef PROVIDERS_OPTIONAL_OPERATION_H
#define PROVIDERS_OPTIONAL_OPERATION_H

#include <type_traits>

#include "authentication/provider_exceptions.h"

namespace quenix::authentication {

/// `ask()`, or `neutral` when the plug-in lacks the operation.
template <class Ask>
std::invoke_result_t<Ask> AskOrElse(Ask ask, std::invoke_result_t<Ask> neutral) {
  try {
    return ask();
  } catch (const CallNotImplementedException&) {
    return neutral;
  }
}

}  // namespace quenix::authentication

#endif  // PROVIDERS_OPTIONAL_OPERATION_H
