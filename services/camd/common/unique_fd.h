// The owner of a descriptor.
#ifndef CAMD_COMMON_UNIQUE_FD_H
#define CAMD_COMMON_UNIQUE_FD_H

#include "velmor/unique_fd.h"

namespace camd {

using velmor::UniqueFd;

}  // namespace camd

#endif  // CAMD_COMMON_UNIQUE_FD_H
