/// What lies in this process's memory.
#ifndef TESTS_CAM_PROCESS_MEMORY_H
#define TESTS_CAM_PROCESS_MEMORY_H

#include <string_view>

namespace camtest {

/// Whether the text that `reversed` spells backwards lies anywhere in writable memory, stacks and freed
/// blocks included. Backwards, so that the search does not find what it searches for.
bool MemoryHoldsReverseOf(std::string_view reversed);

}  // namespace camtest

#endif  // TESTS_CAM_PROCESS_MEMORY_H
