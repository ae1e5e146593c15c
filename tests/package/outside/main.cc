// A caller of the library, as it is written outside of the project: one header, and nothing else of ours.
#include <authentication/authentication.h>

#include <cstdio>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <vector>

using namespace quenix::authentication;

namespace {

int failures = 0;

void Expect(bool condition, const char* what) {
  if (!condition) {
    std::fprintf(stderr, "not so: %s\n", what);
    ++failures;
  }
}

/// A store of the caller's own.
class OwnStore : public RemoteAuthenticationStore {
 public:
  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override {
    return std::make_unique<NoRemoteAuthenticationStoreConfiguration>();
  }
  std::string GetDisplayName() const override { return "Own"; }
  void MakeActive() override {}
  void MakeInactive() override {}
};

void UseFactory() {
  AuthenticationStoreFactory& factory = *Singleton<AuthenticationStoreFactory>::_instance;
  Expect(factory.GetRegisteredStores() == std::vector<std::string>{"Active Directory", "None"}, "two stores");
  factory.RegisterType("Own",
                       []() -> std::unique_ptr<AuthenticationStore> { return std::make_unique<OwnStore>(); });
  const auto store = factory.CreateInstance("Own");
  Expect(dynamic_cast<RemoteAuthenticationStore*>(store.get()) != nullptr, "the own store is a remote one");
  Expect(factory.CreateInstance("none") == nullptr, "an unknown name gives nothing");
}

void CatchByClass() {
  try {
    Configuration("/nonexistent/file");
    Expect(false, "a missing file is an error");
  } catch (const IOError& error) {
    Expect(error.Code() == 0, "an IOError has no code");
  }
  try {
    Singleton<AuthenticationStoreFactory>::_instance->CreateInstance("Active Directory");
    Expect(false, "a store without provider cannot be made");
  } catch (const InvalidActiveDirectoryProviderException&) {
  }
  try {
    ActiveDirectoryConfigStore().GetDomainName();
    Expect(false, "a host that has not joined has no domain");
  } catch (const ConfigurationError&) {
  }
  const std::unique_ptr<Exception> kept(LogonFailureException().Clone());
  try {
    kept->Throw();
  } catch (const LogonFailureException& failure) {
    Expect(failure.Code() == 1326, "a code goes with its class");
  }
}

void UseRecords() {
  const Domain domain("example.test", "EXAMPLE");
  const std::deque<Domain> domains{domain};
  ActiveDirectoryStoreConfiguration configuration;
  configuration.activeDomain = domains.front();
  Expect(configuration.activeDomain.dnsName == "example.test", "a record keeps its fields");
  const TrustState state = TRUST_STATE_NOT_KNOWN;
  Expect(state == 7, "the enumerations are usable");
}

/// Uses an object of a class and the operations that are only declared here, so that they must be exported.
void UseOperations() {
  VelmorThreadUtil::SetScheduler([](std::function<void()> work) { work(); });
  bool ran = false;
  VelmorThreadUtil::ScheduleFunctor([&ran] { ran = true; });
  Expect(ran, "the installed scheduler runs the work");
  VelmorThreadUtil::SetScheduler(nullptr);
  try {
    ActiveDirectoryStore store(60);
    store.JoinDomain("example.test", Credentials{nullptr, nullptr}, true);
  } catch (const Exception&) {
  }
}

}  // namespace

int main() {
  UseFactory();
  CatchByClass();
  UseRecords();
  UseOperations();
  return failures == 0 ? 0 : 1;
}
