// Questions that winbindd answers.
#include <sys/stat.h>
#include <unistd.h>

#include <ctime>

#include "common/names.h"
#include "common/paths.h"
#include "common/state.h"
#include "plugin/guarded.h"
#include "plugin/helper_client.h"
#include "plugin/result_memory.h"
#include "plugin/slots.h"
#include "plugin/trust_mapping.h"
#include "plugin/winbind.h"

namespace sambaprovider::slots {
namespace {

constexpr time_t kKeytabRest = 24 * 60 * 60;

bool IsDomain(const std::string& asked, const std::string& dnsName, const std::string& netbiosName) {
  return EqualWithoutCase(asked, dnsName) || EqualWithoutCase(asked, netbiosName);
}

State JoinedState() {
  State state = LoadState();
  if (!state.joined) throw Failure(kNoSuchDomain, "the host has joined no domain");
  return state;
}

timespec ChangeTime(const char* path) {
  struct stat file = {};
  return stat(path, &file) == 0 ? file.st_mtim : timespec{};
}

bool IsNewer(const timespec& left, const timespec& right) {
  return left.tv_sec != right.tv_sec ? left.tv_sec > right.tv_sec : left.tv_nsec > right.tv_nsec;
}

// Somebody may have changed the machine's password without thinking of the keytab: Samba's secrets are then
// newer than the keytab. Once a day the helper looks in any case, since the password has to be changed in
// time.
bool KeytabNeedsALook() {
  const timespec keytab = ChangeTime(paths::kKeytab);
  return IsNewer(ChangeTime(paths::kSecrets), keytab) || time(nullptr) - keytab.tv_sec > kKeytabRest;
}

void KeepKeytabInStep() {
  if (geteuid() != 0 || !KeytabNeedsALook()) return;
  // A failure is in the record of attempts; the trust itself is healthy.
  Guarded([] {
    Request request;
    request.fields = {{"operation", "refresh"}};
    RunHelper(std::move(request));
  });
}

TrustState AskTrustState() {
  const State state = LoadState();
  if (!state.joined) return TRUST_STATE_NOT_JOINED;
  const winbind::TrustCheck check = winbind::CheckTrust(state.netbiosDomain);
  const bool unavailable = check.error == WBC_ERR_WINBIND_NOT_AVAILABLE;
  const TrustState result = TrustStateOf(check, unavailable && winbind::Answers());
  if (result == TRUST_STATE_HEALTHY) KeepKeytabInStep();
  return result;
}

TrustRelationship AskRelationship(const std::string& asked) {
  const State state = LoadState();
  if (!state.joined) return TRUST_RELATIONSHIP_NONE;
  if (IsDomain(asked, state.dnsDomain, state.netbiosDomain)) return TRUST_RELATIONSHIP_SAME_DOMAIN;
  for (const winbind::TrustedDomain& domain : winbind::ListDomains()) {
    if (IsDomain(asked, domain.dnsName, domain.netbiosName)) return RelationshipOf(domain.flags);
  }
  return TRUST_RELATIONSHIP_NONE;
}

// winbindd looks a controller up by the domain's DNS name; by the short one it only remembers it.
std::string DnsNameOf(const State& state, const std::string& asked) {
  if (asked.empty() || IsDomain(asked, state.dnsDomain, state.netbiosDomain)) return state.dnsDomain;
  if (asked.find('.') != std::string::npos) return asked;
  for (const winbind::TrustedDomain& domain : winbind::ListDomains()) {
    if (EqualWithoutCase(asked, domain.netbiosName)) return domain.dnsName;
  }
  throw Failure(kNoSuchDomain, "there is no domain " + asked);
}

}  // namespace

TrustState GetDomainTrustState(void) {
  TrustState result = TRUST_STATE_BROKEN;
  Guarded([&] { result = AskTrustState(); });
  return result;
}

TrustRelationship GetDomainTrustRelationship(const char* domain) {
  TrustRelationship result = TRUST_RELATIONSHIP_UNKNOWN;
  Guarded([&] { result = AskRelationship(WithoutTrailingDot(domain == nullptr ? "" : domain)); });
  return result;
}

uint32_t GetTrustedDomains(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
  return Guarded([&] {
    const State state = LoadState();
    std::vector<DomainNames> trusted;
    if (state.joined) {
      for (const winbind::TrustedDomain& domain : winbind::ListDomains()) {
        if (IsDomain(domain.netbiosName, state.dnsDomain, state.netbiosDomain)) continue;
        trusted.push_back({domain.dnsName, domain.netbiosName});
      }
    }
    *release = ReleaseResult;
    *domains = CopyForCaller(trusted);
  });
}

uint32_t GetAnyDomainController(const char* qualifier, const char* domain, char** text,
                                ActiveDirectoryFree* release) {
  return Guarded([&] {
    const std::string asked = WithoutTrailingDot(domain == nullptr ? "" : domain);
    const std::string name = DnsNameOf(JoinedState(), asked);
    *release = ReleaseResult;
    *text = CopyForCaller(winbind::FindController(name, qualifier == nullptr ? "" : qualifier));
  });
}

uint32_t ConvertCanonicalUsername(const char* name, char** text, ActiveDirectoryFree* release) {
  return Guarded([&] {
    const State state = JoinedState();
    AccountName account = SplitAccountName(name == nullptr ? "" : name);
    if (account.user.empty()) throw Failure(kInvalidAccountName, "the user name is empty");
    if (account.domain.empty()) account.domain = state.netbiosDomain;
    *release = ReleaseResult;
    *text = CopyForCaller(winbind::CanonicalName(account));
  });
}

}  // namespace sambaprovider::slots
