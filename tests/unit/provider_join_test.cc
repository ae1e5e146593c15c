// The two joins of the provider: what they pass and how often they try.

#include <gtest/gtest.h>
#include <syslog.h>

#include <chrono>
#include <string>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "providers/active_directory_provider.h"
#include "support/clock.h"
#include "support/expect_throw_what.h"
#include "support/log_recorder.h"

namespace quenix::authentication {
namespace {

using testsupport::FakeClock;
using testsupport::LogLine;
using testsupport::RecordedLog;

using Sleeps = std::vector<std::chrono::nanoseconds>;

constexpr std::chrono::seconds PAUSE(30);
const std::string LOGON_FAILURE =
    "Exception 0x0000052e: The attempted logon is invalid. This is due to either a bad user name or "
    "authentication "
    "information.";

class ProviderJoinTest : public ::testing::Test {
 protected:
  /// Makes both joins answer with these statuses, one after the other, and note when they were called.
  void AnswerWith(std::vector<std::uint32_t> statuses) {
    statuses_ = std::move(statuses);
    const auto answer = [this](auto...) {
      sleepsBeforeCall_.push_back(clock_.Sleeps().size());
      return statuses_.at(sleepsBeforeCall_.size() - 1);
    };
    script_.joinDomain = answer;
    script_.joinDomainWithMachineAccount = answer;
  }

  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  const ActiveDirectoryProvider provider_{"scripted"};
  const FakeClock clock_;
  const Credentials credentials_{"user", "password"};
  std::vector<std::uint32_t> statuses_;
  std::vector<std::size_t> sleepsBeforeCall_;
};

TEST_F(ProviderJoinTest, DomainPathAndCredentialsArePassedAsTheyStand) {
  std::string domain;
  std::string path;
  const Credentials* credentials = nullptr;
  script_.joinDomain = [&](const char* d, const char* p, const Credentials* c) {
    domain = d;
    path = p;
    credentials = c;
    return 0U;
  };
  provider_.JoinDomain("example.test", "OU=Servers/OU=Hosts", credentials_);
  EXPECT_EQ(domain, "example.test");
  EXPECT_EQ(path, "OU=Servers/OU=Hosts");
  EXPECT_EQ(credentials, &credentials_);
}

TEST_F(ProviderJoinTest, AnEmptyPathIsPassedAsNullAndAnEmptyDomainIsNot) {
  const char* path = "";
  const char* domain = nullptr;
  script_.joinDomain = [&](const char* d, const char* p, const Credentials*) {
    domain = d;
    path = p;
    return 0U;
  };
  provider_.JoinDomain("", "", credentials_);
  EXPECT_EQ(path, nullptr);
  EXPECT_NE(domain, nullptr);
}

TEST_F(ProviderJoinTest, ASuccessEndsTheJoinAtOnceAndLogsNothing) {
  AnswerWith({0});
  provider_.JoinDomain("d", "", credentials_);
  EXPECT_EQ(sleepsBeforeCall_.size(), 1U);
  EXPECT_TRUE(clock_.Sleeps().empty());
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(ProviderJoinTest, AnyOtherStatusEndsTheJoinAtOnce) {
  for (const std::uint32_t status : {86U, 5U, 1325U, 1327U, 0xffff0001U, 0xffffU}) {
    sleepsBeforeCall_.clear();
    AnswerWith({status, 0});
    EXPECT_THROW(provider_.JoinDomain("d", "", credentials_), Exception);
    EXPECT_EQ(sleepsBeforeCall_.size(), 1U) << status;
  }
  EXPECT_TRUE(clock_.Sleeps().empty());
}

TEST_F(ProviderJoinTest, AFailureThatCuresItselfIsRepeatedAfterAPause) {
  AnswerWith({1326, 0});
  provider_.JoinDomain("d", "", credentials_);
  EXPECT_EQ(sleepsBeforeCall_, (std::vector<std::size_t>{0, 1}));
  EXPECT_EQ(clock_.Sleeps(), (Sleeps{PAUSE}));
}

TEST_F(ProviderJoinTest, TheFourthCallIsTheLastAndIsFollowedByAPauseToo) {
  AnswerWith({1326, 1326, 1326, 1326, 0});
  EXPECT_THROW_WHAT(provider_.JoinDomain("d", "", credentials_), LogonFailureException, LOGON_FAILURE);
  EXPECT_EQ(sleepsBeforeCall_, (std::vector<std::size_t>{0, 1, 2, 3}));
  EXPECT_EQ(clock_.Sleeps(), (Sleeps{PAUSE, PAUSE, PAUSE, PAUSE}));
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(ProviderJoinTest, TheFourthCallMaySucceed) {
  AnswerWith({1326, 0xffff0000U, 1326, 0});
  provider_.JoinDomain("d", "", credentials_);
  EXPECT_EQ(clock_.Sleeps(), (Sleeps{PAUSE, PAUSE, PAUSE}));
}

TEST_F(ProviderJoinTest, TheHighRetryableStatusIsRepeatedToo) {
  AnswerWith({0xffff0000U, 0xffff0000U, 0xffff0000U, 0xffff0000U});
  EXPECT_THROW_WHAT(provider_.JoinDomain("d", "", credentials_), UnknownException,
                    "Exception 0xffff0000: Unknown exception");
  EXPECT_EQ(clock_.Sleeps().size(), 4U);
}

TEST_F(ProviderJoinTest, TheLastStatusIsTheOneThatIsThrown) {
  AnswerWith({1326, 5});
  EXPECT_THROW_WHAT(provider_.JoinDomain("d", "", credentials_), AccessDeniedException,
                    "Exception 0x00000005: Access is denied.");
  EXPECT_EQ(clock_.Sleeps(), (Sleeps{PAUSE}));
}

TEST_F(ProviderJoinTest, TheMachineAccountJoinPassesItsFieldsInOrder) {
  const CAM::DirectoryDomainInfo domain{"d1", "d2", "d3", "d4"};
  const CAM::MachineAccountInfo account{"a1", "a2", "a3", "a4", "a5"};
  std::vector<std::string> passed;
  script_.joinDomainWithMachineAccount = [&](const ActiveDirectoryDomainInfo* d,
                                             const ActiveDirectoryMachineAccountInfo* a) {
    // As a plug-in that knows only "four pointers" and "five pointers" sees them.
    const auto* domainFields = reinterpret_cast<const char* const*>(d);
    const auto* accountFields = reinterpret_cast<const char* const*>(a);
    passed.assign(domainFields, domainFields + 4);
    passed.insert(passed.end(), accountFields, accountFields + 5);
    return 0U;
  };
  provider_.JoinDomainWithMachineAccount(domain, account);
  EXPECT_EQ(passed, (std::vector<std::string>{"d1", "d2", "d3", "d4", "a1", "a2", "a3", "a4", "a5"}));
}

TEST_F(ProviderJoinTest, TheMachineAccountJoinLogsBeforeEveryCall) {
  std::vector<std::size_t> linesBeforeCall;
  script_.joinDomainWithMachineAccount = [&](auto...) {
    linesBeforeCall.push_back(RecordedLog().size());
    return 1326U;
  };
  EXPECT_THROW_WHAT(provider_.JoinDomainWithMachineAccount({}, {}), LogonFailureException, LOGON_FAILURE);
  EXPECT_EQ(linesBeforeCall, (std::vector<std::size_t>{1, 2, 3, 4}));
  EXPECT_EQ(RecordedLog(), (std::vector<LogLine>{{LOG_INFO, "Adding host to domain: Attempt (1/4)"},
                                                 {LOG_INFO, "Adding host to domain: Attempt (2/4)"},
                                                 {LOG_INFO, "Adding host to domain: Attempt (3/4)"},
                                                 {LOG_INFO, "Adding host to domain: Attempt (4/4)"}}));
  EXPECT_EQ(clock_.Sleeps(), (Sleeps{PAUSE, PAUSE, PAUSE, PAUSE}));
}

TEST_F(ProviderJoinTest, TheMachineAccountJoinThatCuresItselfMakesTwoCalls) {
  AnswerWith({0xffff0000U, 0});
  provider_.JoinDomainWithMachineAccount({}, {});
  EXPECT_EQ(sleepsBeforeCall_, (std::vector<std::size_t>{0, 1}));
  EXPECT_EQ(RecordedLog().size(), 2U);
}

}  // namespace
}  // namespace quenix::authentication
