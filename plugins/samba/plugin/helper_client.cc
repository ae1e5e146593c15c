#include "plugin/helper_client.h"

#include <unistd.h>

#include <mutex>

#include "common/attempt_log.h"
#include "common/paths.h"
#include "common/settings.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr std::chrono::seconds kRecoveryTime{60};

// Long enough for a keytab that is being made anew, which nobody asked for, to be finished.
constexpr std::chrono::seconds kPatience{3};

std::timed_mutex oneOperation;

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
  const std::unique_lock<std::timed_mutex> lock(oneOperation, kPatience);
  if (!lock.owns_lock()) throw Failure(kBusy, "this process has another join, leave or change running");
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
