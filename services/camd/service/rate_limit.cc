#include "service/rate_limit.h"

#include <algorithm>
#include <cmath>
#include <vector>

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

// Whoever has not asked for a minute has its whole allowance again. When too few are such, the half that
// asked longest ago loses its record: a half, so that this seldom happens.
void RateLimit::ForgetSome(Clock::time_point now) {
  std::erase_if(allowances_,
                [now](const auto& entry) { return now - entry.second.at > std::chrono::minutes(1); });
  if (allowances_.size() < kMostClients) return;
  std::vector<Clock::time_point> times;
  for (const auto& [client, allowance] : allowances_) times.push_back(allowance.at);
  const auto middle = times.begin() + static_cast<std::ptrdiff_t>(times.size() / 2);
  std::nth_element(times.begin(), middle, times.end());
  std::erase_if(allowances_, [limit = *middle](const auto& entry) { return entry.second.at <= limit; });
}

}  // namespace camd
