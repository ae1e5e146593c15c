#include "authentication/no_remote_authentication_store.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <typeinfo>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"

namespace quenix::authentication {
namespace {

using testsupport::AUTHENTICATION_CONF;
using testsupport::ReadFile;
using testsupport::WriteFile;

const std::string NONE_RECORDED = "remote-authentication-store = \"None\"\n";

void Record(const std::string& name) {
  WriteFile(AUTHENTICATION_CONF, "remote-authentication-store = \"" + name + "\"\n");
}

/// A store whose MakeInactive() notes what the record said and how many such stores live, and then throws
/// what it is told to.
class PreviousStore : public RemoteAuthenticationStore {
 public:
  enum class Failure { NONE, RUNTIME_ERROR, BAD_CAST };

  PreviousStore() { ++living; }
  ~PreviousStore() override { --living; }

  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override { return nullptr; }
  std::string GetDisplayName() const override { return "Previous"; }
  void MakeActive() override {}
  void MakeInactive() override {
    ++deactivated;
    recordWhenDeactivated = ReadFile(AUTHENTICATION_CONF);
    if (failure == Failure::RUNTIME_ERROR) {
      throw std::runtime_error("teardown failed");
    }
    if (failure == Failure::BAD_CAST) {
      throw std::bad_cast();
    }
  }

  inline static int living = 0;
  inline static int deactivated = 0;
  inline static Failure failure = Failure::NONE;
  inline static std::string recordWhenDeactivated;
};

/// A store that is no remote one.
class LocalStore : public AuthenticationStore {
 public:
  LocalStore() { ++living; }
  ~LocalStore() override { --living; }

  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override { return nullptr; }
  std::string GetDisplayName() const override { return "Local"; }
  bool IsActive() const override { return false; }
  void MakeActive() override {}

  inline static int living = 0;
};

template <class Store>
std::unique_ptr<AuthenticationStore> New() {
  return std::make_unique<Store>();
}

class NoneStoreTest : public ::testing::Test {
 protected:
  NoneStoreTest() {
    AuthenticationStoreFactory* const factory = Singleton<AuthenticationStoreFactory>::_instance;
    factory->RegisterType("Previous", &New<PreviousStore>);
    factory->RegisterType("Local", &New<LocalStore>);
  }

  NoRemoteAuthenticationStore store_;
};

TEST_F(NoneStoreTest, IsCalledNone) {
  EXPECT_EQ(store_.GetDisplayName(), "None");
}

TEST_F(NoneStoreTest, GivesANewConfigurationOfItsKindOnEachCall) {
  const auto first = store_.GetStoreConfiguration();
  const auto second = store_.GetStoreConfiguration();
  const StoreConfiguration& configuration = *first;
  EXPECT_TRUE(typeid(configuration) == typeid(NoRemoteAuthenticationStoreConfiguration));
  EXPECT_NE(first, second);
}

TEST_F(NoneStoreTest, CannotBeDeactivated) {
  Record("None");
  EXPECT_THROW_WHAT(store_.MakeInactive(), std::runtime_error, "Attempted to disable None Store");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
}

TEST_F(NoneStoreTest, ActivatingRecordsNoneBeforeThePreviousStoreIsDeactivated) {
  Record("Previous");
  store_.MakeActive();
  EXPECT_EQ(PreviousStore::deactivated, 1);
  EXPECT_EQ(PreviousStore::recordWhenDeactivated, NONE_RECORDED);
  EXPECT_EQ(PreviousStore::living, 0);
  EXPECT_TRUE(store_.IsActive());
}

TEST_F(NoneStoreTest, ActivatingKeepsTheOtherKeys) {
  WriteFile(AUTHENTICATION_CONF, "z = 1\nremote-authentication-store = \"Previous\"\na = 2\n");
  store_.MakeActive();
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "a = \"2\"\n" + NONE_RECORDED + "z = \"1\"\n");
}

TEST_F(NoneStoreTest, ActivatingTheActiveStoreDoesNothing) {
  WriteFile(AUTHENTICATION_CONF, "remote-authentication-store = 'None'");
  struct stat before {};
  ASSERT_EQ(stat(AUTHENTICATION_CONF.c_str(), &before), 0);
  store_.MakeActive();
  struct stat after {};
  ASSERT_EQ(stat(AUTHENTICATION_CONF.c_str(), &after), 0);
  EXPECT_EQ(before.st_ino, after.st_ino);
  EXPECT_EQ(before.st_mtim.tv_nsec, after.st_mtim.tv_nsec);
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "remote-authentication-store = 'None'");
}

