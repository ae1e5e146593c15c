// Requests that several callers share, and the workers that end them.

#include <gtest/gtest.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <exception>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/gate.h"
#include "support/interpose.h"
#include "unit/store_probe.h"

namespace quenix::authentication {
namespace {

using testsupport::Answer;
using testsupport::Gate;
using testsupport::NamePair;
using testsupport::StoreProbe;
using testsupport::TakeOver;
namespace calls = testsupport::calls;

/// A host's scheduler that keeps the work until the test runs it.
class KeptWork {
 public:
  KeptWork() {
    VelmorThreadUtil::SetScheduler([this](std::function<void()> work) { work_.push_back(std::move(work)); });
  }
  KeptWork(const KeptWork&) = delete;
  KeptWork& operator=(const KeptWork&) = delete;
  ~KeptWork() { VelmorThreadUtil::SetScheduler(nullptr); }

  std::size_t Count() const { return work_.size(); }

  /// Runs the oldest piece.
  void RunNext() {
    const std::function<void()> work = std::move(work_.front());
    work_.erase(work_.begin());
    work();
  }

 private:
  std::vector<std::function<void()>> work_;
};

TEST(RequestTest, TheWorkReceivesItsKeyAndEndsTheRequest) {
  std::string received;
  const auto request = StoreProbe::StartOrAttachToRequest("a key", [&](const std::string& key) {
    received = key;
    StoreProbe::FinishRequest(key, nullptr);
  });
  request->WaitResult(60);
  EXPECT_EQ(received, "a key");
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
}

TEST(RequestTest, WhileItRunsOthersAttachToIt) {
  KeptWork kept;
  const auto first = StoreProbe::StartOrAttachToRequest(
      "key", [](const std::string& key) { StoreProbe::FinishRequest(key, nullptr); });
  bool secondRan = false;
  const auto second =
      StoreProbe::StartOrAttachToRequest("key", [&](const std::string&) { secondRan = true; });
  EXPECT_EQ(first, second);
  EXPECT_EQ(kept.Count(), 1U);
  kept.RunNext();
  EXPECT_FALSE(secondRan);
  first->WaitResult(0);
}

TEST(RequestTest, OnceItHasEndedANewOneIsStarted) {
  KeptWork kept;
  const auto finish = [](const std::string& key) { StoreProbe::FinishRequest(key, nullptr); };
  const auto first = StoreProbe::StartOrAttachToRequest("key", finish);
  kept.RunNext();
  const auto second = StoreProbe::StartOrAttachToRequest("key", finish);
  EXPECT_NE(first, second);
  EXPECT_EQ(kept.Count(), 1U);
  EXPECT_THROW(second->WaitResult(0), ProviderCallTimedOutException);
  kept.RunNext();
}

TEST(RequestTest, DifferentKeysRunSideBySide) {
  KeptWork kept;
  const auto finish = [](const std::string& key) { StoreProbe::FinishRequest(key, nullptr); };
  const auto first = StoreProbe::StartOrAttachToRequest("key", finish);
  const auto second = StoreProbe::StartOrAttachToRequest("Key", finish);
  EXPECT_NE(first, second);
  EXPECT_EQ(kept.Count(), 2U);
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 2U);
  kept.RunNext();
  kept.RunNext();
}

TEST(RequestTest, TheRequestIsDoneBeforeItsKeyIsFree) {
  // Whoever finds the key free must find the request done: both happen under one lock.
  KeptWork kept;
  const auto request = StoreProbe::StartOrAttachToRequest("key", [](const std::string& key) {
    StoreProbe::FinishRequest(key, std::make_unique<IOError>("failed"));
  });
  EXPECT_TRUE(StoreProbe::IsInFlight("key"));
  kept.RunNext();
  EXPECT_FALSE(StoreProbe::IsInFlight("key"));
  EXPECT_THROW_WHAT(request->WaitResult(0), IOError, "failed");
}

TEST(RequestTest, AThreadThatCannotBeStartedRemovesTheRequest) {
  {
    const TakeOver refuse(calls::pthreadCreate, [](auto...) { return EAGAIN; });
    EXPECT_THROW_WHAT(StoreProbe::StartOrAttachToRequest("key", [](const std::string&) {}),
                      ThreadErrorException, "Thread Error: ate failed. RC=");
  }
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
  const auto request = StoreProbe::StartOrAttachToRequest(
      "key", [](const std::string& key) { StoreProbe::FinishRequest(key, nullptr); });
  request->WaitResult(60);
}

/// Starts a request through a scheduler that hands the work on and then throws. The work says in `ran` that
/// it ran, and ends its request.
void StartThroughAFailingScheduler(const std::function<void(std::function<void()>)>& handOn, bool& ran) {
  VelmorThreadUtil::SetScheduler([&](std::function<void()> work) {
    handOn(std::move(work));
    throw std::runtime_error("pool is closing");
  });
  const auto work = [&ran](const std::string& key) {
    ran = true;
    StoreProbe::FinishRequest(key, std::make_unique<IOError>("of the first"));
  };
  EXPECT_THROW_WHAT(StoreProbe::StartOrAttachToRequest("key", work), std::runtime_error, "pool is closing");
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
  VelmorThreadUtil::SetScheduler(nullptr);
}

TEST(RequestTest, WorkOfWhichTheSchedulerThrewDoesNothing) {
  std::function<void()> queued;
  bool ran = false;
  StartThroughAFailingScheduler([&](std::function<void()> work) { queued = std::move(work); }, ran);
  queued();
  EXPECT_FALSE(ran);
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
}

TEST(RequestTest, WorkThatStartsBeforeTheSchedulerThrowsDoesNothing) {
  std::thread pool;
  bool ran = false;
  StartThroughAFailingScheduler([&](std::function<void()> work) { pool = std::thread(std::move(work)); },
                                ran);
  pool.join();
  EXPECT_FALSE(ran);
}

TEST(RequestTest, WorkOfWhichTheSchedulerThrewDoesNotEndALaterRequest) {
  std::function<void()> queued;
  bool ran = false;
  StartThroughAFailingScheduler([&](std::function<void()> work) { queued = std::move(work); }, ran);
  KeptWork kept;
  const auto later = StoreProbe::StartOrAttachToRequest(
      "key", [](const std::string& key) { StoreProbe::FinishRequest(key, nullptr); });
  queued();
  EXPECT_FALSE(ran);
  EXPECT_TRUE(StoreProbe::IsInFlight("key"));
  EXPECT_THROW(later->WaitResult(0), ProviderCallTimedOutException);
  kept.RunNext();
  later->WaitResult(0);
  EXPECT_FALSE(StoreProbe::IsInFlight("key"));
}

TEST(RequestTest, WorkThatIsRunTwiceEndsItsOwnRequestOnly) {
  std::function<void()> queued;
  VelmorThreadUtil::SetScheduler([&](std::function<void()> work) { queued = std::move(work); });
  const auto finish = [](const std::string& key) { StoreProbe::FinishRequest(key, nullptr); };
  StoreProbe::StartOrAttachToRequest("key", finish);
  queued();
  KeptWork kept;
  const auto later = StoreProbe::StartOrAttachToRequest("key", finish);
  queued();
  EXPECT_THROW(later->WaitResult(0), ProviderCallTimedOutException);
  kept.RunNext();
  later->WaitResult(0);
}

TEST(RequestTest, EndingARequestThatIsNotInFlightDoesNothing) {
  StoreProbe::FinishRequest("key", nullptr);
  StoreProbe::FinishRequest("key", std::make_unique<IOError>("failed"));
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
}

TEST(RequestTest, TheLockIsFreeAfterASchedulingFailure) {
  VelmorThreadUtil::SetScheduler([](std::function<void()>) { throw std::runtime_error("no"); });
  EXPECT_THROW(StoreProbe::StartOrAttachToRequest("key", [](const std::string&) {}), std::runtime_error);
  VelmorThreadUtil::SetScheduler(nullptr);
  std::size_t inFlight = 1;
  std::thread([&] { inFlight = StoreProbe::RequestsInFlight(); }).join();
  EXPECT_EQ(inFlight, 0U);
}

class WorkerTest : public ::testing::Test {
 protected:
  using Worker = std::function<void(const std::string&)>;

