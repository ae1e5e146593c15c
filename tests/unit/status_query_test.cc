// The questions of the Active Directory store: answered by the plug-in, or from the cache when that is late.

#include <gtest/gtest.h>
#include <sys/time.h>
#include <syslog.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <typeinfo>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/clock.h"
#include "support/expect_throw_what.h"
#include "support/gate.h"
#include "support/interpose.h"
#include "support/log_recorder.h"
#include "unit/store_probe.h"

namespace quenix::authentication {
namespace {

using testsupport::Answer;
using testsupport::FakeClock;
using testsupport::Gate;
using testsupport::LogLine;
using testsupport::NamePair;
using testsupport::RecordedLog;
using testsupport::StoreProbe;
using testsupport::TakeOver;
namespace calls = testsupport::calls;

using Lines = std::vector<LogLine>;

class StatusQueryTest : public ::testing::Test {
 protected:
  ~StatusQueryTest() override {
    gate_.Open();
    while (StoreProbe::RequestsInFlight() != 0) {
      std::this_thread::yield();
    }
  }

  /// From now on the callers' time is over before they wait, and workers stop at the gate.
  void Hang() {
    clock_ = std::make_unique<FakeClock>();
    clock_->MoveWallClock(std::chrono::hours(-1));
  }

  void WorkersEnd() {
    gate_.Open();
    while (StoreProbe::RequestsInFlight() != 0) {
      std::this_thread::yield();
    }
  }

  void AnswerTrustedDomains(const std::vector<NamePair>& answer) {
    script_.getTrustedDomains = [this, answer](auto*** domains, auto* release) {
      ++calls_;
      return Answer(domains, release, answer);
    };
  }

  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  StoreProbe store_{60};
  ADCache& cache_ = StoreProbe::_adCache;
  Gate gate_;
  std::unique_ptr<FakeClock> clock_;
  std::atomic<int> calls_{0};
};

TEST_F(StatusQueryTest, TrustedDomainsAreThePlugins) {
  AnswerTrustedDomains({{"b.test", "B"}, {"a.test", "A"}});
  const std::deque<Domain> domains = store_.GetTrustedDomains();
  ASSERT_EQ(domains.size(), 2U);
  EXPECT_EQ(domains[0].dnsName, "b.test");
  EXPECT_EQ(domains[1].netbiosName, "A");
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(StatusQueryTest, EachQuestionAsksAnew) {
  AnswerTrustedDomains({});
  store_.GetTrustedDomains();
  store_.GetTrustedDomains();
  EXPECT_EQ(calls_, 2);
}

TEST_F(StatusQueryTest, TheConfigurationIsANewObjectOnEachCall) {
  script_.getMachineAccountDN = [](char** text, auto* release) { return Answer(text, release, "CN=HOST"); };
  const auto first = store_.GetStoreConfiguration();
  const auto second = store_.GetStoreConfiguration();
  EXPECT_NE(first, second);
  const StoreConfiguration& configuration = *first;
  EXPECT_TRUE(typeid(configuration) == typeid(ActiveDirectoryStoreConfiguration));
  EXPECT_EQ(dynamic_cast<ActiveDirectoryStoreConfiguration&>(*first).machineAccountDN, "CN=HOST");
}

TEST_F(StatusQueryTest, TheTrustStateIsThePlugins) {
  script_.getDomainTrustState = [] { return static_cast<TrustState>(4711); };
  EXPECT_EQ(store_.GetDomainTrustState(), 4711U);
}

TEST_F(StatusQueryTest, TheTrustRelationshipIsThePlugins) {
  script_.getDomainTrustRelationship = [](const char* domain) {
    return domain == std::string("other.test") ? TRUST_RELATIONSHIP_INBOUND : TRUST_RELATIONSHIP_NONE;
  };
  EXPECT_EQ(store_.GetDomainTrustRelationship("other.test"), TRUST_RELATIONSHIP_INBOUND);
}

TEST_F(StatusQueryTest, TheRequestsHaveTheirKeys) {
  std::vector<std::string> keys;
  const auto note = [&](const std::string& key) {
    if (StoreProbe::IsInFlight(key)) {
      keys.push_back(key);
    }
  };
  script_.getActiveDomain = [&](auto* domain, auto* release) {
    note("StoreConfig");
    return Answer(domain, release, {"", ""});
  };
  script_.getTrustedDomains = [&](auto*** domains, auto* release) {
    note("TrustedDomains");
    return Answer(domains, release, std::vector<NamePair>());
  };
  script_.getDomainTrustState = [&] {
    note("TrustState");
    return TRUST_STATE_HEALTHY;
  };
  script_.getDomainTrustRelationship = [&](const char*) {
    note("TrustRelationship:other.test");
    return TRUST_RELATIONSHIP_NONE;
  };
  store_.GetStoreConfiguration();
  store_.GetDomainTrustState();
  store_.GetDomainTrustRelationship("other.test");
  EXPECT_EQ(keys, (std::vector<std::string>{"StoreConfig", "TrustedDomains", "TrustState",
                                            "TrustRelationship:other.test"}));
}

TEST_F(StatusQueryTest, CallersWaitAsLongAsTheStoreSays) {
  StoreProbe store(17);
  timespec deadline{};
  FakeClock clock;
  const TakeOver look(calls::pthreadCondTimedwait,
                      [&](pthread_cond_t*, pthread_mutex_t*, const timespec* time) {
                        deadline = *time;
                        return ETIMEDOUT;
                      });
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>());
  };
  timeval before{};
  gettimeofday(&before, nullptr);
  store.GetTrustedDomains();
  timeval after{};
  gettimeofday(&after, nullptr);
  EXPECT_GE(deadline.tv_sec, before.tv_sec + 17);
  EXPECT_LE(deadline.tv_sec, after.tv_sec + 17);
  WorkersEnd();
}

TEST_F(StatusQueryTest, TwoCallersAtOnceCauseOneCallAndShareItsAnswer) {
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    ++calls_;
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>{{"a.test", "A"}});
  };
  std::atomic<int> waiting{0};
  const TakeOver watch(calls::pthreadCondTimedwait,
                       [&](pthread_cond_t* condition, pthread_mutex_t* mutex, const timespec* deadline) {
                         ++waiting;
                         return calls::pthreadCondTimedwait.Real(condition, mutex, deadline);
                       });
  std::atomic<int> answered{0};
  std::vector<std::thread> callers;
  for (int index = 0; index < 2; ++index) {
    callers.emplace_back([&] { answered += static_cast<int>(store_.GetTrustedDomains().size()); });
  }
  while (waiting < 2) {
    std::this_thread::yield();
  }
  gate_.Open();
  for (std::thread& caller : callers) {
    caller.join();
  }
  EXPECT_EQ(calls_, 1);
  EXPECT_EQ(answered, 2);
}

