// The refresh of the whole cache, and what it logs.

#include <gtest/gtest.h>
#include <syslog.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/clock.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/gate.h"
#include "support/log_recorder.h"
#include "unit/store_probe.h"

namespace quenix::authentication {
namespace {

using testsupport::Answer;
using testsupport::FakeClock;
using testsupport::LogLine;
using testsupport::NamePair;
using testsupport::RecordedLog;
using testsupport::StoreProbe;

using Words = std::vector<std::string>;
using Lines = std::vector<LogLine>;

const std::string DENIED = "Exception 0x00000005: Access is denied.";

class CacheRefreshTest : public ::testing::Test {
 protected:
  CacheRefreshTest() {
    script_.getActiveDomain = [this](auto* domain, auto* release) {
      asked_.push_back("domain");
      return Answer(domain, release, {joined_, ""});
    };
    script_.getTrustedDomains = [this](auto*** domains, auto* release) {
      asked_.push_back("trusted");
      return trustedStatus_ != 0 ? trustedStatus_ : Answer(domains, release, trusted_);
    };
    script_.getDomainTrustState = [this] {
      asked_.push_back("state");
      return TRUST_STATE_HEALTHY;
    };
    script_.getDomainTrustRelationship = [this](const char* domain) {
      asked_.push_back(std::string("relationship ") + domain);
      return TRUST_RELATIONSHIP_TWO_WAY;
    };
    script_.getSmartCardEnabledServices = [this](char*** names, auto* release) {
      asked_.push_back("services");
      return servicesStatus_ != 0 ? servicesStatus_ : Answer(names, release, Words{"login"});
    };
  }

  bool SmartCardsEnabled(const char* service) const {
    return cache_.IsSmartCardAuthenticationEnabled(&service, 1);
  }

