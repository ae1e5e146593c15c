/// The memory of a process that runs.
#ifndef TESTS_VELMORCTL_PROCESS_MEMORY_H
#define TESTS_VELMORCTL_PROCESS_MEMORY_H

#include <sys/types.h>

#include <string>

namespace velmorctltest {

/// Whether the text stands anywhere in the writable memory of the process.
bool MemoryHolds(pid_t process, const std::string& text);

}  // namespace velmorctltest

#endif  // TESTS_VELMORCTL_PROCESS_MEMORY_H
