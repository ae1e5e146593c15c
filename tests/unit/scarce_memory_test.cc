// What holds when memory runs out at any one place. This program has an allocator of its own.

#include <gtest/gtest.h>

#include <cstdlib>
#include <functional>
#include <memory>
#include <new>
#include <string>
#include <utility>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "unit/store_probe.h"

namespace {

/// How many allocations of this thread still succeed; negative for all.
thread_local long allocationsLeft = -1;

void* Allocate(std::size_t size) {
  if (allocationsLeft == 0) {
    throw std::bad_alloc();
  }
  if (allocationsLeft > 0) {
    --allocationsLeft;
  }
  void* memory = std::malloc(size == 0 ? 1 : size);
  if (memory == nullptr) {
    throw std::bad_alloc();
  }
  return memory;
}

}  // namespace

void* operator new(std::size_t size) {
  return Allocate(size);
}
void* operator new[](std::size_t size) {
  return Allocate(size);
}
void operator delete(void* memory) noexcept {
  std::free(memory);
}
void operator delete[](void* memory) noexcept {
  std::free(memory);
}
void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}
void operator delete[](void* memory, std::size_t) noexcept {
  std::free(memory);
}

namespace quenix::authentication {
namespace {

using testsupport::StoreProbe;

/// Runs `step` with only so many allocations; whether it had enough.
bool HadEnough(long allocations, const std::function<void()>& step) {
  allocationsLeft = allocations;
  try {
    step();
  } catch (const std::bad_alloc&) {
    allocationsLeft = -1;
    return false;
  }
  allocationsLeft = -1;
  return true;
}

TEST(ScarceMemoryTest, AFactoryThatCannotRegisterItsStoresIsNotPublished) {
  AuthenticationStoreFactory* const real = Singleton<AuthenticationStoreFactory>::_instance;
  long allocations = 0;
  while (!HadEnough(allocations, [] { const AuthenticationStoreFactory factory; })) {
    EXPECT_EQ(Singleton<AuthenticationStoreFactory>::_instance, nullptr) << allocations;
    ++allocations;
  }
  EXPECT_GT(allocations, 1);
  Singleton<AuthenticationStoreFactory>::_instance = real;
}

class ScarceMemoryRequestTest : public ::testing::Test {
 protected:
  ScarceMemoryRequestTest() {
    VelmorThreadUtil::SetScheduler([this](std::function<void()> work) { work_ = std::move(work); });
  }
  ~ScarceMemoryRequestTest() override { VelmorThreadUtil::SetScheduler(nullptr); }

  std::function<void()> work_;
};

TEST_F(ScarceMemoryRequestTest, ARequestThatCannotBeStartedIsNotInFlight) {
  const std::string key = "a key that is too long for the inside of a string object";
  const auto work = [](const std::string& finished) { StoreProbe::FinishRequest(finished, nullptr); };
  long allocations = 0;
  while (!HadEnough(allocations, [&] { StoreProbe::StartOrAttachToRequest(key, work); })) {
    EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U) << allocations;
    ++allocations;
  }
  EXPECT_GT(allocations, 1);
  EXPECT_TRUE(StoreProbe::IsInFlight(key));
  work_();
  EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U);
}

TEST_F(ScarceMemoryRequestTest, AWorkerThatHasItsPendingFailureEndsItsRequestInEveryCase) {
  auto& script = testsupport::UseScriptedPlugin();
  static char dnsName[] = "a.domain.whose.name.is.too.long.for.the.inside.of.a.string.object";
  static char netbiosName[] = "LONG";
  static ActiveDirectoryDomainPair pair{dnsName, netbiosName};
  static ActiveDirectoryDomainPair* pairs[] = {&pair, nullptr};
  script.getTrustedDomains = [](ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
    *domains = pairs;
    *release = [](void*) {};
    return 0U;
  };
  const auto provider = std::make_shared<ActiveDirectoryProvider>("scripted");
  // What the pending failure itself needs: without it there is nothing to end the request with.
  long pendingFailure = 0;
  while (!HadEnough(pendingFailure,
                    [] { std::make_unique<ThreadErrorException>("Unexpected thread termination"); })) {
    ++pendingFailure;
  }
  const auto worker = [&](const std::string& key) { StoreProbe::GetTrustedDomainsInt(provider, key); };
  bool hadEnough = false;
  for (long allocations = pendingFailure; !hadEnough; ++allocations) {
    const auto request = StoreProbe::StartOrAttachToRequest("key", worker);
    hadEnough = HadEnough(allocations, work_);
    EXPECT_EQ(StoreProbe::RequestsInFlight(), 0U) << allocations;
    if (hadEnough) {
      request->WaitResult(0);
    } else {
      EXPECT_THROW_WHAT(request->WaitResult(0), ThreadErrorException,
                        "Thread Error: Unexpected thread termination");
    }
  }
  EXPECT_EQ(StoreProbe::_adCache.GetTrustedDomains().size(), 1U);
}

}  // namespace
}  // namespace quenix::authentication