  /// Runs a worker as the store does, and returns its request.
  std::shared_ptr<RequestState> Run(const Worker& worker) {
    KeptWork kept;
    auto request = StoreProbe::StartOrAttachToRequest("key", worker);
    kept.RunNext();
    return request;
  }

  /// Runs a worker that cannot complete its request, since that takes the lock, until its answer is cached.
  static void ExpectCachedWhileInFlight(const Worker& worker, const std::function<bool()>& isCached) {
    Gate gate;
    const auto request = StoreProbe::StartOrAttachToRequest("key", [&gate, worker](const std::string& key) {
      gate.Pass();
      worker(key);
    });
    gate.AwaitArrivals(1);
    {
      const MutexLock lock(StoreProbe::_lock);
      gate.Open();
      const auto limit = std::chrono::steady_clock::now() + std::chrono::seconds(20);
      while (!isCached() && std::chrono::steady_clock::now() < limit) {
        std::this_thread::yield();
      }
      EXPECT_TRUE(isCached());
    }
    request->WaitResult(60);
  }

  Worker TrustedDomains() {
    return [this](const std::string& key) { StoreProbe::GetTrustedDomainsInt(provider_, key); };
  }
  Worker State() {
    return [this](const std::string& key) { StoreProbe::GetDomainTrustStateInt(provider_, key); };
  }
  Worker Relationship() {
    return [this](const std::string& key) {
      StoreProbe::GetDomainTrustRelationshipInt(provider_, key, "other.test");
    };
  }
  Worker Configuration() {
    return [this](const std::string& key) { StoreProbe::GetStoreConfigurationInt(provider_, key); };
  }

  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  std::shared_ptr<ActiveDirectoryProvider> provider_ = std::make_shared<ActiveDirectoryProvider>("scripted");
  ADCache& cache_ = StoreProbe::_adCache;
};

TEST_F(WorkerTest, AnswersReachTheCacheBeforeTheirRequestsAreDone) {
  script_.getTrustedDomains = [](auto*** domains, auto* release) {
    return Answer(domains, release, std::vector<NamePair>{{"a.test", "A"}});
  };
  script_.getDomainTrustState = [] { return TRUST_STATE_HEALTHY; };
  script_.getDomainTrustRelationship = [](const char*) { return TRUST_RELATIONSHIP_TWO_WAY; };
  script_.getMachineAccountDN = [](char** text, auto* release) { return Answer(text, release, "CN=HOST"); };
  ExpectCachedWhileInFlight(TrustedDomains(), [this] { return !cache_.GetTrustedDomains().empty(); });
  ExpectCachedWhileInFlight(State(), [this] { return cache_.GetDomainTrustState() == TRUST_STATE_HEALTHY; });
  ExpectCachedWhileInFlight(Relationship(), [this] {
    return cache_.GetDomainTrustRelationship("other.test") == TRUST_RELATIONSHIP_TWO_WAY;
  });
  ExpectCachedWhileInFlight(Configuration(),
                            [this] { return cache_.GetConfiguration().machineAccountDN == "CN=HOST"; });
}

TEST_F(WorkerTest, TrustedDomainsReachTheCache) {
  script_.getTrustedDomains = [](auto*** domains, auto* release) {
    return Answer(domains, release, std::vector<NamePair>{{"b.test", "B"}, {"a.test", "A"}});
  };
  Run(TrustedDomains())->WaitResult(0);
  ASSERT_EQ(cache_.GetTrustedDomains().size(), 2U);
  EXPECT_EQ(cache_.GetTrustedDomains()[0].dnsName, "b.test");
}

TEST_F(WorkerTest, AFailureLeavesTheTrustedDomainsAsTheyWere) {
  cache_.SetTrustedDomains({Domain("old.test", "OLD")});
  script_.getTrustedDomains = [](auto...) { return 5U; };
  const auto request = Run(TrustedDomains());
  EXPECT_THROW_WHAT(request->WaitResult(0), AccessDeniedException, "Exception 0x00000005: Access is denied.");
  EXPECT_EQ(cache_.GetTrustedDomains().size(), 1U);
}

TEST_F(WorkerTest, AMissingTrustedDomainsOperationIsAnEmptyList) {
  cache_.SetTrustedDomains({Domain("old.test", "OLD")});
  script_.getTrustedDomains = [](auto...) { return 120U; };
  Run(TrustedDomains())->WaitResult(0);
  EXPECT_TRUE(cache_.GetTrustedDomains().empty());
}

TEST_F(WorkerTest, TheTrustStateReachesTheCache) {
  script_.getDomainTrustState = [] { return static_cast<TrustState>(4711); };
  Run(State())->WaitResult(0);
  EXPECT_EQ(cache_.GetDomainTrustState(), 4711U);
}

TEST_F(WorkerTest, TheTrustRelationshipReachesTheCache) {
  std::string asked;
  script_.getDomainTrustRelationship = [&](const char* domain) {
    asked = domain;
    return static_cast<TrustRelationship>(4712);
  };
  Run(Relationship())->WaitResult(0);
  EXPECT_EQ(asked, "other.test");
  EXPECT_EQ(cache_.GetDomainTrustRelationship("other.test"), 4712U);
}

TEST_F(WorkerTest, AMissingTrustOperationIsZero) {
  testsupport::InstallPlugin("null_slots");
  provider_ = std::make_shared<ActiveDirectoryProvider>("null_slots");
  cache_.SetDomainTrustRelationship("other.test", TRUST_RELATIONSHIP_TWO_WAY);
  Run(State())->WaitResult(0);
  Run(Relationship())->WaitResult(0);
  EXPECT_EQ(cache_.GetDomainTrustState(), 0U);
  EXPECT_EQ(cache_.GetDomainTrustRelationship("other.test"), 0U);
}

TEST_F(WorkerTest, ALateRelationshipHasTheStampOfThatMoment) {
  script_.getDomainTrustRelationship = [this](const char*) {
    cache_.IncreaseTrustRelationshipsGenNo();
    return TRUST_RELATIONSHIP_TWO_WAY;
  };
  Run(Relationship())->WaitResult(0);
  cache_.CleanupOldTrustRelationships();
  EXPECT_EQ(cache_.GetDomainTrustRelationship("other.test"), TRUST_RELATIONSHIP_TWO_WAY);
}

TEST_F(WorkerTest, TheConfigurationIsAskedInOrder) {
  std::vector<std::string> asked;
  script_.getActiveDomain = [&](auto* domain, auto* release) {
    asked.push_back("domain");
    return Answer(domain, release, {"example.test", "EXAMPLE"});
  };
  script_.getPreferredDomainControllers = [&](char*** names, auto* release) {
    asked.push_back("controllers");
    return Answer(names, release, std::vector<std::string>{"dc2", "dc1"});
  };
  script_.getMachineAccountDN = [&](char** text, auto* release) {
    asked.push_back("account");
    return Answer(text, release, "CN=HOST");
  };
  Run(Configuration())->WaitResult(0);
  EXPECT_EQ(asked, (std::vector<std::string>{"domain", "controllers", "account"}));
  const ActiveDirectoryStoreConfiguration configuration = cache_.GetConfiguration();
  EXPECT_EQ(configuration.activeDomain.dnsName, "example.test");
  EXPECT_EQ(configuration.activeDomain.netbiosName, "EXAMPLE");
  EXPECT_EQ(configuration.preferredDomainControllers, (std::deque<std::string>{"dc2", "dc1"}));
  EXPECT_EQ(configuration.machineAccountDN, "CN=HOST");
}

TEST_F(WorkerTest, APieceThatFailsIsEmptyAndTheOthersAreAskedAllTheSame) {
  ActiveDirectoryStoreConfiguration old;
  old.activeDomain = Domain("old.test", "OLD");
  old.preferredDomainControllers = {"old"};
  old.machineAccountDN = "CN=OLD";
  cache_.SetConfiguration(std::move(old));
  script_.getActiveDomain = [](auto...) { return 5U; };
  script_.getPreferredDomainControllers = [](auto...) { return 120U; };
  script_.getMachineAccountDN = [](char** text, auto* release) { return Answer(text, release, "CN=HOST"); };
  Run(Configuration())->WaitResult(0);
  const ActiveDirectoryStoreConfiguration configuration = cache_.GetConfiguration();
  EXPECT_EQ(configuration.activeDomain.dnsName, "");
  EXPECT_EQ(configuration.activeDomain.netbiosName, "");
  EXPECT_TRUE(configuration.preferredDomainControllers.empty());
  EXPECT_EQ(configuration.machineAccountDN, "CN=HOST");
}

TEST_F(WorkerTest, AStandardExceptionFromAPieceOfTheConfigurationIsIgnored) {
  script_.getActiveDomain = [](auto...) -> std::uint32_t { throw std::out_of_range("inside the plug-in"); };
  Run(Configuration())->WaitResult(0);
  EXPECT_FALSE(cache_.IsDomainMember());
}

/// Runs a worker out of which something leaves that no worker expects, and returns its request.
template <class Thrown>
std::shared_ptr<RequestState> RunAndCatch(const std::function<void(const std::string&)>& worker) {
  KeptWork kept;
  auto request = StoreProbe::StartOrAttachToRequest("key", worker);
  EXPECT_THROW(kept.RunNext(), Thrown);
  return request;
}

const std::string UNEXPECTED = "Thread Error: Unexpected thread termination";

TEST_F(WorkerTest, SomethingElseOutOfTheConfigurationEndsTheRequestAndLeavesTheWorker) {
  script_.getMachineAccountDN = [](auto...) -> std::uint32_t { throw 1; };
  const auto request = RunAndCatch<int>(Configuration());
  EXPECT_THROW_WHAT(request->WaitResult(0), ThreadErrorException, UNEXPECTED);
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
}

TEST_F(WorkerTest, AStandardExceptionOutOfAnyOtherWorkerEndsTheRequestAndLeavesTheWorker) {
  script_.getTrustedDomains = [](auto...) -> std::uint32_t { throw std::out_of_range("inside the plug-in"); };
  script_.getDomainTrustState = []() -> TrustState { throw std::out_of_range("inside the plug-in"); };
  script_.getDomainTrustRelationship = [](auto...) -> TrustRelationship {
    throw std::out_of_range("inside the plug-in");
  };
  for (const Worker& worker : {TrustedDomains(), State(), Relationship()}) {
    const auto request = RunAndCatch<std::out_of_range>(worker);
    EXPECT_THROW_WHAT(request->WaitResult(0), ThreadErrorException, UNEXPECTED);
    EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
  }
  EXPECT_EQ(cache_.GetDomainTrustState(), 7U);
}

TEST_F(WorkerTest, OnAThreadSomethingUnexpectedReachesTheWaiterThoughItEndsTheProcess) {
  script_.getTrustedDomains = [](auto...) -> std::uint32_t { throw std::out_of_range("inside the plug-in"); };
  EXPECT_EXIT(
      {
        std::set_terminate([] { Gate().Pass(); });  // Holds the process's end up.
        const auto request = StoreProbe::StartOrAttachToRequest("key", TrustedDomains());
        try {
          request->WaitResult(30);
        } catch (const ThreadErrorException& failure) {
          std::_Exit(failure.what() == UNEXPECTED ? 0 : 1);
        } catch (...) {
        }
        std::_Exit(2);
      },
      ::testing::ExitedWithCode(0), "");
}

}  // namespace
}  // namespace quenix::authentication
