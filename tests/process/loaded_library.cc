#include "process/loaded_library.h"

#include <dlfcn.h>
#include <unistd.h>

#include <sstream>
#include <stdexcept>
#include <thread>

#include "authentication/active_directory_store.h"
#include "support/files.h"

namespace testsupport {

namespace {

using quenix::authentication::AuthenticationStore;

/// How many threads the process has when it runs none of its own: a sanitizer may start one along with the
/// first that the process starts.
std::size_t CountIdleThreads() {
  pid_t first = 0;
  std::thread([&first] { first = gettid(); }).join();
  // A thread that has been joined may still be on its way out.
  while (Exists("/proc/self/task/" + std::to_string(first))) {
    std::this_thread::yield();
  }
  return ThreadCount();
}

const std::size_t IDLE_THREADS = CountIdleThreads();

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
  void* room = ::operator new(sizeof(quenix::authentication::ActiveDirectoryStore));
  reinterpret_cast<Constructor>(Find("_ZN6quenix14authentication20ActiveDirectoryStoreC1Ei"))(room,
                                                                                              timeoutSeconds);
  return std::unique_ptr<AuthenticationStore>(static_cast<AuthenticationStore*>(room));
}

bool LibraryIsMapped() {
  // Its code: a sanitizer that has symbolised something keeps the file mapped for reading.
  std::istringstream maps(ReadFile("/proc/self/maps"));
  for (std::string line; std::getline(maps, line);) {
    if (line.find(" r-xp ") != std::string::npos && line.find("/libvelmor.so") != std::string::npos) {
      return true;
    }
  }
  return false;
}

std::size_t ThreadCount() {
  return NamesIn("/proc/self/task").size();
}

void AwaitEndOfWorkers() {
  while (ThreadCount() > IDLE_THREADS) {
    std::this_thread::yield();
  }
}

}  // namespace testsupport
