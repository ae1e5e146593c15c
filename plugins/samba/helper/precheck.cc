#include "helper/precheck.h"

#include <chrono>
#include <utility>

#include "common/message.h"
#include "common/names.h"
#include "common/paths.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

// Longer than its own time-outs take for the controllers that it tries.
constexpr std::chrono::seconds kLimit{40};

Answer AskPrecheck(const char* operation, const LogonRequest& logon, const nlohmann::json& more) {
  Request request;
  request.fields = {{"operation", operation},
                    {"dnsDomain", logon.dnsDomain},
                    {"controllers", logon.controllers},
                    {"user", logon.user},
                    {"computer", logon.computer}};
  request.fields.update(more);
  request.secret = velmor::Secret(logon.password.View());
  Answer answer = Ask(paths::kPrecheck, ChildGroup::kCallers, ChildEnvironment::kCallers, request, kLimit);
  if (answer.end == Conversation::End::kAnswered) return answer;
  const bool late = answer.end == Conversation::End::kDeadline;
  answer.fields = {{"status", late ? kNoLogonServers : kHelperDied},
                   {"text", late ? "the controller did not finish answering in time" : "the pre-check died"}};
  return answer;
}

uint32_t StatusIn(const Answer& answer) {
  return answer.fields["status"].get<uint32_t>();
}

void RequireSuccess(const Answer& answer) {
  if (StatusIn(answer) != kSuccess) throw Failure(StatusIn(answer), answer.fields["text"].get<std::string>());
}

// The pre-check does several steps in one go and says how far it got.
void RecordSteps(const AttemptLog& log, const Answer& answer) {
  using Steps = std::vector<std::pair<std::string, std::string>>;
  for (const auto& [step, text] : answer.fields.value("done", Steps())) log.End(step, kSuccess, text);
  if (StatusIn(answer) == kSuccess) return;
  log.End(answer.fields.value("step", "connect"), StatusIn(answer), answer.fields["text"].get<std::string>());
}

}  // namespace

Inspection Inspect(const AttemptLog& log, const LogonRequest& request,
                   const std::string& organizationalUnit) {
  log.Begin("connect", "trying the password of " + request.user + " at a controller of " + request.dnsDomain);
  const Answer answer = AskPrecheck("inspect", request, {{"organizationalUnit", organizationalUnit}});
  RecordSteps(log, answer);
  RequireSuccess(answer);
  Inspection result;
  result.controller = answer.fields.value("controller", "");
  result.netbiosDomain = answer.fields.value("netbiosDomain", "");
  result.organizationalUnitDn = answer.fields.value("organizationalUnitDn", "");
  result.accountDn = answer.fields.value("accountDn", "");
  result.accountHostName = answer.fields.value("accountHostName", "");
  if (!IsNetbiosName(result.netbiosDomain)) {
    throw Failure(kInvalidDomainName,
                  "the directory gives an impossible NetBIOS name for " + request.dnsDomain);
  }
  return result;
}

std::string FindAccountDn(const LogonRequest& request) {
  const Answer answer = AskPrecheck("inspect", request, nlohmann::json::object());
  RequireSuccess(answer);
  return answer.fields.value("accountDn", "");
}

std::string RemoveAccount(const LogonRequest& request) {
  const Answer answer =
      AskPrecheck("remove", request, {{"computerDnsName", HostDnsName(request.computer, request.dnsDomain)}});
  RequireSuccess(answer);
  return answer.fields["text"].get<std::string>();
}

}  // namespace sambaprovider
