// Hosts may load the library, use it, and unload it again, also while its threads are still on their way out.

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <malloc.h>
#include <pthread.h>

#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "plugins/scripted_plugin.h"
#include "process/loaded_library.h"
#include "support/gate.h"
#include "support/interpose.h"

namespace testsupport {
namespace {

const std::vector<std::string> STORES{"Active Directory", "None"};

TEST(UnloadingTest, AnUnusedLibraryIsGoneAndLoadsAgain) {
  {
    const LoadedLibrary library;
    EXPECT_TRUE(LibraryIsMapped());
    EXPECT_EQ(library.RegisteredStores(), STORES);
  }
  EXPECT_FALSE(LibraryIsMapped());
  const LoadedLibrary library;
  EXPECT_EQ(library.RegisteredStores(), STORES);
  EXPECT_EQ(library.CreateStore("None")->GetDisplayName(), "None");
}

TEST(UnloadingTest, ALibraryThatThrewIsGone) {
  {
    const LoadedLibrary library;
    EXPECT_THROW(library.CreateStore("Active Directory"), std::exception);
    EXPECT_THROW(library.CreateStore("None")->IsActive(), std::exception);
  }
  EXPECT_FALSE(LibraryIsMapped());
}

TEST(UnloadingTest, ALibraryWhoseWorkersHaveEndedIsGoneAtOnceAndLoadsAgain) {
  Script& script = UseScriptedPlugin();
  std::atomic<int> calls{0};
  script.getActiveDomain = [&](auto* domain, auto* release) {
    ++calls;
    return Answer(domain, release, {"example.test", "EXAMPLE"});
  };
  for (int round = 0; round < 3; ++round) {
    LoadedLibrary library;
    const auto store = library.CreateStore("Active Directory");
    EXPECT_NE(store->GetStoreConfiguration(), nullptr);
    AwaitEndOfWorkers();
    const_cast<std::unique_ptr<quenix::authentication::AuthenticationStore>&>(store).reset();
    library.Unload();
    EXPECT_FALSE(LibraryIsMapped()) << round;
  }
  EXPECT_EQ(calls, 3);
}

/// Holds each thread but the calling one when it unloads something, while this exists.
class UnloadingGate {
 public:
  explicit UnloadingGate(Gate& gate)
      : watch_(calls::dlclose, [this, &gate](void* handle) {
          if (std::this_thread::get_id() != owner_) {
            gate.Pass();
          }
          return calls::dlclose.Real(handle);
        }) {}