  /// The last line, with its number of milliseconds replaced by "N".
  static LogLine LastLine() {
    LogLine line = RecordedLog().back();
    const auto digits = line.text.find_first_of("0123456789");
    if (digits != std::string::npos) {
      line.text.replace(digits, line.text.find_first_not_of("0123456789", digits) - digits, "N");
    }
    return line;
  }

  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  StoreProbe store_{60};
  ADCache& cache_ = StoreProbe::_adCache;
  std::string joined_ = "example.test";
  std::vector<NamePair> trusted_{{"b.test", "B"}, {"a.test", "A"}};
  std::uint32_t trustedStatus_ = 0;
  std::uint32_t servicesStatus_ = 0;
  Words asked_;  // By one worker at a time, each of which has ended before the next is started.
};

const LogLine COMPLETE{LOG_DEBUG, "AD cache updated in N ms"};
const LogLine PARTIAL{LOG_WARNING, "AD cache updated partially in N ms"};

TEST_F(CacheRefreshTest, AMemberIsAskedEverythingInOrder) {
  store_.UpdateCache(std::nullopt);
  EXPECT_EQ(asked_, (Words{"domain", "trusted", "state", "trusted", "relationship example.test",
                           "relationship b.test", "relationship a.test", "services"}));
  EXPECT_EQ(RecordedLog().size(), 1U);
  EXPECT_EQ(LastLine(), COMPLETE);
}

TEST_F(CacheRefreshTest, AHostThatIsNotJoinedIsAskedForItsConfigurationOnly) {
  joined_ = "";
  store_.UpdateCache(std::nullopt);
  EXPECT_EQ(asked_, (Words{"domain"}));
  EXPECT_EQ(RecordedLog().size(), 1U);
  EXPECT_EQ(LastLine(), COMPLETE);
}

TEST_F(CacheRefreshTest, EverythingReachesTheCache) {
  store_.UpdateCache(true);
  EXPECT_EQ(cache_.GetConfiguration().activeDomain.dnsName, "example.test");
  EXPECT_EQ(cache_.GetTrustedDomains().size(), 2U);
  EXPECT_EQ(cache_.GetDomainTrustState(), TRUST_STATE_HEALTHY);
  EXPECT_EQ(cache_.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_TWO_WAY);
  EXPECT_TRUE(SmartCardsEnabled("login"));
}

TEST_F(CacheRefreshTest, ThePolicyIsSetOnlyWhenOneIsGiven) {
  store_.UpdateCache(std::nullopt);
  EXPECT_FALSE(SmartCardsEnabled("login"));
  store_.UpdateCache(true);
  EXPECT_TRUE(SmartCardsEnabled("login"));
  store_.UpdateCache(std::nullopt);
  EXPECT_TRUE(SmartCardsEnabled("login"));
  store_.UpdateCache(false);
  EXPECT_FALSE(SmartCardsEnabled("login"));
}

TEST_F(CacheRefreshTest, DeactivatingNeverChangesThePolicy) {
  store_.UpdateCache(true);
  store_.MakeInactive();
  EXPECT_TRUE(SmartCardsEnabled("login"));
}

TEST_F(CacheRefreshTest, ThePolicyIsSetOnAHostThatIsNotJoinedToo) {
  joined_ = "";
  cache_.SetSmartCardEnabledServices({"login"});
  store_.UpdateCache(true);
  EXPECT_TRUE(SmartCardsEnabled("login"));
}

TEST_F(CacheRefreshTest, AStepThatFailsIsLoggedAndTheOthersAreDone) {
  trustedStatus_ = 5;
  store_.UpdateCache(std::nullopt);
  EXPECT_EQ(asked_,
            (Words{"domain", "trusted", "state", "trusted", "relationship example.test", "services"}));
  const auto log = RecordedLog();
  ASSERT_EQ(log.size(), 3U);
  EXPECT_EQ(log[0],
            (LogLine{LOG_WARNING, "GetDomainTrustState: Call to GetTrustedDomains() failed: " + DENIED}));
  EXPECT_EQ(log[1], (LogLine{LOG_ERR, "Failed to get trusted domains: " + DENIED}));
  EXPECT_EQ(LastLine(), PARTIAL);
}

TEST_F(CacheRefreshTest, ServicesThatCannotBeHadAreLoggedAndTheOldOnesKept) {
  cache_.SetSmartCardEnabledServices({"old"});
  servicesStatus_ = 5;
  store_.UpdateCache(true);
  const auto log = RecordedLog();
  ASSERT_EQ(log.size(), 2U);
  EXPECT_EQ(log[0], (LogLine{LOG_ERR, "Failed to get smart card enabled services: " + DENIED}));
  EXPECT_EQ(LastLine(), PARTIAL);
  EXPECT_TRUE(SmartCardsEnabled("old"));
}

TEST_F(CacheRefreshTest, TheTimeIsTheMonotonicClocksInWholeMilliseconds) {
  FakeClock clock;
  joined_ = "";
  script_.getActiveDomain = [&](auto* domain, auto* release) {
    clock.MoveMonotonicClock(std::chrono::seconds(7));
    return Answer(domain, release, {"", ""});
  };
  store_.UpdateCache(std::nullopt);
  const std::string text = RecordedLog().back().text;
  const int milliseconds = std::stoi(text.substr(std::string("AD cache updated in ").size()));
  EXPECT_GE(milliseconds, 7000);
  EXPECT_LT(milliseconds, 67000);
  EXPECT_EQ(text, "AD cache updated in " + std::to_string(milliseconds) + " ms");
}

TEST_F(CacheRefreshTest, TheWallClockDoesNotCount) {
  FakeClock clock;
  joined_ = "";
  script_.getActiveDomain = [&](auto* domain, auto* release) {
    clock.MoveWallClock(std::chrono::hours(500));
    return Answer(domain, release, {"", ""});
  };
  store_.UpdateCache(std::nullopt);
  const std::string text = RecordedLog().back().text;
  EXPECT_LT(std::stoi(text.substr(std::string("AD cache updated in ").size())), 60000);
}

TEST_F(CacheRefreshTest, FetchingTheConfigurationReportsSuccess) {
  EXPECT_TRUE(store_.FetchAdConfig());
  EXPECT_TRUE(RecordedLog().empty());
}

/// A store whose own questions fail.
class FailingStore : public StoreProbe {
 public:
  using StoreProbe::StoreProbe;
  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override {
    throw std::runtime_error("overridden");
  }
};

TEST_F(CacheRefreshTest, FetchingTheConfigurationAsksTheStoresOwnOperation) {
  FailingStore store(60);
  EXPECT_FALSE(store.FetchAdConfig());
  EXPECT_EQ(RecordedLog(), (Lines{{LOG_ERR, "Failed to get AD config: overridden"}}));
}

TEST_F(CacheRefreshTest, AConfigurationThatCannotBeHadMakesTheRefreshPartial) {
  FailingStore store(60);
  store.UpdateCache(std::nullopt);
  EXPECT_EQ(LastLine(), PARTIAL);
}

TEST_F(CacheRefreshTest, FetchingServicesStoresThem) {
  cache_.SetPcscdSvcPolicyOn(true);
  EXPECT_TRUE(store_.FetchScEnabledSvcs());
  EXPECT_TRUE(SmartCardsEnabled("login"));
}

TEST_F(CacheRefreshTest, SettingServicesStoresThemInTheCacheOnSuccessOnly) {
  cache_.SetPcscdSvcPolicyOn(true);
  store_.SetSmartCardEnabledServices({"sshd"});
  EXPECT_TRUE(SmartCardsEnabled("sshd"));
  script_.setSmartCardEnabledServices = [](auto...) { return 5U; };
  EXPECT_THROW(store_.SetSmartCardEnabledServices({"su"}), AccessDeniedException);
  EXPECT_TRUE(SmartCardsEnabled("sshd"));
  EXPECT_FALSE(SmartCardsEnabled("su"));
}

TEST_F(CacheRefreshTest, FetchingTheTrustStateReportsItsOutcome) {
  EXPECT_TRUE(store_.FetchDomainTrustState());
  script_.getDomainTrustState = []() -> TrustState { throw AccessDeniedException(); };
  EXPECT_FALSE(store_.FetchDomainTrustState());
  EXPECT_EQ(RecordedLog(), (Lines{{LOG_ERR, "Failed to get domain trust state: " + DENIED}}));
}

TEST_F(CacheRefreshTest, WhatIsNotALibraryExceptionLeavesTheFetchOfServices) {
  script_.getSmartCardEnabledServices = [](auto...) -> std::uint32_t { throw std::out_of_range("inside"); };
  EXPECT_THROW(store_.FetchScEnabledSvcs(), std::out_of_range);
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(CacheRefreshTest, WhatIsNotALibraryExceptionLeavesTheFetchOfTheTrustState) {
  VelmorThreadUtil::SetScheduler([](std::function<void()>) { throw std::out_of_range("pool is full"); });
  EXPECT_THROW(store_.FetchDomainTrustState(), std::out_of_range);
  VelmorThreadUtil::SetScheduler(nullptr);
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(CacheRefreshTest, AnyStandardExceptionIsCaughtByTheOtherFetches) {
  cache_.SetTrustedDomains({Domain("a.test", "A")});
  VelmorThreadUtil::SetScheduler([](std::function<void()>) { throw std::out_of_range("pool is full"); });
  EXPECT_FALSE(store_.FetchAdConfig());
  EXPECT_FALSE(store_.FetchTrustedDomains());
  EXPECT_FALSE(store_.FetchTrustRelationships());
  VelmorThreadUtil::SetScheduler(nullptr);
  EXPECT_EQ(RecordedLog(), (Lines{{LOG_ERR, "Failed to get AD config: pool is full"},
                                  {LOG_ERR, "Failed to get trusted domains: pool is full"},
                                  {LOG_ERR, "Failed to get trust relationship for : pool is full"},
                                  {LOG_ERR, "Failed to get trust relationship for a.test: pool is full"}}));
}

TEST_F(CacheRefreshTest, FetchingTrustedDomainsReportsItsOutcome) {
  EXPECT_TRUE(store_.FetchTrustedDomains());
  trustedStatus_ = 5;
  EXPECT_FALSE(store_.FetchTrustedDomains());
  EXPECT_EQ(RecordedLog(), (Lines{{LOG_ERR, "Failed to get trusted domains: " + DENIED}}));
}

TEST_F(CacheRefreshTest, FetchingRelationshipsGoesOnAfterADomainThatFails) {
  store_.UpdateCache(std::nullopt);
  testsupport::ForgetLog();
  asked_.clear();
  script_.getDomainTrustRelationship = [this](const char* domain) -> TrustRelationship {
    asked_.push_back(domain);
    if (domain == std::string("b.test")) {
      throw AccessDeniedException();
    }
    return TRUST_RELATIONSHIP_INBOUND;
  };
  EXPECT_FALSE(store_.FetchTrustRelationships());
  EXPECT_EQ(asked_, (Words{"example.test", "b.test", "a.test"}));
  EXPECT_EQ(RecordedLog(), (Lines{{LOG_ERR, "Failed to get trust relationship for b.test: " + DENIED}}));
  EXPECT_EQ(cache_.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_INBOUND);
  EXPECT_EQ(cache_.GetDomainTrustRelationship("b.test"), 6U);
}

TEST_F(CacheRefreshTest, ARelationshipThatIsLateIsDroppedUntilItsWorkerEnds) {
  store_.UpdateCache(std::nullopt);
  testsupport::Gate gate;
  script_.getDomainTrustRelationship = [&](const char* domain) {
    if (domain == std::string("b.test")) {
      gate.Pass();
      return TRUST_RELATIONSHIP_OUTBOUND;
    }
    return TRUST_RELATIONSHIP_INBOUND;
  };
  {
    // The callers' time is over before they wait; the workers of the others have ended when they look.
    FakeClock clock;
    clock.MoveWallClock(std::chrono::hours(-1));
    EXPECT_TRUE(store_.FetchTrustRelationships());
  }
  EXPECT_EQ(cache_.GetDomainTrustRelationship("b.test"), 6U);
  gate.Open();
  while (StoreProbe::RequestsInFlight() != 0) {
    std::this_thread::yield();
  }
  EXPECT_EQ(cache_.GetDomainTrustRelationship("b.test"), TRUST_RELATIONSHIP_OUTBOUND);
}

TEST_F(CacheRefreshTest, RelationshipsOfDomainsThatAreTrustedNoMoreAreDropped) {
  store_.UpdateCache(std::nullopt);
  trusted_ = {{"a.test", "A"}};
  store_.UpdateCache(std::nullopt);
  EXPECT_EQ(cache_.GetDomainTrustRelationship("b.test"), 6U);
  EXPECT_EQ(cache_.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_TWO_WAY);
}

TEST_F(CacheRefreshTest, ActivatingRunsTheWholeRefresh) {
  testsupport::WriteFile(testsupport::AUTHENTICATION_CONF, "remote-authentication-store = \"None\"\n");
  store_.MakeActive();
  EXPECT_EQ(asked_.size(), 8U);
  EXPECT_EQ(LastLine(), COMPLETE);
}

}  // namespace
}  // namespace quenix::authentication
