// Ends, by returning from main, while a call into the plug-in hangs. The store still exists then.

#include <dlfcn.h>

#include <cstdio>
#include <memory>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"

namespace {

std::unique_ptr<quenix::authentication::ActiveDirectoryStore> store;

}  // namespace

int main() {
  testsupport::InstallPlugin("hangs");
  testsupport::ConfigureProvider("hangs");
  store = std::make_unique<quenix::authentication::ActiveDirectoryStore>(0);
  if (!store->GetTrustedDomains().empty()) {
    return 1;
  }
  const auto awaitCall = reinterpret_cast<void (*)()>(dlsym(RTLD_DEFAULT, "hangsAwaitCall"));
  if (awaitCall == nullptr) {
    std::fprintf(stderr, "the plug-in is not loaded\n");
    return 1;
  }
  awaitCall();
  return 0;
}
