// Which controllers are tried, and in which order.

#include "helper/domain_locator.h"

#include <gtest/gtest.h>

namespace sambaprovider {
namespace {

using Names = std::vector<std::string>;

TEST(ControllersInTurnTest, WithoutPreferredOnesTheyAreThoseOfDns) {
  EXPECT_EQ(ControllersInTurn({}, {"dc1", "dc2"}), (Names{"dc1", "dc2"}));
}

TEST(ControllersInTurnTest, PreferredOnesComeFirst) {
  EXPECT_EQ(ControllersInTurn({"dc3"}, {"dc1", "dc2"}), (Names{"dc3", "dc1", "dc2"}));
}

TEST(ControllersInTurnTest, ManyPreferredOnesDoNotKeepThoseOfDnsOut) {
  EXPECT_EQ(ControllersInTurn({"old1", "old2", "old3", "old4"}, {"dc1"}), (Names{"old1", "old2", "dc1"}));
}

TEST(ControllersInTurnTest, NoneIsTriedTwice) {
  EXPECT_EQ(ControllersInTurn({"DC2.corp.example"}, {"dc1.corp.example", "dc2.corp.example"}),
            (Names{"DC2.corp.example", "dc1.corp.example"}));
}

}  // namespace
}  // namespace sambaprovider
