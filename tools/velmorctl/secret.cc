#include "secret.h"

#include <sys/prctl.h>

#include <cstring>

namespace velmorctl {

bool Secret::Append(char character) {
  if (length_ == maximumLength) {
    return false;
  }
  memory_.Data()[length_++] = character;
  return true;
}

void Secret::RemoveLast() {
  if (length_ > 0) {
    memory_.Data()[--length_] = '\0';
  }
}

void Secret::Clear() {
  explicit_bzero(memory_.Data(), memory_.Size());
  length_ = 0;
}

void ForbidCoreFiles() {
  prctl(PR_SET_DUMPABLE, 0, 0, 0, 0);
}

}  // namespace velmorctl
