#include "plugin/winbind.h"

#include <algorithm>
#include <chrono>
#include <memory>
#include <new>
#include <thread>

#include "common/status.h"
#include "plugin/signal_guard.h"

namespace sambaprovider::winbind {
namespace {

// How long winbindd may take, after it has started, to ask a controller for the trusted domains.
constexpr std::chrono::seconds kLearningTime{3};
constexpr std::chrono::milliseconds kLearningPause{100};

// One connection, with SIGPIPE kept away while it is used and closed.
class Connection {
 public:
  Connection() : context_(wbcCtxCreate()) {
    if (context_ == nullptr) throw std::bad_alloc();
  }
  Connection(const Connection&) = delete;
  Connection& operator=(const Connection&) = delete;
  ~Connection() { wbcCtxFree(context_); }

  wbcContext* Get() const { return context_; }

 private:
  SigpipeGuard guard_;
  wbcContext* context_;
};

struct Release {
  void operator()(void* memory) const { wbcFreeMemory(memory); }
};
template <typename Type>
using Result = std::unique_ptr<Type, Release>;

// `notFound` is the status for a name that winbindd does not know.
void Check(wbcErr error, Status notFound, const std::string& subject) {
  switch (error) {
    case WBC_ERR_SUCCESS:
      return;
    case WBC_ERR_NO_MEMORY:
      throw std::bad_alloc();
    case WBC_ERR_DOMAIN_NOT_FOUND:
    case WBC_ERR_UNKNOWN_USER:
    case WBC_ERR_UNKNOWN_GROUP:
    case WBC_ERR_INVALID_SID:
      throw Failure(notFound, "winbindd does not know " + subject);
    case WBC_ERR_WINBIND_NOT_AVAILABLE:
      if (Answers()) throw Failure(kNoLogonServers, "winbindd has no answer about " + subject);
      throw Failure(kServiceNotActive, "winbindd does not run");
    default:
      throw Failure(kInternalError, std::string("winbindd: ") + wbcErrorString(error));
  }
}

std::string TextOf(const char* text) {
  return text == nullptr ? "" : text;
}

std::vector<TrustedDomain> ListKnownDomains() {
  const Connection connection;
  struct wbcDomainInfo* raw = nullptr;
  size_t count = 0;
  Check(wbcCtxListTrusts(connection.Get(), &raw, &count), kNoSuchDomain, "the trusted domains");
  const Result<struct wbcDomainInfo> domains(raw);
  std::vector<TrustedDomain> list;
  for (size_t index = 0; index < count; ++index) {
    const struct wbcDomainInfo& domain = raw[index];
    if (domain.trust_type == WBC_DOMINFO_TRUSTTYPE_LOCAL) continue;
    list.push_back({TextOf(domain.dns_name), TextOf(domain.short_name), domain.trust_flags,
                    (domain.domain_flags & WBC_DOMINFO_DOMAIN_OFFLINE) == 0});
  }
  return list;
}

}  // namespace

bool IsBeforeLearning(const std::vector<TrustedDomain>& domains) {
  // Of the joined domain, the only one that it has from smb.conf, it assumes a direction until it has asked.
  return domains.size() == 1 &&
         (!domains.front().online || (domains.front().flags & WBC_DOMINFO_TRUST_OUTGOING) != 0);
}

bool Answers() {
  const Connection connection;
  return wbcCtxPing(connection.Get()) == WBC_ERR_SUCCESS;
}

TrustCheck CheckTrust(const std::string& netbiosDomain) {
  const Connection connection;
  TrustCheck check;
  wbcAuthErrorInfo* raw = nullptr;
  check.error = wbcCtxCheckTrustCredentials(connection.Get(), netbiosDomain.c_str(), &raw);
  const Result<wbcAuthErrorInfo> information(raw);
  if (information != nullptr) check.ntStatus = information->nt_status;
  return check;
}

std::vector<TrustedDomain> ListDomains() {
  const auto deadline = std::chrono::steady_clock::now() + kLearningTime;
  for (;;) {
    std::vector<TrustedDomain> domains = ListKnownDomains();
    if (!IsBeforeLearning(domains)) return domains;
    if (std::chrono::steady_clock::now() >= deadline) {
      throw Failure(kNoLogonServers, "winbindd has heard of the trusted domains from no controller yet");
    }
    std::this_thread::sleep_for(kLearningPause);
  }
}

std::string FindController(const std::string& dnsDomain, const std::string& site) {
  const Connection connection;
  wbcDomainControllerInfoEx* raw = nullptr;
  Check(wbcCtxLookupDomainControllerEx(connection.Get(), dnsDomain.c_str(), nullptr,
                                       site.empty() ? nullptr : site.c_str(),
                                       WBC_LOOKUP_DC_DS_REQUIRED | WBC_LOOKUP_DC_RETURN_DNS_NAME, &raw),
        kNoSuchDomain, dnsDomain);
  const Result<wbcDomainControllerInfoEx> controller(raw);
  const std::string name = TextOf(raw->dc_unc);
  return name.substr(std::min(name.find_first_not_of('\\'), name.size()));
}

std::string CanonicalName(const AccountName& account) {
  const Connection connection;
  wbcDomainSid sid = {};
  wbcSidType type = WBC_SID_NAME_USE_NONE;
  Check(wbcCtxLookupName(connection.Get(), account.domain.c_str(), account.user.c_str(), &sid, &type),
        kNoSuchUser, "the account");
  char* rawDomain = nullptr;
  char* rawName = nullptr;
  Check(wbcCtxLookupSid(connection.Get(), &sid, &rawDomain, &rawName, &type), kNoSuchUser, "the account");
  const Result<char> domain(rawDomain);
  const Result<char> name(rawName);
  return TextOf(rawDomain) + "\\" + TextOf(rawName);
}

}  // namespace sambaprovider::winbind
