// Joining with a user's account and leaving, with what the host remembers of it.

#include <gtest/gtest.h>
#include <syslog.h>

#include <string>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/clock.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"
#include "support/log_recorder.h"
#include "support/machine.h"

namespace quenix::authentication {
namespace {

using testsupport::Exists;
using testsupport::LogLine;
using testsupport::RecordedLog;
using testsupport::WriteFile;

const std::string NO_USER = "The credentials that were provided were invalid: no username was specified";
const std::string NO_PASSWORD =
    "The credentials that were provided were invalid: empty or no password was specified; the account must "
    "have a "
    "non-empty password to join the host to domain";
const std::string CONFIG_STORE = "/var/lib/quenix/configstore.db";

class JoinTest : public ::testing::Test {
 protected:
  JoinTest() {
    script_.joinDomain = [this](const char* domain, const char* path, const Credentials* credentials) {
      ++joins_;
      domain_ = domain;
      path_ = path == nullptr ? "(null)" : path;
      user_ = credentials->username;
      return joinStatus_;
    };
    script_.partDomain = [this](const Credentials* credentials) {
      parts_.push_back(credentials == nullptr ? "(null)" : credentials->username);
      return partStatus_;
    };
  }

  /// Makes the configuration store unusable.
  static void DamageConfigStore() { WriteFile(CONFIG_STORE, std::string(5000, 'x')); }

  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  ActiveDirectoryStore store_{60};
  const Credentials credentials_{"Administrator", "secret"};
  int joins_ = 0;
  std::uint32_t joinStatus_ = 0;
  std::uint32_t partStatus_ = 0;
  std::string domain_;
  std::string path_;
  std::string user_;
  std::vector<std::string> parts_;
};

TEST_F(JoinTest, ADomainAloneIsJoinedWithoutPath) {
  store_.JoinDomain("example.test", credentials_, true);
  EXPECT_EQ(domain_, "example.test");
  EXPECT_EQ(path_, "(null)");
  EXPECT_EQ(user_, "Administrator");
}

TEST_F(JoinTest, OnlyTheFirstSlashSplits) {
  store_.JoinDomain("example.test/OU=Servers/OU=Hosts", credentials_, true);
  EXPECT_EQ(domain_, "example.test");
  EXPECT_EQ(path_, "OU=Servers/OU=Hosts");
}

TEST_F(JoinTest, ALoneSlashAtTheEndIsAnEmptyPath) {
  store_.JoinDomain("example.test/", credentials_, true);
  EXPECT_EQ(domain_, "example.test");
  EXPECT_EQ(path_, "(null)");
}

TEST_F(JoinTest, ASecondSlashAtOnceBelongsToThePath) {
  store_.JoinDomain("example.test//Servers", credentials_, true);
  EXPECT_EQ(path_, "/Servers");
}

TEST_F(JoinTest, ANullUserNameIsRefusedBeforeThePasswordIsLookedAt) {
  EXPECT_THROW_WHAT(store_.JoinDomain("d", {nullptr, nullptr}, true), InvalidCredentialsException, NO_USER);
  EXPECT_THROW_WHAT(store_.JoinDomain("d", {nullptr, "p"}, true), InvalidCredentialsException, NO_USER);
  EXPECT_EQ(joins_, 0);
}

TEST_F(JoinTest, AnEmptyUserNameIsLeftToThePlugin) {
  store_.JoinDomain("d", {"", "p"}, true);
  EXPECT_EQ(joins_, 1);
  EXPECT_EQ(user_, "");
}

TEST_F(JoinTest, ANullOrEmptyPasswordIsRefused) {
  EXPECT_THROW_WHAT(store_.JoinDomain("d", {"u", nullptr}, true), InvalidCredentialsException, NO_PASSWORD);
  EXPECT_THROW_WHAT(store_.JoinDomain("d", {"u", ""}, true), InvalidCredentialsException, NO_PASSWORD);
  EXPECT_EQ(joins_, 0);
}

TEST_F(JoinTest, CredentialsAreLookedAtBeforeTheHostName) {
  testsupport::SetHostName("localhost");
  EXPECT_THROW_WHAT(store_.JoinDomain("d", {"u", ""}, false), InvalidCredentialsException, NO_PASSWORD);
}

TEST_F(JoinTest, AnUnusableHostNameEndsTheJoinBeforeThePluginIsCalled) {
  testsupport::SetHostName("localhost");
  EXPECT_THROW_WHAT(store_.JoinDomain("example.test", credentials_, false), InvalidHostNameException,
                    "The current hostname is invalid: hostname is in blacklist");
  EXPECT_EQ(joins_, 0);
}

TEST_F(JoinTest, TheHostNameIsCheckedAgainstTheDomainWithoutThePath) {
  testsupport::SetHostName("host1");
  WriteFile("/etc/hosts", "192.0.2.7 host1.example.test host1\n");
  testsupport::AddInterface("net0", "192.0.2.7");
  store_.JoinDomain("example.test/Servers", credentials_, false);
  EXPECT_EQ(joins_, 1);
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(JoinTest, AHostNameThatIsNotCheckedMayBeAnything) {
  testsupport::SetHostName("localhost");
  store_.JoinDomain("example.test", credentials_, true);
  EXPECT_EQ(joins_, 1);
}

TEST_F(JoinTest, AJoinIsRecordedWithDomainPathAndAnEmptyProxy) {
  store_.JoinDomain("example.test/OU=Servers/OU=Hosts", credentials_, true);
  ActiveDirectoryConfigStore identity;
  EXPECT_EQ(identity.GetDomainName(), "example.test");
  EXPECT_EQ(identity.GetOrganizationalUnit(), "OU=Servers/OU=Hosts");
  EXPECT_EQ(identity.GetAuthProxyAddr(), "");
  EXPECT_TRUE(parts_.empty());
}

TEST_F(JoinTest, ARefusedJoinIsNotRecorded) {
  joinStatus_ = 86;
  EXPECT_THROW(store_.JoinDomain("example.test", credentials_, true), InvalidPasswordException);
  EXPECT_EQ(joins_, 1);
  EXPECT_FALSE(Exists(CONFIG_STORE));
  EXPECT_TRUE(parts_.empty());
}

TEST_F(JoinTest, ARefusalThatMayCureItselfIsTriedFourTimes) {
  const testsupport::FakeClock clock;
  joinStatus_ = 1326;
  EXPECT_THROW(store_.JoinDomain("example.test", credentials_, true), LogonFailureException);
  EXPECT_EQ(joins_, 4);
  EXPECT_EQ(clock.Sleeps().size(), 4U);
}

TEST_F(JoinTest, AJoinThatCannotBeRecordedLeavesTheDomainAgain) {
  DamageConfigStore();
  std::string text;
  try {
    store_.JoinDomain("example.test", credentials_, true);
    FAIL();
  } catch (const OrvConfigStore::ConfigStoreException& exception) {
    text = exception.what();
  }
  EXPECT_NE(text.find(CONFIG_STORE), std::string::npos) << text;
  EXPECT_EQ(parts_, (std::vector<std::string>{"(null)"}));
  EXPECT_EQ(RecordedLog(),
            (std::vector<LogLine>{{LOG_ERR, "Failed to store domain details to Config Store: " + text +
                                                ".Leaving Domain..."}}));
}

TEST_F(JoinTest, TheFailureIsLoggedBeforeTheDomainIsLeft) {
  DamageConfigStore();
  std::size_t lines = 0;
  script_.partDomain = [&](auto...) {
    lines = RecordedLog().size();
    return 0U;
  };
  EXPECT_THROW(store_.JoinDomain("example.test", credentials_, true), OrvConfigStore::ConfigStoreException);
  EXPECT_EQ(lines, 1U);
}

TEST_F(JoinTest, AFailureOfThatLeaveIsTheOneThatIsThrown) {
  DamageConfigStore();
  partStatus_ = 5;
  EXPECT_THROW_WHAT(store_.JoinDomain("example.test", credentials_, true), AccessDeniedException,
                    "Exception 0x00000005: Access is denied.");
}

TEST_F(JoinTest, LeavingRemovesTheRecord) {
  store_.JoinDomain("example.test", credentials_, true);
  store_.PartDomain();
  EXPECT_EQ(parts_, (std::vector<std::string>{"(null)"}));
  EXPECT_THROW_WHAT(ActiveDirectoryConfigStore().GetDomainName(), ConfigurationError,
                    "Failed to get the requested object");
}

TEST_F(JoinTest, LeavingWithoutARecordSucceeds) {
  store_.PartDomain();
  EXPECT_EQ(parts_.size(), 1U);
}

TEST_F(JoinTest, ARefusedLeaveKeepsTheRecord) {
  store_.JoinDomain("example.test", credentials_, true);
  partStatus_ = 5;
  EXPECT_THROW(store_.PartDomain(), AccessDeniedException);
  EXPECT_EQ(ActiveDirectoryConfigStore().GetDomainName(), "example.test");
}

TEST_F(JoinTest, ARecordThatCannotBeRemovedIsLoggedAndReported) {
  DamageConfigStore();
  std::string text;
  try {
    store_.PartDomain();
    FAIL();
  } catch (const OrvConfigStore::ConfigStoreException& exception) {
    text = exception.what();
  }
  EXPECT_EQ(parts_.size(), 1U);
  EXPECT_EQ(RecordedLog(),
            (std::vector<LogLine>{{LOG_ERR, "Failed to remove domain details from Config Store: " + text}}));
}

TEST_F(JoinTest, LeavingWithAnAccountDoesNotTouchTheConfigurationStore) {
  DamageConfigStore();
  store_.PartDomain(credentials_);
  EXPECT_EQ(parts_, (std::vector<std::string>{"Administrator"}));
  EXPECT_TRUE(RecordedLog().empty());
}

}  // namespace
}  // namespace quenix::authentication
