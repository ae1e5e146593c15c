#include "pam/succeed_if.h"

#include <gtest/gtest.h>

#include <sstream>

namespace velmorctltest {

namespace {

using velmorctl::pam::NameOf;
using velmorctl::pam::Person;
using velmorctl::pam::SucceedIf;

std::vector<std::string> Words(const std::string& text) {
  std::istringstream stream(text);
  return {std::istream_iterator<std::string>(stream), {}};
}

Person Alice() {
  Person alice;
  alice.name = "alice";
  alice.local = true;
  alice.uid = 1001;
  alice.gid = 100;
  alice.home = "/home/alice";
  alice.shell = "/bin/sh";
  alice.groups = {"users", "sudo"};
  return alice;
}

struct Test {
  const char* arguments;
  const char* answer;
};

class SucceedIfTest : public ::testing::TestWithParam<Test> {};

TEST_P(SucceedIfTest, AnswersLikeTheModule) {
  EXPECT_EQ(NameOf(SucceedIf(Words(GetParam().arguments), Alice(), "sshd", true, true).code),
            GetParam().answer)
      << GetParam().arguments;
}

INSTANTIATE_TEST_SUITE_P(
    Each, SucceedIfTest,
    ::testing::Values(Test{"", "success"}, Test{"quiet use_uid", "success"}, Test{"uid >= 1000", "success"},
                      Test{"quiet uid < 1000", "auth_err"}, Test{"uid eq 1001", "success"},
                      Test{"gid = 100", "success"}, Test{"gid ne 100", "auth_err"},
                      Test{"uid == 1001", "service_err"}, Test{"uid >= many", "service_err"},
                      Test{"user = alice", "success"}, Test{"user != alice", "auth_err"},
                      Test{"user =~ al*", "success"}, Test{"user !~ al*", "auth_err"},
                      Test{"user in bob:alice", "success"}, Test{"user notin bob:alice", "auth_err"},
                      Test{"user ingroup wheel:sudo", "success"}, Test{"user ingroup wheel", "auth_err"},
                      Test{"user notingroup wheel", "success"}, Test{"shell = /bin/sh", "success"},
                      Test{"home =~ /root*", "auth_err"}, Test{"service in su:sshd", "success"},
                      Test{"service = login", "auth_err"}, Test{"uid >= 1000 user ingroup sudo", "success"},
                      Test{"uid >= 1000 user ingroup adm", "auth_err"},
                      Test{"uid >= 1000 user", "service_err"}, Test{"colour = red", "service_err"},
                      Test{"user == alice", "service_err"}, Test{"tty = tty1", "success"},
                      Test{"user innetgr admins", "success"}));

TEST(SucceedIfModuleTest, WhatCannotBeDecidedIsNoted) {
  EXPECT_NE(SucceedIf({"tty", "=", "tty1"}, Alice(), "sshd", true, true).note, "");
  EXPECT_EQ(NameOf(SucceedIf({"tty", "=", "tty1"}, Alice(), "sshd", true, false).code), "auth_err");
}

TEST(SucceedIfModuleTest, AUserWhoCannotBeLookedUpIsUnknown) {
  EXPECT_EQ(NameOf(SucceedIf({"uid", ">=", "0"}, Alice(), "sshd", false, true).code), "user_unknown");
  EXPECT_EQ(NameOf(SucceedIf({"user", "=", "alice"}, Alice(), "sshd", false, true).code), "success");
}

}  // namespace

}  // namespace velmorctltest
