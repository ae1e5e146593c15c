#include "service/rate_limit.h"

#include <gtest/gtest.h>

namespace camd {
namespace {

class RateLimitTest : public ::testing::Test {
 protected:
  unsigned int CountAt(int second, const std::string& client = "10.0.0.1", unsigned int perMinute = 6) {
    return limit_.Count(Address::Parse(client).value(), perMinute, start_ + std::chrono::seconds(second));
  }

  RateLimit limit_;
  RateLimit::Clock::time_point start_ = RateLimit::Clock::now();
};

TEST_F(RateLimitTest, AMinutesWorthMayComeAtOnce) {
  for (int count = 0; count < 6; ++count) EXPECT_EQ(CountAt(0), 0U);
  EXPECT_EQ(CountAt(0), 10U);
}

TEST_F(RateLimitTest, AllowanceComesBackWithTime) {
  for (int count = 0; count < 7; ++count) CountAt(0);
  EXPECT_EQ(CountAt(9), 1U);
  EXPECT_EQ(CountAt(10), 0U);
  EXPECT_EQ(CountAt(10), 10U);
}

TEST_F(RateLimitTest, AllowanceDoesNotGrowBeyondAMinutesWorth) {
  CountAt(0);
  for (int count = 0; count < 6; ++count) EXPECT_EQ(CountAt(100000), 0U);
  EXPECT_NE(CountAt(100000), 0U);
}

TEST_F(RateLimitTest, ClientsDoNotShareTheirAllowance) {
  for (int count = 0; count < 7; ++count) CountAt(0);
  EXPECT_EQ(CountAt(0, "10.0.0.2"), 0U);
}

TEST_F(RateLimitTest, LimitOfZeroAllowsEverything) {
  for (int count = 0; count < 1000; ++count) EXPECT_EQ(CountAt(0, "10.0.0.1", 0), 0U);
}

TEST_F(RateLimitTest, ManyOtherClientsDoNotGiveTheLatestItsAllowanceBack) {
  for (int other = 0; other < 20000; ++other) {
    CountAt(0, "10.1." + std::to_string(other / 250) + "." + std::to_string(other % 250));
  }
  for (int count = 0; count < 6; ++count) CountAt(1);
  EXPECT_NE(CountAt(1), 0U);
}

}  // namespace
}  // namespace camd
