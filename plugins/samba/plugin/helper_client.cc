#include "plugin/helper_client.h"

#include <unistd.h>

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <new>

#include "common/attempt_log.h"
#include "common/paths.h"
#include "common/settings.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr std::chrono::seconds kRecoveryTime{60};

// Long enough for a keytab that is being made anew, which nobody asked for, to be finished.
constexpr std::chrono::seconds kPatience{3};

// Lets one operation at a time pass. Not a timed mutex, whose waiting ThreadSanitizer does not see.
class Turnstile {
 public:
  bool Enter(std::chrono::milliseconds patience) {
    std::unique_lock<std::mutex> lock(mutex_);
    if (!freed_.wait_for(lock, patience, [this] { return !taken_; })) return false;
    taken_ = true;
    return true;
  }

  void Leave() {
    const std::lock_guard<std::mutex> lock(mutex_);
    taken_ = false;
    freed_.notify_one();
  }

 private:
  std::mutex mutex_;
  std::condition_variable freed_;
  bool taken_ = false;
};

// Never destroyed, so that a process may end while a thread waits; it holds nothing that would be leaked.
Turnstile& TheTurnstile() {
  alignas(Turnstile) static std::byte memory[sizeof(Turnstile)];
  static Turnstile* const turnstile = new (memory) Turnstile;
  return *turnstile;
}

// Throws Failure (kBusy) when another operation does not end in time.
class Turn {
 public:
  Turn() {
    if (!TheTurnstile().Enter(kPatience)) {
      throw Failure(kBusy, "this process has another join, leave or change running");
    }
  }
  Turn(const Turn&) = delete;
  Turn& operator=(const Turn&) = delete;
  ~Turn() { TheTurnstile().Leave(); }
};

Answer AskHelper(const Request& request, std::chrono::milliseconds limit) {
  return Ask(paths::kHelper, ChildGroup::kOwn, ChildEnvironment::kMinimal, request, limit);
}

// The fields of the failed operation stay, so that a join's account can remove what the join made.
void Recover(Request& request, const AttemptLog& log) {
  request.fields["operation"] = "recover";
  const Answer answer = AskHelper(request, kRecoveryTime);
  if (answer.end == Conversation::End::kAnswered) return;
  log.Note("undo", "what was left could not be put right; the next operation tries again");
}

// Returns the helper's answer; throws when there is none.
Answer AskAlone(Request& request, const AttemptLog& log) {
  const Turn turn;
  const std::chrono::seconds limit = LoadSettings().operationTimeout;
  Answer answer = AskHelper(request, limit);
  if (answer.end == Conversation::End::kAnswered) return answer;
  const bool late = answer.end == Conversation::End::kDeadline;
  log.Note("undo", late ? "the helper was ended at the deadline" : "the helper died");
  Recover(request, log);
  if (!late) throw Failure(kHelperDied, "the helper died");
  throw Failure(kTimedOut, "not done after " + std::to_string(limit.count()) + " seconds");
}

}  // namespace

void RunHelper(Request request) {
  request.fields["process"] = getpid();
  const AttemptLog log(getpid(), request.Text("operation"));
  Answer answer;
  try {
    answer = AskAlone(request, log);
  } catch (const Failure& failure) {
    // What the helper answers it has recorded itself.
    log.End("result", failure.Code(), failure.what());
    throw;
  }
  const auto status = answer.fields["status"].get<uint32_t>();
  if (status != kSuccess) throw Failure(status, answer.fields["text"].get<std::string>());
}

}  // namespace sambaprovider
