#include "providers/active_directory_provider.h"

#include <syslog.h>

#include <chrono>
#include <sstream>
#include <thread>

#include "authentication/library_exceptions.h"
#include "errors/string_cast.h"
#include "providers/plugin_call.h"

namespace quenix::authentication {

namespace {

constexpr int joinAttempts = 4;
constexpr std::chrono::seconds pauseAfterFailedJoin{30};

/// The statuses of a join that may succeed when it is repeated: a domain controller that has not yet heard of
/// the new account refuses its logon.
bool MayCureItself(std::uint32_t status) {
  return status == 1326 || status == 0xFFFF0000;
}

template <class Join>
void RepeatJoin(Join join) {
  std::uint32_t status = 0;
  for (int attempt = 1; attempt <= joinAttempts; ++attempt) {
    status = join(attempt);
    if (!MayCureItself(status)) break;
    std::this_thread::sleep_for(pauseAfterFailedJoin);
  }
  ThrowUnlessSuccess(status);
}

const void* FindOrThrow(const PluginLibrary& library, const std::string& name, const char* symbol) {
  const void* address = library.Find(symbol);
  if (address == nullptr) throw InvalidActiveDirectoryProviderException(name, PluginLibrary::LoaderText());
  return address;
}

const struct ActiveDirectoryClientMetadata* FindMetadata(const PluginLibrary& library,
                                                         const std::string& name) {
  const auto* metadata = static_cast<const struct ActiveDirectoryClientMetadata*>(
      FindOrThrow(library, name, ACTIVE_DIRECTORY_CLIENT_METADATA_SYMBOL));
  if (metadata->apiVersion > ACTIVE_DIRECTORY_CLIENT_API_VERSION) {
    throw InvalidActiveDirectoryProviderException(
        name, "The API version (" + string_cast<int>(metadata->apiVersion) +
                  ") is not supported by this version of libvelmor");
  }
  return metadata;
}

void AppendWords(const char* text, std::list<std::string>& words) {
  if (text == nullptr) return;
  std::istringstream stream(text);
  for (std::string word; stream >> word;) words.push_back(word);
}

const char* NullWhenEmpty(const std::string& text) {
  return text.empty() ? nullptr : text.c_str();
}

/// The status of a call with an array of pointers into `texts` and a null pointer behind them. The array is
/// gone before anybody looks at the status.
template <class Texts>
std::uint32_t CallWithTexts(ActiveDirectorySetStrings slot, const Texts& texts) {
  std::vector<const char*> pointers;
  pointers.reserve(texts.size() + 1);
  for (const auto& text : texts) pointers.push_back(text.c_str());
  pointers.push_back(nullptr);
  return Implemented(slot)(pointers.data());
}

}  // namespace

ActiveDirectoryProvider::ActiveDirectoryProvider(const std::string& name)
    : library_(name, "Unable to open provider: "),
      metadata_(FindMetadata(library_, name)),
      operations_(static_cast<const struct ActiveDirectoryClientOperations*>(
          FindOrThrow(library_, name, ACTIVE_DIRECTORY_CLIENT_OPERATIONS_SYMBOL))) {
  CacheMetadata();
}

ActiveDirectoryProvider::~ActiveDirectoryProvider() {
  library_.Close();
}

void ActiveDirectoryProvider::CacheMetadata() {
  pamModule_ = metadata_->pamModule;
  AppendWords(metadata_->pamModuleParameters, pamModuleParameters_);
  nssModule_ = metadata_->nssModule;
  AppendWords(metadata_->nssModuleParameters, nssModuleParameters_);
}

int ActiveDirectoryProvider::GetAPIVersion() const {
  return operations_->apiVersion;
}

void ActiveDirectoryProvider::RequireVersion(int version) const {
  if (GetAPIVersion() < version) throw CallNotImplementedException();
}

void ActiveDirectoryProvider::JoinDomain(const std::string& domain, const std::string& organizationalUnit,
                                         const Credentials& credentials) const {
  const auto join = Implemented(operations_->joinDomain);
  RepeatJoin([&](int) { return join(domain.c_str(), NullWhenEmpty(organizationalUnit), &credentials); });
}

void ActiveDirectoryProvider::JoinDomainWithMachineAccount(const CAM::DirectoryDomainInfo& domain,
                                                           const CAM::MachineAccountInfo& account) const {
  RequireVersion(2);
  const auto join = Implemented(operations_->joinDomainWithMachineAccount);
  const ActiveDirectoryDomainInfo domainRecord{domain.domainController.c_str(),
                                               domain.netbiosDomainName.c_str(), domain.dnsDomainName.c_str(),
                                               domain.domainSid.c_str()};
  const ActiveDirectoryMachineAccountInfo accountRecord{
      account.hostName.c_str(), account.dnsDomainName.c_str(), account.organizationalUnit.c_str(),
      account.accountName.c_str(), account.joinBlob.c_str()};
  RepeatJoin([&](int attempt) {
    syslog(LOG_INFO, "Adding host to domain: Attempt (%d/%d)", attempt, joinAttempts);
    return join(&domainRecord, &accountRecord);
  });
}

void ActiveDirectoryProvider::PartDomain() const {
  const Credentials* const noCredentials = nullptr;
  Call(operations_->partDomain, noCredentials);
}

void ActiveDirectoryProvider::PartDomain(const Credentials& credentials) const {
  Call(operations_->partDomain, &credentials);
}

Domain ActiveDirectoryProvider::GetActiveDomain() const {
  ActiveDirectoryDomainPair pair{nullptr, nullptr};
  ActiveDirectoryFree release = nullptr;
  Call(operations_->getActiveDomain, &pair, &release);
  const ReleaseUnlessNull releaseNetbiosName(pair.netbiosName, release);
  const ReleaseUnlessNull releaseDnsName(pair.dnsName, release);
  return Domain(TextOrEmpty(pair.dnsName), TextOrEmpty(pair.netbiosName));
}

void ActiveDirectoryProvider::SetPreferredDomainControllers(
    const std::deque<std::string>& controllers) const {
  ThrowUnlessSuccess(CallWithTexts(operations_->setPreferredDomainControllers, controllers));
}

std::deque<std::string> ActiveDirectoryProvider::GetPreferredDomainControllers() const {
  return CallForArray<std::deque<std::string>, char>(operations_->getPreferredDomainControllers,
                                                     [](const char* name) { return std::string(name); });
}

TrustState ActiveDirectoryProvider::GetDomainTrustState() const {
  return Implemented(operations_->getDomainTrustState)();
}

std::deque<Domain> ActiveDirectoryProvider::GetTrustedDomains() const {
  return CallForArray<std::deque<Domain>, ActiveDirectoryDomainPair>(
      operations_->getTrustedDomains,
      [](const ActiveDirectoryDomainPair* pair) { return Domain(pair->dnsName, pair->netbiosName); });
}

std::string ActiveDirectoryProvider::GetMachineAccountDN() const {
  return CallForString(operations_->getMachineAccountDN);
}

std::string ActiveDirectoryProvider::GetAnyDomainController(const std::string& qualifier,
                                                            const std::string& domain) const {
  return CallForString(operations_->getAnyDomainController, NullWhenEmpty(qualifier), domain.c_str());
}

std::string ActiveDirectoryProvider::ConvertCanonicalUsername(const std::string& name) const {
  return CallForString(operations_->convertCanonicalUsername, name.c_str());
}

std::string ActiveDirectoryProvider::GetHostPrincipalForDomain(const std::string& domain) const {
  RequireVersion(2);
  return CallForString(operations_->getHostPrincipalForDomain, domain.c_str());
}

TrustRelationship ActiveDirectoryProvider::GetDomainTrustRelationship(const std::string& domain) const {
  return Implemented(operations_->getDomainTrustRelationship)(domain.c_str());
}

void ActiveDirectoryProvider::SetSmartCardEnabledServices(const std::vector<std::string>& services) const {
  ThrowUnlessSuccess(CallWithTexts(operations_->setSmartCardEnabledServices, services));
}

std::vector<std::string> ActiveDirectoryProvider::GetSmartCardEnabledServices() const {
  return CallForArray<std::vector<std::string>, char>(operations_->getSmartCardEnabledServices,
                                                      [](const char* name) { return std::string(name); });
}

}  // namespace quenix::authentication
