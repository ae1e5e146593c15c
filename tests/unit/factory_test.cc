#include "authentication/authentication_store_factory.h"

#include <gtest/gtest.h>
#include <sys/time.h>

#include <cerrno>
#include <memory>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/gate.h"
#include "support/interpose.h"

namespace quenix::authentication {
namespace {

using testsupport::TakeOver;
using testsupport::WriteFile;
namespace calls = testsupport::calls;

AuthenticationStoreFactory& Factory() {
  return *Singleton<AuthenticationStoreFactory>::_instance;
}

TEST(FactoryTest, ExistsOnceTheLibraryIsLoaded) {
  ASSERT_NE(Singleton<AuthenticationStoreFactory>::_instance, nullptr);
}

TEST(FactoryTest, ListsTheTwoStoresInOrder) {
  EXPECT_EQ(Factory().GetRegisteredStores(), (std::vector<std::string>{"Active Directory", "None"}));
}

TEST(FactoryTest, CreatesTheNoneStore) {
  const auto store = Factory().CreateInstance("None");
  EXPECT_NE(dynamic_cast<NoRemoteAuthenticationStore*>(store.get()), nullptr);
}

TEST(FactoryTest, CreatesTheActiveDirectoryStore) {
  testsupport::UseScriptedPlugin();
  const auto store = Factory().CreateInstance("Active Directory");
  EXPECT_NE(dynamic_cast<ActiveDirectoryStore*>(store.get()), nullptr);
}

TEST(FactoryTest, TheActiveDirectoryStoreWaitsSixtySeconds) {
  testsupport::Gate gate;
  testsupport::UseScriptedPlugin().getActiveDomain = [&gate](auto* domain, auto* release) {
    gate.Pass();
    return testsupport::Answer(domain, release, {"", ""});
  };
  const auto store = Factory().CreateInstance("Active Directory");
  timeval before{};
  timeval after{};
  timespec deadline{};
  {
    const TakeOver look(calls::pthreadCondTimedwait,
                        [&](pthread_cond_t*, pthread_mutex_t*, const timespec* time) {
                          deadline = *time;
                          return ETIMEDOUT;
                        });
    gettimeofday(&before, nullptr);
    store->GetStoreConfiguration();
    gettimeofday(&after, nullptr);
  }
  EXPECT_GE(deadline.tv_sec, before.tv_sec + 60);
  EXPECT_LE(deadline.tv_sec, after.tv_sec + 60);
  gate.Open();
  store->GetStoreConfiguration();  // The first worker has left the gate when this one is answered.
}

TEST(FactoryTest, CreatesANewStoreOnEachCall) {
  const auto first = Factory().CreateInstance("None");
  const auto second = Factory().CreateInstance("None");
  EXPECT_NE(first, second);
}

TEST(FactoryTest, HasNothingForAnUnknownName) {
  EXPECT_EQ(Factory().CreateInstance("none"), nullptr);
  EXPECT_EQ(Factory().CreateInstance(""), nullptr);
  EXPECT_EQ(Factory().CreateInstance("None "), nullptr);
  EXPECT_EQ(Factory().CreateInstance(std::string("None\0", 5)), nullptr);
}

TEST(FactoryTest, PassesOnWhatTheStoresConstructorThrows) {
  EXPECT_THROW_WHAT(Factory().CreateInstance("Active Directory"), InvalidActiveDirectoryProviderException,
                    "The specified Active Directory provider '(none installed)' is invalid");
}

class OtherStore : public AuthenticationStore {
 public:
  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override { return nullptr; }
  std::string GetDisplayName() const override { return "Other"; }
  bool IsActive() const override { return false; }
  void MakeActive() override {}
};

std::unique_ptr<AuthenticationStore> NewOtherStore() {
  return std::make_unique<OtherStore>();
}

TEST(FactoryTest, CreatesStoresThatCallersRegister) {
  Factory().RegisterType("Other", &NewOtherStore);
  EXPECT_NE(dynamic_cast<OtherStore*>(Factory().CreateInstance("Other").get()), nullptr);
  Factory().RegisterType("Aardvark", &NewOtherStore);
  EXPECT_EQ(Factory().GetRegisteredStores(),
            (std::vector<std::string>{"Aardvark", "Active Directory", "None", "Other"}));
}

TEST(FactoryTest, OrdersNamesByTheirBytes) {
  Factory().RegisterType("a", &NewOtherStore);
  Factory().RegisterType("\xc3\xa4", &NewOtherStore);
  Factory().RegisterType("", &NewOtherStore);
  EXPECT_EQ(Factory().GetRegisteredStores(),
            (std::vector<std::string>{"", "Active Directory", "None", "a", "\xc3\xa4"}));
}

TEST(FactoryTest, TheFirstRegistrationOfANameStands) {
  Factory().RegisterType("None", &NewOtherStore);
  EXPECT_NE(dynamic_cast<NoRemoteAuthenticationStore*>(Factory().CreateInstance("None").get()), nullptr);
  EXPECT_EQ(Factory().GetRegisteredStores().size(), 2U);
}

TEST(FactoryTest, IsNoMoreAfterItsDestructor) {
  AuthenticationStoreFactory* const real = Singleton<AuthenticationStoreFactory>::_instance;
  {
    const AuthenticationStoreFactory factory;
    EXPECT_EQ(Singleton<AuthenticationStoreFactory>::_instance, &factory);
    EXPECT_EQ(factory.GetRegisteredStores(), (std::vector<std::string>{"Active Directory", "None"}));
  }
  EXPECT_EQ(Singleton<AuthenticationStoreFactory>::_instance, nullptr);
  Singleton<AuthenticationStoreFactory>::_instance = real;
}

TEST(FactoryTest, MayBeAskedFromSeveralThreads) {
  std::vector<std::thread> threads;
  for (int index = 0; index < 4; ++index) {
    threads.emplace_back([] {
      for (int round = 0; round < 100; ++round) {
        EXPECT_NE(Factory().CreateInstance("None"), nullptr);
        EXPECT_EQ(Factory().GetRegisteredStores().size(), 2U);
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
}

/// A remote store of that name; only IsActive() is of interest.
class NamedStore : public RemoteAuthenticationStore {
 public:
  explicit NamedStore(std::string name) : name_(std::move(name)) {}
  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override { return nullptr; }
  std::string GetDisplayName() const override { return name_; }
  void MakeActive() override {}
  void MakeInactive() override {}

 private:
  std::string name_;
};

void Record(const std::string& value) {
  WriteFile(testsupport::AUTHENTICATION_CONF, "remote-authentication-store = " + value + "\n");
}

TEST(ActiveRecordTest, TheStoreOfThatNameIsActive) {
  Record("\"None\"");
  EXPECT_TRUE(NoRemoteAuthenticationStore().IsActive());
  EXPECT_FALSE(NamedStore("Active Directory").IsActive());
}

TEST(ActiveRecordTest, TheActiveDirectoryStoreIsActive) {
  testsupport::UseScriptedPlugin();
  Record("'Active Directory'");
  EXPECT_TRUE(ActiveDirectoryStore(60).IsActive());
  EXPECT_FALSE(NoRemoteAuthenticationStore().IsActive());
}

TEST(ActiveRecordTest, IsReadAfreshOnEachCall) {
  const NoRemoteAuthenticationStore store;
  Record("\"None\"");
  EXPECT_TRUE(store.IsActive());
  Record("\"Other\"");
  EXPECT_FALSE(store.IsActive());
  Record("None");
  EXPECT_TRUE(store.IsActive());
}

TEST(ActiveRecordTest, BlanksInsideTheQuotesCount) {
  Record("\" None\"");
  EXPECT_FALSE(NoRemoteAuthenticationStore().IsActive());
  EXPECT_FALSE(NamedStore("Active Directory").IsActive());
}

TEST(ActiveRecordTest, LetterCaseCounts) {
  Record("\"none\"");
  EXPECT_FALSE(NoRemoteAuthenticationStore().IsActive());
}

TEST(ActiveRecordTest, LengthAndEveryByteCount) {
  Record("\"None\"");
  EXPECT_FALSE(NamedStore("Non").IsActive());
  EXPECT_FALSE(NamedStore("Nonee").IsActive());
  EXPECT_FALSE(NamedStore(std::string("None\0", 5)).IsActive());
  EXPECT_FALSE(NamedStore("").IsActive());
}

TEST(ActiveRecordTest, AnAbsentKeyIsAnError) {
  WriteFile(testsupport::AUTHENTICATION_CONF, "other = \"None\"\n");
  EXPECT_THROW_WHAT(NoRemoteAuthenticationStore().IsActive(), InvalidKeyException,
                    "The specified key 'remote-authentication-store' was not found in this configuration");
}

TEST(ActiveRecordTest, AnAbsentFileIsAnError) {
  EXPECT_THROW_WHAT(NoRemoteAuthenticationStore().IsActive(), IOError,
                    "Unable to open '/etc/quenix/velmor/authentication.conf': No such file or directory");
}

TEST(ActiveRecordTest, AMalformedFileIsAnError) {
  WriteFile(testsupport::AUTHENTICATION_CONF, "remote-authentication-store\n");
  EXPECT_THROW_WHAT(NoRemoteAuthenticationStore().IsActive(), ConfigurationError,
                    "Error parsing configuration on line 1: no delimiter found");
}

}  // namespace
}  // namespace quenix::authentication
