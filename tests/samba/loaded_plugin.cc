#include "loaded_plugin.h"

#include <dlfcn.h>

#include <stdexcept>

#include "support/files.h"

namespace sambatest {

LoadedPlugin::LoadedPlugin() : handle_(dlopen(SAMBA_PLUGIN, RTLD_LAZY | RTLD_GLOBAL)) {
  if (handle_ == nullptr) throw std::runtime_error(dlerror());
}

LoadedPlugin::~LoadedPlugin() {
  dlclose(handle_);
}

void* LoadedPlugin::Symbol(const char* name) const {
  return dlsym(handle_, name);
}

const struct ActiveDirectoryClientMetadata& LoadedPlugin::Metadata() const {
  return *static_cast<const struct ActiveDirectoryClientMetadata*>(
      Symbol(ACTIVE_DIRECTORY_CLIENT_METADATA_SYMBOL));
}

const struct ActiveDirectoryClientOperations* LoadedPlugin::operator->() const {
  return static_cast<const struct ActiveDirectoryClientOperations*>(
      Symbol(ACTIVE_DIRECTORY_CLIENT_OPERATIONS_SYMBOL));
}

void InstallHelper(const std::string& lines) {
  const std::string path = "/usr/libexec/velmor/velmor-samba-helper";
  testsupport::WriteFile(path, "#!/bin/sh\n" + lines + "\n");
  testsupport::SetMode(path, 0755);
}

void InstallJoinedState() {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  testsupport::WriteFile(
      "/var/lib/quenix/samba/state.json",
      R"({"format": 1, "joined": true, "dnsDomain": "corp.example", "netbiosDomain": "CORP",
                             "hostName": "HOST1", "machineAccountDn": "CN=HOST1,DC=corp,DC=example",
                             "preferredDomainControllers": ["dc1.corp.example"], "smartCardEnabledServices": []})");
}

}  // namespace sambatest
