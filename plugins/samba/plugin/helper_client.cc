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

std::mutex oneOperation;

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

void RunAlone(Request& request, const AttemptLog& log) {
  const Settings settings = LoadSettings();
  const Answer answer = AskHelper(request, settings.operationTimeout);
  if (answer.end == Conversation::End::kAnswered) {
    const auto status = answer.fields["status"].get<uint32_t>();
    if (status != kSuccess) throw Failure(status, answer.fields["text"].get<std::string>());
    return;
  }
  const bool late = answer.end == Conversation::End::kDeadline;
  const Failure failure =
      late ? Failure(kTimedOut,
                     "not done after " + std::to_string(settings.operationTimeout.count()) + " seconds")
           : Failure(kHelperDied, "the helper died");
  log.Note("undo", failure.what());
  Recover(request, log);
  log.End("result", failure.Code(), failure.what());
  throw failure;
}

}  // namespace

void RunHelper(Request request) {
  request.fields["process"] = getpid();
  const AttemptLog log(getpid(), request.Text("operation"));
  const std::unique_lock<std::mutex> lock(oneOperation, std::try_to_lock);
  if (!lock.owns_lock()) {
    const Failure failure(kBusy, "this process has another join, leave or change running");
    log.End("result", failure.Code(), failure.what());
    throw failure;
  }
  RunAlone(request, log);
}

}  // namespace sambaprovider
