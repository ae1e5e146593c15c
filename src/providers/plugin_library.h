/// A plug-in's shared object.
#ifndef PROVIDERS_PLUGIN_LIBRARY_H
#define PROVIDERS_PLUGIN_LIBRARY_H

#include <string>

namespace quenix::authentication {

/// A shared object from the plug-in directory, loaded with lazy and global binding. For one thread while it
/// is opened and closed.
class PluginLibrary {
 public:
  /// Loads "libNAME.so" from the directory's "lib64", or else from the directory itself. Throws IOError with
  /// `failureText` and the loader's text about the second place when neither can be loaded.
  PluginLibrary(const std::string& name, const std::string& failureText);
  PluginLibrary(const PluginLibrary&) = delete;
  PluginLibrary& operator=(const PluginLibrary&) = delete;
  ~PluginLibrary();

  /// The address of a data symbol; null when there is none, and LoaderText() then says so.
  const void* Find(const char* symbol) const;

  /// Unloads the shared object; it must not be used any more.
  void Close();

  /// The loader's text about its last failure on this thread; empty when it has none.
  static std::string LoaderText();

 private:
  void* handle_;
};

}  // namespace quenix::authentication

#endif  // PROVIDERS_PLUGIN_LIBRARY_H
