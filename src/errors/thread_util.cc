#include "authentication/thread_util.h"

#include <pthread.h>

#include <memory>
#include <utility>

#include "authentication/library_exceptions.h"
#include "errors/library_pin.h"
#include "errors/scheduler_hook.h"
#include "errors/thread_error.h"

namespace quenix::authentication {

namespace {

struct Worker {
  std::function<void()> work;
  LibraryPin pin;
};

extern "C" void* RunWorker(void* argument) {
  const std::unique_ptr<Worker> worker(static_cast<Worker*>(argument));
  worker->pin.ReleaseAtThreadEnd();
  worker->work();
  return nullptr;
}

}  // namespace

void VelmorThreadUtil::SetScheduler(std::function<void(std::function<void()>)> scheduler) {
  schedulerHook = std::move(scheduler);
}

void VelmorThreadUtil::ScheduleFunctor(std::function<void()> work) {
  if (schedulerHook) {
    schedulerHook(std::move(work));
    return;
  }
  auto worker = std::make_unique<Worker>();
  worker->work = std::move(work);
  pthread_t thread{};
  const int result = pthread_create(&thread, nullptr, &RunWorker, worker.get());
  if (result != 0) throw ThreadErrorException(ThreadErrorDetail("pthread_create failed. RC=", result));
  static_cast<void>(worker.release());  // the thread owns it now
  pthread_detach(thread);
}

}  // namespace quenix::authentication
