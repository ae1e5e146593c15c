#include "support/interpose.h"

#include <dlfcn.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>

#define INTERPOSED extern "C" __attribute__((visibility("default")))

namespace testsupport {

namespace {

void* FindInNextObject(const char* name) {
  void* function = dlsym(RTLD_NEXT, name);
  if (function == nullptr) {
    std::abort();
  }
  return function;
}

/// Held around the loader's own lock, which ThreadSanitizer does not see; recursive, as that is.
pthread_mutex_t loaderMutex = PTHREAD_RECURSIVE_MUTEX_INITIALIZER_NP;

template <class Result, class... Arguments>
Result CallLoader(const char* name, Arguments... arguments) {
  const auto function = reinterpret_cast<Result (*)(Arguments...)>(FindInNextObject(name));
  pthread_mutex_lock(&loaderMutex);
  const Result result = function(arguments...);
  pthread_mutex_unlock(&loaderMutex);
  return result;
}

/// The whole path of what is called `name` in the open folder.
std::string PathIn(int folder, const std::string& name) {
  std::error_code error;
  const auto path = std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(folder), error);
  return error ? name : (path / name).string();
}

void* RealDlopen(const char* path, int flags) {
  return CallLoader<void*>("dlopen", path, flags);
}

int RealDlclose(void* handle) {
  return CallLoader<int>("dlclose", handle);
}

}  // namespace

void* FindRealFunction(const char* name) {
  if (std::strcmp(name, "dlopen") == 0) {
    return reinterpret_cast<void*>(&RealDlopen);
  }
  if (std::strcmp(name, "dlclose") == 0) {
    return reinterpret_cast<void*>(&RealDlclose);
  }
  return FindInNextObject(name);
}

namespace calls {

constinit Interposed<int(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*)> pthreadCreate(
    "pthread_create");
constinit Interposed<int(pthread_t)> pthreadDetach("pthread_detach");
constinit Interposed<int(pthread_cond_t*, pthread_mutex_t*, const timespec*)> pthreadCondTimedwait(
    "pthread_cond_timedwait");
constinit Interposed<int(char*, std::size_t)> gethostname("gethostname");
constinit Interposed<int(const char*, hostent*, char*, std::size_t, hostent**, int*)> gethostbynameR(
    "gethostbyname_r");
constinit Interposed<hostent*(const char*)> gethostbyname("gethostbyname");
constinit Interposed<int(const char*, struct stat*)> stat("stat");
constinit Interposed<int(const char*, const char*)> rename("rename");
constinit Interposed<int(const char*, mode_t)> chmod("chmod");
constinit Interposed<int(int, uid_t, gid_t)> fchown("fchown");
constinit Interposed<int(char*)> mkstemp("mkstemp");
constinit Interposed<int(int)> fsync("fsync");
constinit Interposed<void*(const char*, int)> dlopen("dlopen");
constinit Interposed<int(void*)> dlclose("dlclose");
constinit Interposed<char*()> dlerror("dlerror");

}  // namespace calls
}  // namespace testsupport

namespace calls = testsupport::calls;

INTERPOSED int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*start)(void*),
                              void* argument) noexcept {
  return calls::pthreadCreate.Call(thread, attributes, start, argument);
}

INTERPOSED int pthread_detach(pthread_t thread) noexcept {
  return calls::pthreadDetach.Call(thread);
}

INTERPOSED int pthread_cond_timedwait(pthread_cond_t* condition, pthread_mutex_t* mutex,
                                      const timespec* deadline) {
  return calls::pthreadCondTimedwait.Call(condition, mutex, deadline);
}

INTERPOSED int gethostname(char* name, std::size_t length) noexcept {
  return calls::gethostname.Call(name, length);
}

INTERPOSED int gethostbyname_r(const char* name, hostent* result, char* buffer, std::size_t length,
                               hostent** found, int* error) {
  return calls::gethostbynameR.Call(name, result, buffer, length, found, error);
}

INTERPOSED hostent* gethostbyname(const char* name) {
  return calls::gethostbyname.Call(name);
}

INTERPOSED int stat(const char* path, struct stat* status) noexcept {
  return calls::stat.Call(path, status);
}

// On this platform the two are one function under two names.
INTERPOSED int stat64(const char* path, struct stat64* status) noexcept {
  static_assert(sizeof(struct stat) == sizeof(struct stat64));
  return calls::stat.Call(path, reinterpret_cast<struct stat*>(status));
}

INTERPOSED int rename(const char* from, const char* to) noexcept {
  return calls::rename.Call(from, to);
}

INTERPOSED int renameat(int fromFolder, const char* from, int toFolder, const char* to) noexcept {
  if (calls::rename.IsTakenOver()) {
    return calls::rename.Call(testsupport::PathIn(fromFolder, from).c_str(),
                              testsupport::PathIn(toFolder, to).c_str());
  }
  using Function = int (*)(int, const char*, int, const char*);
  static const auto real = reinterpret_cast<Function>(testsupport::FindRealFunction("renameat"));
  return real(fromFolder, from, toFolder, to);
}

INTERPOSED int chmod(const char* path, mode_t mode) noexcept {
  return calls::chmod.Call(path, mode);
}

INTERPOSED int fchown(int file, uid_t owner, gid_t group) noexcept {
  return calls::fchown.Call(file, owner, group);
}

INTERPOSED int mkstemp(char* pattern) {
  return calls::mkstemp.Call(pattern);
}

INTERPOSED int mkstemp64(char* pattern) {
  return calls::mkstemp.Call(pattern);
}

INTERPOSED int fsync(int descriptor) {
  return calls::fsync.Call(descriptor);
}

INTERPOSED void* dlopen(const char* path, int flags) noexcept {
  return calls::dlopen.Call(path, flags);
}

INTERPOSED int dlclose(void* handle) noexcept {
  return calls::dlclose.Call(handle);
}

INTERPOSED char* dlerror() noexcept {
  return calls::dlerror.Call();
}
