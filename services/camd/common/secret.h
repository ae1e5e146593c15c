// The memory for a password or for a blob that holds one.
#ifndef CAMD_COMMON_SECRET_H
#define CAMD_COMMON_SECRET_H

#include "velmor/secret.h"

namespace camd {

using velmor::Secret;

}  // namespace camd

#endif  // CAMD_COMMON_SECRET_H
