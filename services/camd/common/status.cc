#include "common/status.h"

#include <system_error>

namespace camd {

std::string ErrorText(int errorNumber) {
  return std::generic_category().message(errorNumber);
}

}  // namespace camd