 private:
  const std::thread::id owner_ = std::this_thread::get_id();
  TakeOver<int(void*)> watch_;
};

TEST(UnloadingTest, AWorkerInsideTheLibraryKeepsItMapped) {
  Script& script = UseScriptedPlugin();
  static Gate& call = *new Gate;  // Never destroyed: nothing tells when a worker has left it.
  Gate unloading;
  script.getActiveDomain = [&](auto* domain, auto* release) {
    call.Pass();
    return Answer(domain, release, {"", ""});
  };
  const UnloadingGate gate(unloading);
  LoadedLibrary library;
  auto store = library.CreateActiveDirectoryStore(0);
  store->GetStoreConfiguration();  // Its time is over at once; the worker goes on.
  store.reset();
  call.Open();
  // The worker is the last who uses the plug-in: it unloads it, and is held there, inside the library.
  unloading.AwaitArrivals(1);
  library.Unload();
  EXPECT_TRUE(LibraryIsMapped());
  unloading.Open();
  AwaitEndOfWorkers();
  EXPECT_FALSE(LibraryIsMapped());
}

TEST(UnloadingTest, AWorkerInsideThePluginKeepsTheLibraryMapped) {
  Script& script = UseScriptedPlugin();
  static Gate& call = *new Gate;  // Never destroyed: nothing tells when a worker has left it.
  script.getActiveDomain = [&](auto* domain, auto* release) {
    call.Pass();
    return Answer(domain, release, {"", ""});
  };
  LoadedLibrary library;
  auto store = library.CreateActiveDirectoryStore(0);
  store->GetStoreConfiguration();
  store.reset();
  call.AwaitArrivals(1);
  library.Unload();
  EXPECT_TRUE(LibraryIsMapped());
  call.Open();
  AwaitEndOfWorkers();
  EXPECT_FALSE(LibraryIsMapped());
}

TEST(UnloadingTest, AWaiterThatHasWokenMayUnloadAtOnce) {
  UseScriptedPlugin();
  for (int round = 0; round < 100; ++round) {
    LoadedLibrary library;
    const auto store = library.CreateStore("Active Directory");
    store->GetStoreConfiguration();
    // No waiting for the worker here: store and library go while it returns.
  }
  AwaitEndOfWorkers();
  EXPECT_FALSE(LibraryIsMapped());
}

TEST(UnloadingTest, ALibraryThatIsLoadedAgainWhileAWorkerRunsIsTheSame) {
  Script& script = UseScriptedPlugin();
  static Gate& call = *new Gate;  // Never destroyed: nothing tells when a worker has left it.
  script.getActiveDomain = [&](auto* domain, auto* release) {
    call.Pass();
    return Answer(domain, release, {"", ""});
  };
  LoadedLibrary first;
  first.CreateActiveDirectoryStore(0)->GetStoreConfiguration();
  call.AwaitArrivals(1);
  first.Unload();
  LoadedLibrary second;
  EXPECT_EQ(second.RegisteredStores(), STORES);
  call.Open();
  AwaitEndOfWorkers();
  EXPECT_TRUE(LibraryIsMapped());
  second.Unload();
  EXPECT_FALSE(LibraryIsMapped());
}

TEST(UnloadingTest, AThreadThatCouldNotBeStartedDoesNotKeepTheLibrary) {
  InstallPlugin("version3");
  ConfigureProvider("version3");
  {
    const LoadedLibrary library;
    const auto store = library.CreateStore("Active Directory");
    const TakeOver refuse(calls::pthreadCreate, [](auto...) { return EAGAIN; });
    EXPECT_THROW(store->GetStoreConfiguration(), std::exception);
  }
  EXPECT_FALSE(LibraryIsMapped());
}

/// Takes every place that the process has for what threads keep to themselves.
void UseUpThreadKeys() {
  pthread_key_t key{};
  while (pthread_key_create(&key, nullptr) == 0) {
  }
}

TEST(UnloadingTest, WithoutAThreadKeyOfItsOwnTheLibraryTakesNobodyElses) {
  UseUpThreadKeys();
  {
    const LoadedLibrary library;
    EXPECT_EQ(library.RegisteredStores(), STORES);
  }
  EXPECT_FALSE(LibraryIsMapped());
  pthread_key_t key{};
  EXPECT_EQ(pthread_key_create(&key, nullptr), EAGAIN);
}

TEST(UnloadingTest, WithoutAThreadKeyAWorkerKeepsTheLibraryForGood) {
  InstallPlugin("version3");
  ConfigureProvider("version3");
  UseUpThreadKeys();
  {
    const LoadedLibrary library;
    EXPECT_NE(library.CreateStore("Active Directory")->GetStoreConfiguration(), nullptr);
    AwaitEndOfWorkers();
  }
  EXPECT_TRUE(LibraryIsMapped());
}

TEST(UnloadingTest, LoadingOftenUsesNothingUp) {
  // More often than a process has places for what threads keep to themselves.
  for (int round = 0; round < 1100; ++round) {
    const LoadedLibrary library;
    ASSERT_EQ(library.RegisteredStores(), STORES) << round;
  }
  EXPECT_FALSE(LibraryIsMapped());
}

TEST(UnloadingTest, AnIdleUnloadLeavesNoMemoryBehind) {
  // With a cache of freed memory in each thread the numbers would go up and down.
  ASSERT_STREQ(std::getenv("GLIBC_TUNABLES"), "glibc.malloc.tcache_count=0");
  constexpr std::size_t ROUNDS = 50;
  const auto useOnce = [] {
    const LoadedLibrary library;
    library.CreateStore("Active Directory")->GetStoreConfiguration();
    AwaitEndOfWorkers();
  };
  InstallPlugin("version3");
  ConfigureProvider("version3");
  for (int round = 0; round < 10; ++round) {
    useOnce();
  }
  const std::size_t before = mallinfo2().uordblks;
  for (std::size_t round = 0; round < ROUNDS; ++round) {
    useOnce();
  }
  EXPECT_EQ(mallinfo2().uordblks, before);
}

}  // namespace
}  // namespace testsupport
