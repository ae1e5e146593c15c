#include "process/loaded_library.h"

#include <dlfcn.h>

#include <stdexcept>
#include <thread>

#include "support/files.h"

namespace testsupport {

namespace {

using quenix::authentication::AuthenticationStore;

/// A sanitizer may run a thread of its own.
const std::size_t THREADS_AT_START = ThreadCount();

/// Room for an object of a class whose constructor is called by its address; larger than it needs.
constexpr std::size_t STORE_ROOM = 256;

}  // namespace

LoadedLibrary::LoadedLibrary() : handle_(dlopen(VELMOR_LIBRARY, RTLD_NOW | RTLD_LOCAL)) {
  if (handle_ == nullptr) {
    throw std::runtime_error(dlerror());
  }
}

LoadedLibrary::~LoadedLibrary() {
  Unload();
}

void LoadedLibrary::Unload() {
  if (handle_ != nullptr) {
    dlclose(handle_);
    handle_ = nullptr;
  }
}

void* LoadedLibrary::Find(const char* symbol) const {
  void* address = dlsym(handle_, symbol);
  if (address == nullptr) {
    throw std::runtime_error(dlerror());
  }
  return address;
}

void* LoadedLibrary::Factory() const {
  return *static_cast<void**>(
      Find("_ZN6quenix14authentication9SingletonINS0_26AuthenticationStoreFactoryEE9_instanceE"));
}

// A member function is called like a function whose first parameter is the object.

std::vector<std::string> LoadedLibrary::RegisteredStores() const {
  using Function = std::vector<std::string> (*)(const void*);
  return reinterpret_cast<Function>(Find(
      "_ZNK6quenix14authentication26AuthenticationStoreFactory19GetRegisteredStoresB5cxx11Ev"))(Factory());
}

std::unique_ptr<AuthenticationStore> LoadedLibrary::CreateStore(const std::string& name) const {
  using Function = std::unique_ptr<AuthenticationStore> (*)(void*, const std::string&);
  return reinterpret_cast<Function>(
      Find("_ZN6quenix14authentication26AuthenticationStoreFactory14CreateInstanceERKNSt7__cxx1112basic_"
           "stringIcSt11char_traitsIcESaIcEEE"))(Factory(), name);
}

std::unique_ptr<AuthenticationStore> LoadedLibrary::CreateActiveDirectoryStore(int timeoutSeconds) const {
  using Constructor = void (*)(void*, int);
  void* room = ::operator new(STORE_ROOM);
  reinterpret_cast<Constructor>(Find("_ZN6quenix14authentication20ActiveDirectoryStoreC1Ei"))(room,
                                                                                              timeoutSeconds);
  return std::unique_ptr<AuthenticationStore>(static_cast<AuthenticationStore*>(room));
}

bool LibraryIsMapped() {
  return ReadFile("/proc/self/maps").find("/libvelmor.so") != std::string::npos;
}

std::size_t ThreadCount() {
  return NamesIn("/proc/self/task").size();
}

void AwaitEndOfWorkers() {
  while (ThreadCount() > THREADS_AT_START) {
    std::this_thread::yield();
  }
}

}  // namespace testsupport
