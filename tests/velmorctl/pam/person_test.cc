#include "pam/person.h"

#include <gtest/gtest.h>

namespace velmorctltest {

namespace {

using velmorctl::pam::FindPerson;
using velmorctl::pam::Person;
using velmorctl::pam::UserFiles;

const UserFiles FILES = {"root:x:0:0:root:/root:/bin/bash\nalice:x:1001:1002::/home/alice:/bin/sh\nshort:x\n",
                         "users:x:1002:\nsudo:x:27:bob,alice\nadm:x:4:bob\n",
                         "root:*:1::::::\nalice:$y$j9T$x:1::::::\nbob:!:1::::::\n"};

TEST(PersonTest, ALocalUserIsAsItsRecordsSay) {
  const Person alice = FindPerson("alice", FILES);
  EXPECT_TRUE(alice.local);
  EXPECT_FALSE(alice.assumed);
  EXPECT_EQ(alice.uid, 1001U);
  EXPECT_EQ(alice.gid, 1002U);
  EXPECT_EQ(alice.home, "/home/alice");
  EXPECT_EQ(alice.shell, "/bin/sh");
  EXPECT_EQ(alice.groups, (std::set<std::string>{"sudo", "users"}));
  EXPECT_FALSE(alice.locked);
}

TEST(PersonTest, APasswordThatNobodyCanTypeIsLocked) {
  EXPECT_TRUE(FindPerson("root", FILES).locked);
}

TEST(PersonTest, NothingIsLockedWhenShadowCannotBeRead) {
  EXPECT_FALSE(FindPerson("root", {FILES.passwd, FILES.group, std::nullopt}).locked);
}

TEST(PersonTest, AnybodyElseIsOfTheDirectory) {
  for (const char* name : {"carol", "short", "ali"}) {
    const Person person = FindPerson(name, FILES);
    EXPECT_FALSE(person.local) << name;
    EXPECT_TRUE(person.assumed);
    EXPECT_EQ(person.groups, std::nullopt);
  }
}

}  // namespace

}  // namespace velmorctltest
