/// Functions of libc whose calls a test can watch or answer itself.
///
/// The test program defines and exports them, so the calls of the shared library, of plug-ins and of the test
/// itself all come here. As long as no test takes a call over, it goes to the real function.
#ifndef SUPPORT_INTERPOSE_H
#define SUPPORT_INTERPOSE_H

#include <netdb.h>
#include <pthread.h>
#include <sched.h>
#include <sys/stat.h>
#include <sys/types.h>

#include <atomic>
#include <functional>
#include <utility>

namespace testsupport {

void* FindRealFunction(const char* name);

/// One interposed function. Usable before main() and from every thread.
template <class Signature>
class Interposed;

template <class Result, class... Arguments>
class Interposed<Result(Arguments...)> {
 public:
  using Handler = std::function<Result(Arguments...)>;

  constexpr explicit Interposed(const char* name) : name_(name) {}

  /// The real function.
  Result Real(Arguments... arguments) {
    using Function = Result (*)(Arguments...);
    void* function = real_.load(std::memory_order_acquire);
    if (function == nullptr) {
      function = FindRealFunction(name_);
      real_.store(function, std::memory_order_release);
    }
    return reinterpret_cast<Function>(function)(arguments...);
  }

  /// What the interposed function runs.
  Result Call(Arguments... arguments) {
    ++threadsInHandler_;
    const Handler* handler = handler_.load();
    if (handler == nullptr) {
      --threadsInHandler_;
      return Real(arguments...);
    }
    struct Leave {
      std::atomic<int>& threads;
      ~Leave() { --threads; }
    } const leave{threadsInHandler_};
    return (*handler)(arguments...);
  }

  bool IsTakenOver() const { return handler_.load() != nullptr; }

  /// Null gives the function back, and waits until every thread has left the handler.
  void Use(const Handler* handler) {
    handler_.store(handler);
    while (handler == nullptr && threadsInHandler_.load() != 0) {
      sched_yield();
    }
  }

 private:
  const char* name_;
  std::atomic<void*> real_{nullptr};
  std::atomic<const Handler*> handler_{nullptr};
  std::atomic<int> threadsInHandler_{0};
};

/// Takes a function over until the end of the scope, which waits for the threads that are in the handler. The
/// handler may call Real() of the same function.
template <class Signature>
class TakeOver {
 public:
  TakeOver(Interposed<Signature>& function, typename Interposed<Signature>::Handler handler)
      : function_(function), handler_(std::move(handler)) {
    function_.Use(&handler_);
  }
  TakeOver(const TakeOver&) = delete;
  TakeOver& operator=(const TakeOver&) = delete;
  ~TakeOver() { function_.Use(nullptr); }

 private:
  Interposed<Signature>& function_;
  typename Interposed<Signature>::Handler handler_;
};

namespace calls {

extern Interposed<int(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*)> pthreadCreate;
extern Interposed<int(pthread_t)> pthreadDetach;
extern Interposed<int(pthread_cond_t*, pthread_mutex_t*, const timespec*)> pthreadCondTimedwait;
extern Interposed<int(char*, std::size_t)> gethostname;
extern Interposed<int(const char*, hostent*, char*, std::size_t, hostent**, int*)> gethostbynameR;
extern Interposed<hostent*(const char*)> gethostbyname;
extern Interposed<int(const char*, struct stat*)> stat;
/// Calls of renameat() come here too, with whole paths, while a test has taken it over.
extern Interposed<int(const char*, const char*)> rename;
extern Interposed<int(const char*, mode_t)> chmod;
extern Interposed<int(int, uid_t, gid_t)> fchown;
extern Interposed<int(char*)> mkstemp;
extern Interposed<int(int)> fsync;
extern Interposed<void*(const char*, int)> dlopen;
extern Interposed<int(void*)> dlclose;
extern Interposed<char*()> dlerror;

}  // namespace calls
}  // namespace testsupport

#endif  // SUPPORT_INTERPOSE_H
