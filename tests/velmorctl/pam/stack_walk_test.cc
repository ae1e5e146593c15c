#include "pam/stack_walk.h"

#include <gtest/gtest.h>

#include "pam/resolver.h"
#include "policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::Facility;
using velmorctl::pam::ReachableEntries;
using velmorctl::pam::ResolvePolicy;

/// One letter for each entry of the auth stack: "y" when it can be reached.
std::string Reachable(const PolicySet& files) {
  std::string letters;
  for (bool reachable : ReachableEntries(ResolvePolicy("svc", ReaderOf(files)).StackOf(Facility::Auth))) {
    letters += reachable ? "y" : "n";
  }
  return letters;
}

TEST(StackWalkTest, NothingIsBehindAPermitThatEndsTheStack) {
  EXPECT_EQ(Reachable({{"svc", "auth sufficient pam_permit.so\nauth required pam_unix.so\n"}}), "yn");
}

TEST(StackWalkTest, NothingIsBehindADenyThatEndsTheStack) {
  EXPECT_EQ(Reachable({{"svc", "auth requisite pam_deny.so\nauth required pam_unix.so\n"}}), "yn");
}

TEST(StackWalkTest, AJumpLeadsOverADeny) {
  EXPECT_EQ(Reachable({{"svc",
                        "auth [success=1 default=ignore] pam_unix.so\nauth requisite pam_deny.so\n"
                        "auth required pam_permit.so\n"}}),
            "yyy");
}

TEST(StackWalkTest, AnythingMayFollowAModuleThatIsNotKnown) {
  EXPECT_EQ(
      Reachable({{"svc", "auth sufficient pam_x.so\nauth requisite pam_y.so\nauth required pam_z.so\n"}}),
      "yyy");
}

TEST(StackWalkTest, DoneDoesNotEndAStackThatHasFailed) {
  EXPECT_EQ(
      Reachable({{"svc", "auth required pam_x.so\nauth sufficient pam_permit.so\nauth required pam_y.so\n"}}),
      "yyy");
}

TEST(StackWalkTest, TheEndOfASubstackIsNotTheEndOfTheStack) {
  EXPECT_EQ(Reachable({{"svc", "auth substack part\nauth required pam_x.so\n"},
                       {"part", "auth sufficient pam_permit.so\nauth required pam_y.so\n"}}),
            "yyny");
}

TEST(StackWalkTest, AJumpThatIsAlwaysTakenHidesWhatItPassesOver) {
  EXPECT_EQ(
      Reachable({{"svc", "auth [default=1] pam_x.so\nauth required pam_y.so\nauth required pam_z.so\n"}}),
      "yny");
}

}  // namespace

}  // namespace velmorctltest
