// Questions that the state file answers, and the lists that are kept there: none of them needs the network,
// but for setting the preferred controllers on a member and for an account's name that is not known yet.
#include "common/names.h"
#include "common/operation_lock.h"
#include "common/state.h"
#include "plugin/guarded.h"
#include "plugin/helper_client.h"
#include "plugin/result_memory.h"
#include "plugin/slots.h"

namespace sambaprovider::slots {
namespace {

std::vector<std::string> List(const char* const* names) {
  std::vector<std::string> list;
  while (names != nullptr && *names != nullptr) list.emplace_back(*names++);
  return list;
}

void Return(const std::string& value, char** text, ActiveDirectoryFree* release) {
  *release = ReleaseResult;
  *text = CopyForCaller(value);
}

void Return(const std::vector<std::string>& values, char*** names, ActiveDirectoryFree* release) {
  *release = ReleaseResult;
  *names = CopyForCaller(values);
}

// After a join without network the account's name has to be asked for. While nobody answers it is not known,
// which must not keep the caller from the rest of the store's configuration; the record has the reason.
std::string MachineAccountDn() {
  const State state = LoadState();
  if (!state.joined || !state.machineAccountDn.empty()) return state.machineAccountDn;
  Guarded([] {
    Request request;
    request.fields = {{"operation", "refresh"}};
    RunHelper(std::move(request));
  });
  return LoadState().machineAccountDn;
}

}  // namespace

uint32_t GetActiveDomain(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
  return Guarded([&] {
    const State state = LoadState();
    *release = ReleaseResult;
    if (!state.joined) return;
    char* const dnsName = CopyForCaller(state.dnsDomain);
    try {
      domain->netbiosName = CopyForCaller(state.netbiosDomain);
    } catch (...) {
      ReleaseResult(dnsName);
      throw;
    }
    domain->dnsName = dnsName;
  });
}

uint32_t GetMachineAccountDN(char** text, ActiveDirectoryFree* release) {
  return Guarded([&] { Return(MachineAccountDn(), text, release); });
}

uint32_t GetHostPrincipalForDomain(const char* domain, char** text, ActiveDirectoryFree* release) {
  return Guarded([&] {
    const State state = LoadState();
    const std::string asked = WithoutTrailingDot(domain == nullptr ? "" : domain);
    const bool ours = state.joined && (asked.empty() || EqualWithoutCase(asked, state.dnsDomain) ||
                                       EqualWithoutCase(asked, state.netbiosDomain));
    if (!ours) throw Failure(kNoSuchDomain, "the host has not joined that domain");
    Return("HOST/" + HostDnsName(state.hostName, state.dnsDomain) + "@" + UpperCase(state.dnsDomain), text,
           release);
  });
}

uint32_t SetPreferredDomainControllers(const char* const* names) {
  return Guarded([&] {
    Request request;
    request.fields = {{"operation", "prefer"}, {"names", List(names)}};
    RunHelper(std::move(request));
  });
}

uint32_t GetPreferredDomainControllers(char*** names, ActiveDirectoryFree* release) {
  return Guarded([&] { Return(LoadState().preferredDomainControllers, names, release); });
}

uint32_t SetSmartCardEnabledServices(const char* const* names) {
  return Guarded([&] {
    const OperationLock lock;
    State state = LoadState();
    state.smartCardEnabledServices = List(names);
    SaveState(state);
  });
}

uint32_t GetSmartCardEnabledServices(char*** names, ActiveDirectoryFree* release) {
  return Guarded([&] { Return(LoadState().smartCardEnabledServices, names, release); });
}

}  // namespace sambaprovider::slots
