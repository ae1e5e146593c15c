// velmor-samba-helper: does what changes the host's membership, away from the process that asked for it.
//
// libnetapi keeps its state in globals, is not safe with threads, and has been seen to crash; the one who
// asks kills this process and its children when it takes too long. Reads one request (common/message.h) with
// "operation" and "process", the id of the asking process, and answers with "status" and "text".
#include <sys/prctl.h>
#include <sys/stat.h>

#include <map>
#include <string>

#include "common/attempt_log.h"
#include "common/message.h"
#include "common/operation_lock.h"
#include "common/settings.h"
#include "common/status.h"
#include "helper/operations.h"

namespace sambaprovider {
namespace {

using Operation = std::string (*)(const Call&);

Operation OperationNamed(const std::string& name) {
  static const std::map<std::string, Operation> kOperations = {
      {"join", Join},       {"join-machine", JoinWithMachineAccount},
      {"leave", Leave},     {"prefer", PreferControllers},
      {"refresh", Refresh}, {"recover", Recover},
  };
  const auto found = kOperations.find(name);
  if (found == kOperations.end()) throw Failure(kInvalidParameter, "there is no operation '" + name + "'");
  return found->second;
}

Outcome Perform(const Request& request, const AttemptLog& log) {
  try {
    const Operation operation = OperationNamed(request.Text("operation"));
    const OperationLock lock;
    AttemptLog::Rotate();
    const Settings settings = LoadSettings();
    const Call call{log, settings, request};
    if (operation != Recover) Recover(call);
    return {kSuccess, operation(call)};
  } catch (const Failure& failure) {
    return {failure.Code(), failure.what()};
  } catch (const std::bad_alloc&) {
    return {kNotEnoughMemory, "there is not enough memory"};
  } catch (const std::exception& error) {
    return {kInternalError, error.what()};
  }
}

Outcome AnswerRequest() {
  try {
    const Request request = ReceiveRequest();
    const AttemptLog log(request.fields.value("process", 0), request.Text("operation"));
    Outcome outcome = Perform(request, log);
    log.End("result", outcome.status, outcome.text);
    return outcome;
  } catch (const Failure& failure) {
    return {failure.Code(), failure.what()};
  }
}

}  // namespace
}  // namespace sambaprovider

int main() {
  // A core file would hold the password.
  prctl(PR_SET_DUMPABLE, 0, 0, 0, 0);
  umask(022);
  const sambaprovider::Outcome outcome = sambaprovider::AnswerRequest();
  sambaprovider::SendAnswer({{"status", outcome.status}, {"text", outcome.text}});
  return 0;
}
