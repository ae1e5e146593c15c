// The domain that the service makes accounts in, asked of the directory now and then.
#ifndef CAMD_SERVICE_DOMAIN_CACHE_H
#define CAMD_SERVICE_DOMAIN_CACHE_H

#include <chrono>
#include <mutex>
#include <optional>
#include <string>

#include "service/directory_client.h"

namespace camd {

// What is known counts for its own domain only: a question that began under older settings may end after they
// were changed. Safe for use by several threads.
class DomainCache {
 public:
  explicit DomainCache(DirectoryClient& directory) : directory_(directory) {}

  // What is known of the domain, if it was learnt in the last ten minutes.
  std::optional<DomainInformation> Recent(const std::string& domain) const;

  // What is recent; otherwise asks the directory, and falls back on what is old when that does not answer.
  // Throws Failure.
  DomainInformation Get(const DirectorySettings& settings);

  void Forget();

 private:
  DirectoryClient& directory_;
  mutable std::mutex mutex_;
  std::string domain_;
  std::optional<DomainInformation> known_;
  std::chrono::steady_clock::time_point learnt_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_DOMAIN_CACHE_H
