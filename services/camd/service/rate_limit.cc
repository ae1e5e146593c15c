#include "service/rate_limit.h"

#include <algorithm>
#include <cmath>

namespace camd {
namespace {

constexpr size_t kMostClients = 10000;
constexpr double kSecondsPerMinute = 60;

}  // namespace

unsigned int RateLimit::Count(const Address& client, unsigned int requestsPerMinute, Clock::time_point now) {
  if (requestsPerMinute == 0) return 0;
  const double largest = requestsPerMinute;
  const double perSecond = largest / kSecondsPerMinute;
  const std::lock_guard lock(mutex_);
  if (allowances_.size() >= kMostClients) ForgetSome(now);
  const auto [found, isNew] = allowances_.try_emplace(client, Allowance{largest, now});
  Allowance& allowance = found->second;
  const double elapsed = std::chrono::duration<double>(now - allowance.at).count();
  allowance = {std::min(largest, allowance.requests + elapsed * perSecond), now};
  if (allowance.requests >= 1) {
    allowance.requests -= 1;
    return 0;
  }
  return static_cast<unsigned int>(std::ceil((1 - allowance.requests) / perSecond));
}

// Whoever has not asked for a minute has its whole allowance again. When that is nobody, those who asked
// longest ago lose their record.
void RateLimit::ForgetSome(Clock::time_point now) {
  std::erase_if(allowances_,
                [now](const auto& entry) { return now - entry.second.at > std::chrono::minutes(1); });
  if (allowances_.size() < kMostClients) return;
  const auto oldest =
      std::min_element(allowances_.begin(), allowances_.end(),
                       [](const auto& left, const auto& right) { return left.second.at < right.second.at; });
  allowances_.erase(oldest);
}

}  // namespace camd
