#include "errors/mapped_exception.h"

#include "authentication/provider_exceptions.h"
#include "errors/provider_exception_rows.h"

namespace quenix::authentication {

void ThrowMappedException(unsigned int code) {
#define VELMOR_THROW_ROW(Code, Class, Text) \
  case Code:                                \
    throw Class();

  switch (code) {
    case 0:  // shares the first row, that of 2
      VELMOR_PROVIDER_EXCEPTION_ROWS(VELMOR_THROW_ROW)
    case 0xFFFF0000:
    case 0xFFFF0001:
    default:
      throw UnknownException(code);
  }

#undef VELMOR_THROW_ROW
}

}  // namespace quenix::authentication
