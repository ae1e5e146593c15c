/// The shipped plug-in, loaded as the library does.
#ifndef SAMBA_LOADED_PLUGIN_H
#define SAMBA_LOADED_PLUGIN_H

#include <string>

#include "authentication/plugin/active_directory_client.h"

namespace sambatest {

/// Loads the plug-in; unloads it at its end.
class LoadedPlugin {
 public:
  LoadedPlugin();
  LoadedPlugin(const LoadedPlugin&) = delete;
  LoadedPlugin& operator=(const LoadedPlugin&) = delete;
  ~LoadedPlugin();

  void* Symbol(const char* name) const;
  const struct ActiveDirectoryClientMetadata& Metadata() const;
  const struct ActiveDirectoryClientOperations* operator->() const;

 private:
  void* handle_;
};

/// Puts a shell script in the helper's place.
void InstallHelper(const std::string& lines);

/// Puts a state file in its place that says that the host is a member of CORP.
void InstallJoinedState();

}  // namespace sambatest

#endif  // SAMBA_LOADED_PLUGIN_H