TEST_F(StatusQueryTest, TwoCallersAtOnceShareItsFailure) {
  script_.getTrustedDomains = [this](auto...) {
    ++calls_;
    gate_.Pass();
    return 1355U;
  };
  std::atomic<int> waiting{0};
  const TakeOver watch(calls::pthreadCondTimedwait,
                       [&](pthread_cond_t* condition, pthread_mutex_t* mutex, const timespec* deadline) {
                         ++waiting;
                         return calls::pthreadCondTimedwait.Real(condition, mutex, deadline);
                       });
  std::atomic<int> failed{0};
  std::vector<std::thread> callers;
  for (int index = 0; index < 2; ++index) {
    callers.emplace_back([&] {
      try {
        store_.GetTrustedDomains();
      } catch (const NoSuchDomainException&) {
        ++failed;
      }
    });
  }
  while (waiting < 2) {
    std::this_thread::yield();
  }
  gate_.Open();
  for (std::thread& caller : callers) {
    caller.join();
  }
  EXPECT_EQ(calls_, 1);
  EXPECT_EQ(failed, 2);
}

TEST_F(StatusQueryTest, AFailureIsThrownAndNothingIsAnsweredFromTheCache) {
  cache_.SetTrustedDomains({Domain("old.test", "OLD")});
  script_.getTrustedDomains = [](auto...) { return 5U; };
  EXPECT_THROW_WHAT(store_.GetTrustedDomains(), AccessDeniedException,
                    "Exception 0x00000005: Access is denied.");
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(StatusQueryTest, LateTrustedDomainsAreAnsweredFromTheCache) {
  cache_.SetTrustedDomains({Domain("old.test", "OLD")});
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>{{"new.test", "NEW"}});
  };
  Hang();
  ASSERT_EQ(store_.GetTrustedDomains().size(), 1U);
  EXPECT_EQ(cache_.GetTrustedDomains()[0].dnsName, "old.test");
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING, "GetTrustedDomains call timedout. Returning cached value."}}));
  WorkersEnd();
  EXPECT_EQ(cache_.GetTrustedDomains()[0].dnsName, "new.test");
}

TEST_F(StatusQueryTest, ALateConfigurationIsAnsweredFromTheCache) {
  ActiveDirectoryStoreConfiguration old;
  old.machineAccountDN = "CN=OLD";
  cache_.SetConfiguration(std::move(old));
  script_.getActiveDomain = [this](auto* domain, auto* release) {
    gate_.Pass();
    return Answer(domain, release, {"", ""});
  };
  Hang();
  const auto configuration = store_.GetStoreConfiguration();
  EXPECT_EQ(dynamic_cast<ActiveDirectoryStoreConfiguration&>(*configuration).machineAccountDN, "CN=OLD");
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING, "GetStoreConfiguration call timedout. Returning cached value."}}));
  WorkersEnd();
  EXPECT_EQ(cache_.GetConfiguration().machineAccountDN, "");
}

