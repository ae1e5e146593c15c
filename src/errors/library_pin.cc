#include "errors/library_pin.h"

#include <dlfcn.h>

#include <utility>

namespace quenix::authentication {

namespace {

void* ReferenceToThisLibrary() noexcept {
  Dl_info location{};
  if (dladdr(&threadEndKey, &location) == 0) return nullptr;
  return dlopen(location.dli_fname, RTLD_LAZY | RTLD_NOLOAD);
}

}  // namespace

LibraryPin::LibraryPin() noexcept : library_(ReferenceToThisLibrary()) {}

LibraryPin::~LibraryPin() {
  if (library_ != nullptr) dlclose(library_);
}

void LibraryPin::ReleaseAtThreadEnd() noexcept {
  // When this fails the reference is never dropped: the library then stays loaded, which is safe.
  pthread_setspecific(threadEndKey.Native(), std::exchange(library_, nullptr));
}

ThreadEndKey::ThreadEndKey() noexcept {
  // dlclose() itself is the destructor, since a function of this library would still run when its code goes.
  // Its result is lost, which the calling conventions allow.
  pthread_key_create(&key_, reinterpret_cast<void (*)(void*)>(reinterpret_cast<void (*)()>(&dlclose)));
}

ThreadEndKey::~ThreadEndKey() {
  pthread_key_delete(key_);
}

}  // namespace quenix::authentication
