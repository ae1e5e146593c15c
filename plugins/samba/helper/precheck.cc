#include "helper/precheck.h"

#include <array>
#include <chrono>

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
  request.secret = Secret(logon.password.View());
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

// The pre-check does several steps in one go and says at which it stopped.
void RecordSteps(const AttemptLog& log, const Answer& answer) {
  constexpr std::array<const char*, 4> kSteps = {"locate", "password", "clock", "account"};
  const std::string last = answer.fields.value("step", "password");
  for (const char* step : kSteps) {
    if (step == last) {
      log.End(step, StatusIn(answer), answer.fields["text"].get<std::string>());
      return;
    }
    log.End(step, kSuccess, "fine");
  }
}

}  // namespace

Inspection Inspect(const AttemptLog& log, const LogonRequest& request,
                   const std::string& organizationalUnit) {
  log.Begin("password", "asking a controller of " + request.dnsDomain +
                            " whether it accepts the password of " + request.user);
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

void RemoveAccount(const LogonRequest& request) {
  RequireSuccess(AskPrecheck("remove", request,
                             {{"computerDnsName", HostDnsName(request.computer, request.dnsDomain)}}));
}

}  // namespace sambaprovider