TEST_F(StatusQueryTest, ALateRelationshipIsAnsweredFromTheCache) {
  cache_.SetDomainTrustRelationship("other.test", TRUST_RELATIONSHIP_OUTBOUND);
  script_.getDomainTrustRelationship = [this](const char*) {
    gate_.Pass();
    return TRUST_RELATIONSHIP_TWO_WAY;
  };
  Hang();
  EXPECT_EQ(store_.GetDomainTrustRelationship("other.test"), TRUST_RELATIONSHIP_OUTBOUND);
  EXPECT_EQ(store_.GetDomainTrustRelationship("unknown.test"), 6U);
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING,
                    "GetDomainTrustRelationship call timedout. Returning cached value for other.test."},
                   {LOG_WARNING,
                    "GetDomainTrustRelationship call timedout. Returning cached value for unknown.test."}}));
  WorkersEnd();
  EXPECT_EQ(cache_.GetDomainTrustRelationship("other.test"), TRUST_RELATIONSHIP_TWO_WAY);
}

TEST_F(StatusQueryTest, ALateTrustStateIsTwoAndStaysTwoUntilTheWorkerEnds) {
  cache_.SetDomainTrustState(TRUST_STATE_HEALTHY);
  script_.getDomainTrustState = [this] {
    gate_.Pass();
    return static_cast<TrustState>(4711);
  };
  Hang();
  EXPECT_EQ(store_.GetDomainTrustState(), 2U);
  EXPECT_EQ(cache_.GetDomainTrustState(), 2U);
  EXPECT_EQ(RecordedLog().back(),
            (LogLine{LOG_WARNING, "GetDomainTrustState call timedout. Returning cached value."}));
  WorkersEnd();
  EXPECT_EQ(cache_.GetDomainTrustState(), 4711U);
}

TEST_F(StatusQueryTest, TheCachedTrustStateIsSetAfterTheLogLine) {
  cache_.SetDomainTrustState(TRUST_STATE_HEALTHY);
  std::vector<TrustState> states;
  testsupport::ObserveLog([&](const LogLine&) { states.push_back(cache_.GetDomainTrustState()); });
  script_.getDomainTrustState = [this] {
    gate_.Pass();
    return TRUST_STATE_HEALTHY;
  };
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>());
  };
  Hang();
  store_.GetDomainTrustState();
  EXPECT_EQ(states, (std::vector<TrustState>{TRUST_STATE_HEALTHY, TRUST_STATE_HEALTHY}));
  EXPECT_EQ(cache_.GetDomainTrustState(), 2U);
  testsupport::ObserveLog(nullptr);
  WorkersEnd();
}

TEST_F(StatusQueryTest, AQuestionAfterALateOneAttachesToTheSameRequest) {
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    ++calls_;
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>());
  };
  Hang();
  store_.GetTrustedDomains();
  store_.GetTrustedDomains();
  gate_.AwaitArrivals(1);
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 1U);
  WorkersEnd();
  EXPECT_EQ(calls_, 1);
}

TEST_F(StatusQueryTest, OtherStoresAttachToTheSameRequest) {
  const StoreProbe other(60);
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    ++calls_;
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>());
  };
  Hang();
  store_.GetTrustedDomains();
  other.GetTrustedDomains();
  WorkersEnd();
  EXPECT_EQ(calls_, 1);
}

TEST_F(StatusQueryTest, ALateQuestionDoesNotHoldOtherQuestions) {
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>());
  };
  std::thread caller([this] { store_.GetTrustedDomains(); });
  gate_.AwaitArrivals(1);
  EXPECT_EQ(store_.GetDomainTrustRelationship("other.test"), TRUST_RELATIONSHIP_TWO_WAY);
  EXPECT_EQ(cache_.GetDomainTrustState(), 7U);
  gate_.Open();
  caller.join();
}

TEST_F(StatusQueryTest, TheWorkerKeepsThePluginWhenTheStoreIsGone) {
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>{{"a.test", "A"}});
  };
  std::atomic<int> closed{0};
  const TakeOver watch(calls::dlclose, [&](void* handle) {
    ++closed;
    return calls::dlclose.Real(handle);
  });
  Hang();
  {
    const StoreProbe store(60);
    store.GetTrustedDomains();
  }
  EXPECT_EQ(closed, 0);
  WorkersEnd();
  EXPECT_EQ(cache_.GetTrustedDomains().size(), 1U);
  while (closed == 0) {
    std::this_thread::yield();
  }
}

