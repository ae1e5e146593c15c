// Every object of the library that lives as long as the process has the library loaded, in the order of its
// construction. They stand in one file because the order is defined only within one.

#include <atomic>
#include <new>
#include <unordered_map>

#include "authentication/active_directory_config_store.h"
#include "authentication/active_directory_store.h"
#include "authentication/authentication_store_factory.h"
#include "errors/library_pin.h"
#include "errors/mutex.h"
#include "errors/request_state.h"
#include "errors/running_work.h"
#include "errors/scheduler_hook.h"
#include "stores/ad_cache.h"

namespace quenix::authentication {

namespace {

/// What work on other threads touches.
struct SharedState {
  std::function<void(std::function<void()>)> scheduler;
  ADCache cache;
  std::unordered_map<std::string, std::shared_ptr<RequestState>> requests;
  Mutex lock;
};

/// Holds the shared state for the life of the library, and longer when that ends at the exit of a process in
/// which work still runs: the work then goes on with a whole state until the process is gone. An unload
/// cannot meet running work, since each worker thread keeps the library loaded.
class SharedStateStorage {
 public:
  SharedStateStorage() { new (&state_) SharedState; }
  SharedStateStorage(const SharedStateStorage&) = delete;
  SharedStateStorage& operator=(const SharedStateStorage&) = delete;
  ~SharedStateStorage() {
    if (RunningWork::NoneLeft()) state_.~SharedState();
  }

  SharedState& Get() { return state_; }

 private:
  union {
    SharedState state_;
  };
};

}  // namespace

std::atomic<int> RunningWork::count_{0};

const ThreadEndKey threadEndKey;

namespace {
SharedStateStorage sharedState;
}  // namespace

std::function<void(std::function<void()>)>& schedulerHook = sharedState.Get().scheduler;
ADCache& ActiveDirectoryStore::_adCache = sharedState.Get().cache;
Mutex& ActiveDirectoryStore::_lock = sharedState.Get().lock;
std::unordered_map<std::string, std::shared_ptr<RequestState>>& ActiveDirectoryStore::_asyncRequests =
    sharedState.Get().requests;

const OrvConfigStore::ConfigStoreObjectId ActiveDirectoryConfigStore::AD_CSO_ID("active_directory",
                                                                                "identity", "orv");
const OrvConfigStore::ConfigStoreObjectId ActiveDirectoryConfigStore::AUTH_PROXY_CERT_CSO_ID(
    "auth_proxy_certificate", "identity", "orv");

template <>
AuthenticationStoreFactory* Singleton<AuthenticationStoreFactory>::_instance = nullptr;

namespace {
AuthenticationStoreFactory authenticationStoreFactory;
}  // namespace

}  // namespace quenix::authentication
