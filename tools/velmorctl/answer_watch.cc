#include "answer_watch.h"

#include <condition_variable>
#include <mutex>
#include <thread>

#include "authentication/thread_util.h"

namespace velmorctl {

namespace {

/// One piece of work on its thread.
struct Work {
  std::chrono::steady_clock::time_point started;
  bool ended = false;
};

/// What the threads and the asking thread share. It is never destroyed, since a thread may outlast main().
struct Notes {
  std::mutex mutex;
  std::condition_variable workEnded;
  int running = 0;
  std::shared_ptr<Work> latest;
};

Notes& SharedNotes() {
  static Notes* notes = new Notes;
  return *notes;
}

/// How long a thread that has finished its request may take to say so, on a machine with other things to do.
constexpr std::chrono::seconds patience{10};

void RunWork(std::function<void()> function, const std::shared_ptr<Work>& work) {
  try {
    function();
  } catch (...) {
    // The library has failed the request already; it throws on only to tell a thread's owner of a plug-in
    // that broke its contract, and the caller hears of that from the request.
  }
  function = nullptr;
  Notes& notes = SharedNotes();
  std::lock_guard lock(notes.mutex);
  work->ended = true;
  --notes.running;
  notes.workEnded.notify_all();
}

}  // namespace

AnswerWatch::AnswerWatch(std::chrono::seconds timeout) : timeout_(timeout) {
  quenix::authentication::VelmorThreadUtil::SetScheduler(Schedule);
}

AnswerWatch::~AnswerWatch() {
  quenix::authentication::VelmorThreadUtil::SetScheduler({});
}

void AnswerWatch::Schedule(std::function<void()> function) {
  auto work = std::make_shared<Work>();
  work->started = std::chrono::steady_clock::now();
  Notes& notes = SharedNotes();
  std::lock_guard lock(notes.mutex);
  std::thread(RunWork, std::move(function), work).detach();
  ++notes.running;
  notes.latest = work;
}

void AnswerWatch::Begin() {
  Notes& notes = SharedNotes();
  std::lock_guard lock(notes.mutex);
  notes.latest.reset();
  begun_ = std::chrono::steady_clock::now();
}

bool AnswerWatch::WasLive() const {
  auto now = std::chrono::steady_clock::now();
  Notes& notes = SharedNotes();
  std::unique_lock lock(notes.mutex);
  // A question's own work is the last that it started: the trust state asks for the trusted domains first.
  const std::shared_ptr<Work> work = notes.latest;
  if (!work) {
    // It joined work that an earlier question had started.
    return now - begun_ < timeout_;
  }
  if (now - work->started >= timeout_) {
    return work->ended;
  }
  // The wait did not run out, so the request is complete and its thread about to end.
  return notes.workEnded.wait_for(lock, patience, [&work] { return work->ended; });
}

bool AnswerWatch::WorkRuns() {
  Notes& notes = SharedNotes();
  std::lock_guard lock(notes.mutex);
  return notes.running > 0;
}

}  // namespace velmorctl
