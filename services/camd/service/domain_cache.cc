#include "service/domain_cache.h"

#include "common/status.h"

namespace camd {
namespace {

constexpr std::chrono::minutes kLifetime(10);

}  // namespace

std::optional<DomainInformation> DomainCache::Recent(const std::string& domain) const {
  const std::lock_guard lock(mutex_);
  const bool recent = std::chrono::steady_clock::now() - learnt_ < kLifetime;
  return recent && domain_ == domain ? known_ : std::nullopt;
}

DomainInformation DomainCache::Get(const DirectorySettings& settings) {
  if (const auto recent = Recent(settings.domain)) return *recent;
  try {
    const DomainInformation information = directory_.AskDomain(settings);
    const std::lock_guard lock(mutex_);
    domain_ = settings.domain;
    known_ = information;
    learnt_ = std::chrono::steady_clock::now();
    return information;
  } catch (const Failure&) {
    const std::lock_guard lock(mutex_);
    if (!known_ || domain_ != settings.domain) throw;
    return *known_;
  }
}

void DomainCache::Forget() {
  const std::lock_guard lock(mutex_);
  known_.reset();
}

}  // namespace camd
