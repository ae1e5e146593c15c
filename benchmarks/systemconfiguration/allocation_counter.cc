#include "allocation_counter.h"

#include <cstdlib>
#include <new>

namespace {

std::size_t count = 0;  // the benchmarks run on one thread

}  // namespace

std::size_t AllocationCount() {
  return count;
}

// Visible, or the shared library would keep to the standard one.
__attribute__((visibility("default"))) void* operator new(std::size_t size) {
  ++count;
  if (void* const memory = std::malloc(size)) return memory;
  throw std::bad_alloc();
}

__attribute__((visibility("default"))) void operator delete(void* memory) noexcept {
  std::free(memory);
}

__attribute__((visibility("default"))) void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}
