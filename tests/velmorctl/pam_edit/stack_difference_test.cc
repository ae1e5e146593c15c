// What counts as a change of a stack that was not asked for.
#include "pam_edit/stack_difference.h"

#include <gtest/gtest.h>

#include "pam/resolver.h"
#include "velmorctl/pam/policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::Facility;
using velmorctl::pam::OwnModules;
using velmorctl::pam::ResolvePolicy;
using velmorctl::pam::Stack;

Stack AuthStack(const std::string& content) {
  const PolicySet files = {{"svc", content}};
  return ResolvePolicy("svc", ReaderOf(files)).StackOf(Facility::Auth);
}

std::string Difference(const std::string& without, const std::string& with) {
  return UnexpectedDifference(AuthStack(without), AuthStack(with), OwnModules{"pam_x.so"});
}

const std::string PLAIN =
    "auth [success=1 default=ignore] pam_unix.so\nauth requisite pam_deny.so\nauth required pam_permit.so\n";

TEST(StackDifferenceTest, OwnEntriesWithTheJumpsOverThemAreExpected) {
  EXPECT_EQ(Difference(PLAIN,
                       "auth [success=3 default=ignore] pam_unix.so\n"
                       "auth [success=1 default=ignore] pam_localuser.so\n"
                       "auth [success=1 default=ignore] pam_x.so\nauth requisite pam_deny.so\n"
                       "auth required pam_permit.so\n"),
            "");
}

TEST(StackDifferenceTest, AnotherEntryIsNamed) {
  EXPECT_EQ(Difference(PLAIN,
                       "auth [success=1 default=ignore] pam_unix.so\nauth requisite pam_warn.so\n"
                       "auth required pam_permit.so\n"),
            "this entry would be another one: /etc/pam.d/svc, line 2: pam_warn.so");
}

TEST(StackDifferenceTest, ALostEntryIsNamed) {
  EXPECT_EQ(Difference(PLAIN, "auth [success=1 default=ignore] pam_unix.so\nauth requisite pam_deny.so\n"),
            "this entry would be lost: /etc/pam.d/svc, line 3: pam_permit.so");
}

TEST(StackDifferenceTest, AJumpThatLeadsElsewhereIsNamed) {
  EXPECT_EQ(Difference(PLAIN,
                       "auth [success=1 default=ignore] pam_unix.so\n"
                       "auth [success=1 default=ignore] pam_x.so\nauth requisite pam_deny.so\n"
                       "auth required pam_permit.so\n"),
            "a jump of this entry would lead to another one: /etc/pam.d/svc, line 1: pam_unix.so");
}

}  // namespace

}  // namespace velmorctltest
