#include "helper/preferred_controllers.h"

#include "common/names.h"
#include "common/smb_conf.h"
#include "common/status.h"
#include "helper/journal.h"
#include "helper/operations.h"
#include "helper/winbind_service.h"

namespace sambaprovider {

void ApplyPreferredControllers(const State& state, const Settings& settings) {
  if (!state.joined) return;
  RequireSmbConfIsReplaceable();
  winbind_service::Stop();
  WriteSmbConf(FormatSmbConf(state, settings, KeytabUse::kKept));
  ForgetUsedControllers(state);
  winbind_service::Start();
}

void ForgetUsedControllers(const State& state) {
  winbind_service::FlushCache();
  if (state.preferredDomainControllers.empty()) return;
  winbind_service::BeginWith(state.preferredDomainControllers.front(),
                             {state.netbiosDomain, state.dnsDomain});
}

std::string PreferControllers(const Call& call) {
  State state = LoadState();
  call.log.Run("check", "checking names and smb.conf", [&] {
    state.preferredDomainControllers = call.request.fields.at("names").get<std::vector<std::string>>();
    for (const std::string& name : state.preferredDomainControllers) {
      if (!IsControllerName(name))
        throw Failure(kInvalidParameter, "'" + name + "' cannot be a controller's name");
    }
    if (state.joined) RequireSmbConfIsReplaceable();
    return "fine";
  });
  SaveJournal({Journal::Operation::kPrefer, state.dnsDomain, state.netbiosDomain, state.hostName, ""});
  call.log.Run("state", "remembering the preferred controllers", [&] {
    SaveState(state);
    return "remembered";
  });
  call.log.Run("service", "having winbindd begin anew with them", [&] {
    ApplyPreferredControllers(state, call.settings);
    return state.joined ? "winbindd runs" : "the host has joined no domain, so nothing is to do";
  });
  RemoveJournal();
  return std::to_string(state.preferredDomainControllers.size()) + " controllers are preferred";
}

}  // namespace sambaprovider
