// The requests that run away from their callers' threads: starting one, what it does, and ending it.

#include <exception>
#include <utility>

#include "authentication/active_directory_store.h"
#include "authentication/library_exceptions.h"
#include "authentication/thread_util.h"
#include "errors/mutex.h"
#include "errors/request_state.h"
#include "errors/running_work.h"
#include "providers/active_directory_provider.h"
#include "providers/optional_operation.h"
#include "stores/ad_cache.h"

namespace quenix::authentication {

namespace {

/// Runs `work`; the failure that those who wait for it shall see, or null. What is not an Exception leaves
/// this function, with `failure` as it was.
template <class Work>
void RunKeepingFailure(Work work, std::unique_ptr<Exception>& failure) {
  try {
    work();
    failure.reset();
  } catch (const Exception& exception) {
    failure.reset(exception.Clone());
  }
}

/// Runs `work` and passes its outcome to `finish` for the request of `key`, whatever it is. In a catch block
/// and not in a destructor: an exception that nobody catches ends the process without destroying anything.
template <class Work>
void RunAndFinish(const std::string& key, Work work,
                  void (*finish)(const std::string& key, std::unique_ptr<Exception>&& failure)) {
  std::unique_ptr<Exception> failure =
      std::make_unique<ThreadErrorException>("Unexpected thread termination");
  try {
    RunKeepingFailure(work, failure);
  } catch (...) {
    finish(key, std::move(failure));
    throw;
  }
  finish(key, std::move(failure));
}

template <class Step>
void RunIgnoringFailure(Step step) {
  try {
    step();
  } catch (const std::exception&) {
    // That piece of the configuration stays empty; the others may still be had.
  }
}

using Requests = std::unordered_map<std::string, std::shared_ptr<RequestState>>;

/// Whether the request of `key` that is in flight is this one.
bool IsInFlight(const Requests& requests, const std::string& key,
                const std::shared_ptr<RequestState>& state) {
  const auto request = requests.find(key);
  return request != requests.end() && request->second == state;
}

}  // namespace

std::shared_ptr<RequestState> ActiveDirectoryStore::StartOrAttachToRequest(
    const std::string& key, std::function<void(const std::string&)> work) {
  const MutexLock lock(_lock);
  const auto [request, started] = _asyncRequests.emplace(key, std::make_shared<RequestState>());
  if (started) {
    try {
      VelmorThreadUtil::ScheduleFunctor(
          [running = RunningWork(), key, state = request->second, work = std::move(work)] {
            {
              // A scheduler may queue this and then throw: its request is gone then, and one of the same key
              // that is in flight by now is not its own to end. Started before the throw, it waits here.
              const MutexLock lookUp(_lock);
              if (!IsInFlight(_asyncRequests, key, state)) return;
            }
            work(key);
          });
    } catch (...) {
      _asyncRequests.erase(request);
      throw;
    }
  }
  return request->second;
}

void ActiveDirectoryStore::FinishRequest(const std::string& key, std::unique_ptr<Exception>&& failure) {
  const MutexLock lock(_lock);
  const auto request = _asyncRequests.find(key);
  if (request == _asyncRequests.end()) return;
  request->second->Done(std::move(failure));
  _asyncRequests.erase(request);
}

void ActiveDirectoryStore::GetStoreConfigurationInt(Provider provider, const std::string& key) {
  const auto ask = [&] {
    ActiveDirectoryStoreConfiguration configuration;
    RunIgnoringFailure([&] { configuration.activeDomain = provider->GetActiveDomain(); });
    RunIgnoringFailure(
        [&] { configuration.preferredDomainControllers = provider->GetPreferredDomainControllers(); });
    RunIgnoringFailure([&] { configuration.machineAccountDN = provider->GetMachineAccountDN(); });
    _adCache.SetConfiguration(std::move(configuration));
  };
  RunAndFinish(key, ask, &FinishRequest);
}

void ActiveDirectoryStore::GetTrustedDomainsInt(Provider provider, const std::string& key) {
  const auto ask = [&] {
    _adCache.SetTrustedDomains(AskOrElse([&] { return provider->GetTrustedDomains(); }, {}));
  };
  RunAndFinish(key, ask, &FinishRequest);
}

void ActiveDirectoryStore::GetDomainTrustStateInt(Provider provider, const std::string& key) {
  const auto ask = [&] {
    _adCache.SetDomainTrustState(
        AskOrElse([&] { return provider->GetDomainTrustState(); }, TRUST_STATE_NOT_PROVIDED));
  };
  RunAndFinish(key, ask, &FinishRequest);
}

void ActiveDirectoryStore::GetDomainTrustRelationshipInt(Provider provider, const std::string& key,
                                                         const std::string& domain) {
  const auto ask = [&] {
    _adCache.SetDomainTrustRelationship(
        domain, AskOrElse([&] { return provider->GetDomainTrustRelationship(domain); },
                          TRUST_RELATIONSHIP_NOT_PROVIDED));
  };
  RunAndFinish(key, ask, &FinishRequest);
}

}  // namespace quenix::authentication
