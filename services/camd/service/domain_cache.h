// The domain that the service makes accounts in, asked of the directory now and then.
#ifndef CAMD_SERVICE_DOMAIN_CACHE_H
#define CAMD_SERVICE_DOMAIN_CACHE_H

#include <chrono>
#include <mutex>
#include <optional>

#include "service/directory_client.h"

namespace camd {

// Safe for use by several threads.
class DomainCache {
 public:
  explicit DomainCache(DirectoryClient& directory) : directory_(directory) {}

  // What is known, if it was learnt in the last ten minutes.
  std::optional<DomainInformation> Recent() const;

  // What is recent; otherwise asks the directory, and falls back on what is old when that does not answer.
  // Throws Failure.
  DomainInformation Get(const DirectorySettings& settings);

  void Forget();

 private:
  DirectoryClient& directory_;
  mutable std::mutex mutex_;
  std::optional<DomainInformation> known_;
  std::chrono::steady_clock::time_point learnt_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_DOMAIN_CACHE_H
