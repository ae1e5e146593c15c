#include "authentication/provider_exceptions.h"

#include "errors/exception_operations.h"
#include "errors/provider_exception_rows.h"

namespace quenix::authentication {

#define VELMOR_DEFINE_ROW(Code, Class, Text) \
  Class::Class() : Exception(Code, Text) {}  \
  VELMOR_DEFINE_EXCEPTION_OPERATIONS(Class)

VELMOR_PROVIDER_EXCEPTION_ROWS(VELMOR_DEFINE_ROW)

#undef VELMOR_DEFINE_ROW

UnknownException::UnknownException(unsigned long code) : Exception(code, "Unknown exception") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(UnknownException)

}  // namespace quenix::authentication
