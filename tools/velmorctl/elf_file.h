/// The shape of a shared object's file.
#ifndef VELMORCTL_ELF_FILE_H
#define VELMORCTL_ELF_FILE_H

#include <string>

namespace velmorctl {

/// Why the file cannot be a shared object of this machine, or is not there whole; empty when it can be
/// loaded. Loading a file that was cut off would end the process, so this is looked at first.
std::string ElfProblem(const std::string& path);

}  // namespace velmorctl

#endif  // VELMORCTL_ELF_FILE_H