TEST_F(StatusQueryTest, AThreadThatCannotBeStartedIsReported) {
  const TakeOver refuse(calls::pthreadCreate, [](auto...) { return EAGAIN; });
  EXPECT_THROW_WHAT(store_.GetTrustedDomains(), ThreadErrorException, "Thread Error: ate failed. RC=");
  EXPECT_THROW_WHAT(store_.GetStoreConfiguration(), ThreadErrorException, "Thread Error: ate failed. RC=");
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
}

TEST_F(StatusQueryTest, AWaitThatFailsIsReported) {
  {
    const TakeOver fail(calls::pthreadCondTimedwait, [](auto...) { return EINVAL; });
    script_.getTrustedDomains = [this](auto*** domains, auto* release) {
      gate_.Pass();
      return Answer(domains, release, std::vector<NamePair>());
    };
    EXPECT_THROW_WHAT(store_.GetTrustedDomains(), ThreadErrorException, "Thread Error:  failed. RC=");
  }
  WorkersEnd();
}

TEST_F(StatusQueryTest, TheTrustStateAsksForTrustedDomainsFirst) {
  std::vector<std::string> asked;
  script_.getTrustedDomains = [&](auto*** domains, auto* release) {
    asked.push_back("domains");
    return Answer(domains, release, std::vector<NamePair>{{"a.test", "A"}});
  };
  script_.getDomainTrustState = [&] {
    asked.push_back("state");
    return TRUST_STATE_HEALTHY;
  };
  EXPECT_EQ(store_.GetDomainTrustState(), TRUST_STATE_HEALTHY);
  EXPECT_EQ(asked, (std::vector<std::string>{"domains", "state"}));
  EXPECT_EQ(cache_.GetTrustedDomains().size(), 1U);
}

TEST_F(StatusQueryTest, AMissingFileMakesTheTrustStateSevenWithoutAskingForIt) {
  cache_.SetDomainTrustState(TRUST_STATE_HEALTHY);
  script_.getTrustedDomains = [](auto...) { return 2U; };
  script_.getDomainTrustState = [this] {
    ++calls_;
    return TRUST_STATE_HEALTHY;
  };
  EXPECT_EQ(store_.GetDomainTrustState(), 7U);
  EXPECT_EQ(cache_.GetDomainTrustState(), 7U);
  EXPECT_EQ(calls_, 0);
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(StatusQueryTest, AnyOtherFailureOfTheTrustedDomainsIsLoggedAndTheTrustStateAsked) {
  script_.getTrustedDomains = [](auto...) { return 5U; };
  EXPECT_EQ(store_.GetDomainTrustState(), TRUST_STATE_HEALTHY);
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING,
                    "GetDomainTrustState: Call to GetTrustedDomains() failed: Exception 0x00000005: "
                    "Access is denied."}}));
}

TEST_F(StatusQueryTest, LateTrustedDomainsAndALateTrustStateAreTwoWaits) {
  script_.getTrustedDomains = [this](auto*** domains, auto* release) {
    gate_.Pass();
    return Answer(domains, release, std::vector<NamePair>());
  };
  script_.getDomainTrustState = [this] {
    gate_.Pass();
    return TRUST_STATE_HEALTHY;
  };
  Hang();
  EXPECT_EQ(store_.GetDomainTrustState(), 2U);
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING, "GetTrustedDomains call timedout. Returning cached value."},
                   {LOG_WARNING, "GetDomainTrustState call timedout. Returning cached value."}}));
  WorkersEnd();
}

TEST_F(StatusQueryTest, AThreadErrorOfTheTrustedDomainsIsLoggedAndTheTrustStateAsked) {
  int created = 0;
  const TakeOver refuseFirst(calls::pthreadCreate, [&](pthread_t* thread, const pthread_attr_t* attributes,
                                                       void* (*start)(void*), void* argument) {
    return created++ == 0 ? EAGAIN : calls::pthreadCreate.Real(thread, attributes, start, argument);
  });
  EXPECT_EQ(store_.GetDomainTrustState(), TRUST_STATE_HEALTHY);
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING,
                    "GetDomainTrustState: Call to GetTrustedDomains() failed: Thread Error: ate failed. "
                    "RC="}}));
}

TEST_F(StatusQueryTest, AnInstalledSchedulerRunsTheWork) {
  std::vector<std::thread> pool;
  VelmorThreadUtil::SetScheduler([&](std::function<void()> work) { pool.emplace_back(std::move(work)); });
  AnswerTrustedDomains({{"a.test", "A"}});
  EXPECT_EQ(store_.GetTrustedDomains().size(), 1U);
  ASSERT_EQ(pool.size(), 1U);
  pool[0].join();
  VelmorThreadUtil::SetScheduler(nullptr);
}

}  // namespace
}  // namespace quenix::authentication
