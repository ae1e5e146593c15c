#include "secret.h"

#include <sys/mman.h>
#include <sys/prctl.h>

#include <cstring>
#include <new>

namespace velmorctl {

namespace {

constexpr std::size_t mappedBytes = 4096;
static_assert(Secret::maximumLength < mappedBytes, "the terminator must fit");

}  // namespace

Secret::Secret() {
  void* memory = mmap(nullptr, mappedBytes, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (memory == MAP_FAILED) {
    throw std::bad_alloc();
  }
  memory_ = static_cast<char*>(memory);
  // Both fail where limits forbid them; the text is wiped in any case.
  mlock(memory_, mappedBytes);
  madvise(memory_, mappedBytes, MADV_DONTDUMP);
}

Secret::~Secret() {
  Clear();
  munmap(memory_, mappedBytes);
}

bool Secret::Append(char character) {
  if (length_ == maximumLength) {
    return false;
  }
  memory_[length_++] = character;
  return true;
}

void Secret::RemoveLast() {
  if (length_ > 0) {
    memory_[--length_] = '\0';
  }
}

void Secret::Clear() {
  explicit_bzero(memory_, mappedBytes);
  length_ = 0;
}

void ForbidCoreFiles() {
  prctl(PR_SET_DUMPABLE, 0, 0, 0, 0);
}

}  // namespace velmorctl
