#include "service/domain_cache.h"

#include "common/status.h"

namespace camd {
namespace {

constexpr std::chrono::minutes kLifetime(10);

}  // namespace

std::optional<DomainInformation> DomainCache::Recent() const {
  const std::lock_guard lock(mutex_);
  return std::chrono::steady_clock::now() - learnt_ < kLifetime ? known_ : std::nullopt;
}

DomainInformation DomainCache::Get(const DirectorySettings& settings) {
  if (const auto recent = Recent()) return *recent;
  try {
    const DomainInformation information = directory_.AskDomain(settings);
    const std::lock_guard lock(mutex_);
    known_ = information;
    learnt_ = std::chrono::steady_clock::now();
    return information;
  } catch (const Failure&) {
    const std::lock_guard lock(mutex_);
    if (!known_) throw;
    return *known_;
  }
}

void DomainCache::Forget() {
  const std::lock_guard lock(mutex_);
  known_.reset();
}

}  // namespace camd
