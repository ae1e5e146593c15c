// How often a client may ask.
#ifndef CAMD_SERVICE_RATE_LIMIT_H
#define CAMD_SERVICE_RATE_LIMIT_H

#include <chrono>
#include <map>
#include <mutex>

#include "service/address_range.h"

namespace camd {

// Lets each client ask a number of times a minute on average, and as many at once when it has not asked for a
// minute. Remembers a bounded number of clients. Safe for use by several threads.
class RateLimit {
 public:
  using Clock = std::chrono::steady_clock;

  // Counts a request; returns after how many seconds the client may ask again, 0 for at once. A limit of 0
  // allows everything.
  unsigned int Count(const Address& client, unsigned int requestsPerMinute, Clock::time_point now);

 private:
  struct Allowance {
    double requests = 0;
    Clock::time_point at;
  };

  void ForgetSome(Clock::time_point now);

  std::mutex mutex_;
  std::map<Address, Allowance> allowances_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_RATE_LIMIT_H
