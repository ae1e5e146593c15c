#include "providers/plugin_library.h"

#include <dlfcn.h>

#include <utility>

#include "authentication/library_exceptions.h"
#include "providers/shared_object_file.h"

namespace quenix::authentication {

namespace {

constexpr const char* pluginDirectory = "/usr/libexec/velmor/";

struct Loaded {
  void* handle;
  std::string failure;
};

Loaded Load(const std::string& path) {
  if (IsCutOff(path)) return {nullptr, path + ": file too short"};
  dlerror();
  void* handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_GLOBAL);
  return {handle, handle == nullptr ? PluginLibrary::LoaderText() : ""};
}

}  // namespace

PluginLibrary::PluginLibrary(const std::string& name, const std::string& failureText) {
  const std::string fileName = "lib" + name + ".so";
  Loaded loaded = Load(pluginDirectory + std::string("lib64") + "/" + fileName);
  if (loaded.handle == nullptr) loaded = Load(pluginDirectory + fileName);
  if (loaded.handle == nullptr) throw IOError(failureText + loaded.failure);
  handle_ = loaded.handle;
}

PluginLibrary::~PluginLibrary() {
  Close();
}

const void* PluginLibrary::Find(const char* symbol) const {
  dlerror();
  return dlsym(handle_, symbol);
}

void PluginLibrary::Close() {
  if (void* handle = std::exchange(handle_, nullptr)) dlclose(handle);
}

std::string PluginLibrary::LoaderText() {
  const char* text = dlerror();
  return text == nullptr ? "" : text;
}

}  // namespace quenix::authentication
