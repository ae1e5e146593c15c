#ifndef BENCHMARKS_SYSTEMCONFIGURATION_ALLOCATION_COUNTER_H
#define BENCHMARKS_SYSTEMCONFIGURATION_ALLOCATION_COUNTER_H

#include <cstddef>

/// How often the program, the library included, has asked operator new for memory.
std::size_t AllocationCount();

#endif
