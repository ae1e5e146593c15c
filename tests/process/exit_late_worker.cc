// Ends while a call into the plug-in hangs, and lets the call return when the library has already been
// finalised: the worker must then find everything that it touches.

#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>

#include "plugins/scripted_plugin.h"
#include "process/loaded_library.h"

namespace {

void LetTheCallReturn() {
  const auto release = reinterpret_cast<void (*)()>(dlsym(RTLD_DEFAULT, "hangsRelease"));
  if (release == nullptr) {
    std::_Exit(1);
  }
  release();
  testsupport::AwaitEndOfWorkers();
}

}  // namespace

int main() {
  // Handlers run in the reverse order of their registration: this one after those of the library.
  std::atexit(&LetTheCallReturn);
  testsupport::InstallPlugin("hangs");
  testsupport::ConfigureProvider("hangs");
  static auto& library = *new testsupport::LoadedLibrary;  // Never unloaded.
  library.CreateActiveDirectoryStore(0)->GetStoreConfiguration();
  const auto awaitCall = reinterpret_cast<void (*)()>(dlsym(RTLD_DEFAULT, "hangsAwaitCall"));
  if (awaitCall == nullptr) {
    std::fprintf(stderr, "the plug-in is not loaded\n");
    return 1;
  }
  awaitCall();
  return 0;
}
