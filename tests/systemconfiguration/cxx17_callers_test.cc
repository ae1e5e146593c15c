// Built as C++17, as callers may be who are older than the library.
#include <gtest/gtest.h>

#include <sstream>
#include <string>

#include "systemconfiguration/systemconfiguration.h"

static_assert(__cplusplus < 202002L, "this file is here to be compiled as C++17");

namespace SystemConfiguration {
namespace {

TEST(CXX17CallersTest, BracketedControlsDifferWhenTheirTextsDo) {
  EXPECT_TRUE(PAMControl("[a]") != PAMControl("[b]"));
  EXPECT_FALSE(PAMControl("[a]") != PAMControl("[a]"));
}

TEST(CXX17CallersTest, ControlsCompareWithEnumeratorsAndText) {
  const PAMControl control("required");
  EXPECT_TRUE(control == PAMControl::Required);
  EXPECT_TRUE(control != PAMControl::Optional);
  EXPECT_TRUE(control == "required");
  EXPECT_TRUE(control != std::string("optional"));
}

TEST(CXX17CallersTest, FacilitiesAndDatabasesCompareWithEnumerators) {
  EXPECT_TRUE(PAMFacility("auth") == PAMFacility::Auth);
  EXPECT_TRUE(PAMFacility("auth") != PAMFacility::Account);
  EXPECT_TRUE(NSSDatabase("hosts") == NSSDatabase::Hosts);
  EXPECT_TRUE(NSSDatabase("hosts") != NSSDatabase::Group);
}

TEST(CXX17CallersTest, APolicyIsReadEditedAndWritten) {
  std::istringstream input("auth required pam_unix.so\n");
  PAMPolicy policy("sshd");
  input >> policy;
  policy[PAMFacility::Auth].emplace_front(PAMControl::Sufficient, "pam_winbind.so");
  std::ostringstream output;
  output << policy;
  EXPECT_EQ(output.str(),
            "#%PAM-1.0\n\nauth\tsufficient\tpam_winbind.so\t\nauth\trequired\tpam_unix.so\t\n\n");
}

}  // namespace
}  // namespace SystemConfiguration