TEST_F(NoneStoreTest, AnUnknownPreviousStoreIsNamedAfterNoneIsRecorded) {
  Record("Activ Directory");
  EXPECT_THROW_WHAT(store_.MakeActive(), UnknownRemoteAuthenticationStoreException,
                    "The specified store 'Activ Directory' is unknown");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
}

TEST_F(NoneStoreTest, AnEmptyPreviousNameIsUnknown) {
  Record("");
  EXPECT_THROW_WHAT(store_.MakeActive(), UnknownRemoteAuthenticationStoreException,
                    "The specified store '' is unknown");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
}

TEST_F(NoneStoreTest, APreviousStoreThatIsNotRemoteIsInvalid) {
  Record("Local");
  EXPECT_THROW_WHAT(store_.MakeActive(), InvalidRemoteAuthenticationStoreException,
                    "The specified store 'Local' is invalid");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
  EXPECT_EQ(LocalStore::living, 0);
}

TEST_F(NoneStoreTest, ABadCastInsideTheTeardownIsAnInvalidStoreToo) {
  PreviousStore::failure = PreviousStore::Failure::BAD_CAST;
  Record("Previous");
  EXPECT_THROW_WHAT(store_.MakeActive(), InvalidRemoteAuthenticationStoreException,
                    "The specified store 'Previous' is invalid");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
  EXPECT_EQ(PreviousStore::living, 0);
}

TEST_F(NoneStoreTest, AnyOtherFailureOfTheTeardownIsPassedOn) {
  PreviousStore::failure = PreviousStore::Failure::RUNTIME_ERROR;
  Record("Previous");
  EXPECT_THROW_WHAT(store_.MakeActive(), std::runtime_error, "teardown failed");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
  EXPECT_EQ(PreviousStore::living, 0);
}

TEST_F(NoneStoreTest, APreviousStoreThatCannotBeCreatedIsReportedAfterNoneIsRecorded) {
  Record("Active Directory");
  EXPECT_THROW_WHAT(store_.MakeActive(), InvalidActiveDirectoryProviderException,
                    "The specified Active Directory provider '(none installed)' is invalid");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), NONE_RECORDED);
}

TEST_F(NoneStoreTest, TheActiveDirectoryStoreIsDeactivatedByARefresh) {
  auto& script = testsupport::UseScriptedPlugin();
  std::string record;
  script.getActiveDomain = [&](auto* domain, auto* release) {
    record = ReadFile(AUTHENTICATION_CONF);
    return testsupport::Answer(domain, release, {"", ""});
  };
  Record("Active Directory");
  store_.MakeActive();
  EXPECT_EQ(record, NONE_RECORDED);
}

TEST_F(NoneStoreTest, WithoutTheKeyNothingIsWritten) {
  WriteFile(AUTHENTICATION_CONF, "other = 1\n");
  EXPECT_THROW_WHAT(store_.MakeActive(), InvalidKeyException,
                    "The specified key 'remote-authentication-store' was not found in this configuration");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "other = 1\n");
}

TEST_F(NoneStoreTest, WithoutTheFileNothingIsWritten) {
  EXPECT_THROW_WHAT(store_.MakeActive(), IOError,
                    "Unable to open '/etc/quenix/velmor/authentication.conf': No such file or directory");
  EXPECT_FALSE(testsupport::Exists(AUTHENTICATION_CONF));
}

TEST_F(NoneStoreTest, AFailedWriteLeavesRecordAndPreviousStore) {
  const testsupport::SmallFileSystem fileSystem("/etc/quenix/velmor", 4096);
  Record("Previous");
  EXPECT_THROW(store_.MakeActive(), IOError);
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "remote-authentication-store = \"Previous\"\n");
  EXPECT_EQ(PreviousStore::deactivated, 0);
}

}  // namespace
}  // namespace quenix::authentication
