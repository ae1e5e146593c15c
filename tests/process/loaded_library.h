/// The shared library as a host loads it that was not linked to it.
#ifndef PROCESS_LOADED_LIBRARY_H
#define PROCESS_LOADED_LIBRARY_H

#include <memory>
#include <string>
#include <vector>

#include "authentication/store.h"

namespace testsupport {

/// Loaded with local binding; every call goes through what dlsym() finds.
class LoadedLibrary {
 public:
  LoadedLibrary();
  LoadedLibrary(const LoadedLibrary&) = delete;
  LoadedLibrary& operator=(const LoadedLibrary&) = delete;

  /// Unloads it, unless that was done.
  ~LoadedLibrary();
  void Unload();

  std::vector<std::string> RegisteredStores() const;
  std::unique_ptr<quenix::authentication::AuthenticationStore> CreateStore(const std::string& name) const;

  /// A store "Active Directory" with another time-out than the factory's.
  std::unique_ptr<quenix::authentication::AuthenticationStore> CreateActiveDirectoryStore(
      int timeoutSeconds) const;

 private:
  void* Find(const char* symbol) const;
  void* Factory() const;

  void* handle_;
};

/// Whether the process has the library in memory.
bool LibraryIsMapped();

/// How many threads the process has.
std::size_t ThreadCount();

/// Waits until the process runs no thread of its own but this one.
void AwaitEndOfWorkers();

}  // namespace testsupport

#endif  // PROCESS_LOADED_LIBRARY_H
