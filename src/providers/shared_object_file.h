/// A look at a shared object before the loader maps it.
#ifndef PROVIDERS_SHARED_OBJECT_FILE_H
#define PROVIDERS_SHARED_OBJECT_FILE_H

#include <string>

namespace quenix::authentication {

/// Whether the file is a shared object that ends before the data that its program headers promise. The loader
/// does not look, and the process would die of SIGBUS when it touches what is missing. False for everything
/// that the loader itself refuses: a missing file, or one of another kind.
bool IsCutOff(const std::string& path);

}  // namespace quenix::authentication

#endif  // PROVIDERS_SHARED_OBJECT_FILE_H
