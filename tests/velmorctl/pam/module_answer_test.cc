#include "pam/module_answer.h"

#include <gtest/gtest.h>

#include <sstream>

namespace velmorctltest {

namespace {

using velmorctl::pam::AnswerOf;
using velmorctl::pam::Circumstances;
using velmorctl::pam::CommonDirectoryModules;
using velmorctl::pam::FindPerson;
using velmorctl::pam::LocalAdministrator;
using velmorctl::pam::NameOf;
using velmorctl::pam::Operation;
using velmorctl::pam::Root;
using velmorctl::pam::StackEntry;

class ModuleAnswerTest : public ::testing::Test {
 protected:
  ModuleAnswerTest() {
    circumstances.user = LocalAdministrator();
    circumstances.service = "sshd";
    circumstances.directoryModules = CommonDirectoryModules();
    circumstances.moduleExists = [](const std::string& module) { return module != "pam_nowhere.so"; };
    circumstances.fileExists = [this](const std::string& path) { return path == existingFile; };
  }

  void AsDirectoryUser() { circumstances.user = FindPerson("carol", {}); }

  std::string Answer(const std::string& line, Operation operation = Operation::Authenticate) const {
    std::istringstream stream(line);
    StackEntry entry;
    stream >> entry.module;
    for (std::string argument; stream >> argument;) {
      entry.arguments.push_back(argument);
    }
    return NameOf(AnswerOf(entry, operation, circumstances).code);
  }

  Circumstances circumstances;
  std::string existingFile;
};

TEST_F(ModuleAnswerTest, AModuleThatDoesNotExistIsUnknown) {
  EXPECT_EQ(Answer("pam_nowhere.so"), "module_unknown");
}

TEST_F(ModuleAnswerTest, UnixKnowsLocalUsersOnly) {
  EXPECT_EQ(Answer("pam_unix.so"), "success");
  EXPECT_EQ(Answer("pam_unix.so", Operation::ManageAccount), "success");
  AsDirectoryUser();
  EXPECT_EQ(Answer("pam_unix.so"), "user_unknown");
  EXPECT_EQ(Answer("pam_unix.so", Operation::ManageAccount), "success");
  circumstances.directoryUp = false;
  EXPECT_EQ(Answer("pam_unix.so", Operation::ManageAccount), "user_unknown");
  EXPECT_EQ(Answer("pam_unix.so", Operation::OpenSession), "success");
}

TEST_F(ModuleAnswerTest, UnixRefusesAWrongAndALockedPassword) {
  circumstances.rightPassword = false;
  EXPECT_EQ(Answer("pam_unix.so"), "auth_err");
  circumstances.rightPassword = true;
  circumstances.user.locked = true;
  EXPECT_EQ(Answer("pam_unix.so"), "auth_err");
}

TEST_F(ModuleAnswerTest, ADirectoryKnowsItsOwnUsersOnly) {
  EXPECT_EQ(Answer("pam_winbind.so"), "user_unknown");
  AsDirectoryUser();
  EXPECT_EQ(Answer("pam_winbind.so"), "success");
  circumstances.rightPassword = false;
  EXPECT_EQ(Answer("pam_winbind.so"), "auth_err");
}

TEST_F(ModuleAnswerTest, ADirectoryThatIsAwayIsUnavailable) {
  circumstances.directoryUp = false;
  for (Operation operation : {Operation::Authenticate, Operation::ManageAccount, Operation::OpenSession}) {
    EXPECT_EQ(Answer("/lib/security/pam_sss.so", operation), "authinfo_unavail");
    EXPECT_EQ(Answer("pam_sss.so ignore_authinfo_unavail", operation), "ignore");
  }
}

TEST_F(ModuleAnswerTest, ADirectoryCanIgnoreLocalUsers) {
  EXPECT_EQ(Answer("pam_sss.so ignore_unknown_user", Operation::ManageAccount), "ignore");
}

TEST_F(ModuleAnswerTest, TheProvidersModuleIsADirectory) {
  circumstances.directoryModules.insert("pam_mine");
  EXPECT_EQ(Answer("pam_mine.so"), "user_unknown");
}

TEST_F(ModuleAnswerTest, DenyRefusesEachOperationInItsWay) {
  EXPECT_EQ(Answer("pam_deny.so"), "auth_err");
  EXPECT_EQ(Answer("pam_deny.so", Operation::SetCredentials), "cred_err");
  EXPECT_EQ(Answer("pam_deny.so", Operation::ManageAccount), "auth_err");
  EXPECT_EQ(Answer("pam_deny.so", Operation::OpenSession), "session_err");
  EXPECT_EQ(Answer("pam_deny.so", Operation::ChangeToken), "authtok_err");
}

TEST_F(ModuleAnswerTest, PermitLetsEverybodyIn) {
  circumstances.rightPassword = false;
  EXPECT_EQ(Answer("pam_permit.so"), "success");
}

TEST_F(ModuleAnswerTest, RootOkSeesAnOrdinaryCaller) {
  circumstances.user = Root();
  EXPECT_EQ(Answer("pam_rootok.so"), "auth_err");
}

TEST_F(ModuleAnswerTest, LocalUserTellsLocalUsers) {
  EXPECT_EQ(Answer("pam_localuser.so"), "success");
  AsDirectoryUser();
  EXPECT_EQ(Answer("pam_localuser.so"), "perm_denied");
}

TEST_F(ModuleAnswerTest, LocalUserHasNothingAgainstCredentials) {
  AsDirectoryUser();
  EXPECT_EQ(Answer("pam_localuser.so", Operation::SetCredentials), "success");
}

TEST_F(ModuleAnswerTest, NoLoginKeepsAllButRootOut) {
  EXPECT_EQ(Answer("pam_nologin.so"), "ignore");
  EXPECT_EQ(Answer("pam_nologin.so successok"), "success");
  existingFile = "/etc/nologin";
  EXPECT_EQ(Answer("pam_nologin.so"), "auth_err");
  EXPECT_EQ(Answer("pam_nologin.so file=/etc/closed"), "ignore");
  EXPECT_EQ(Answer("pam_nologin.so", Operation::SetCredentials), "ignore");
  circumstances.user = Root();
  EXPECT_EQ(Answer("pam_nologin.so"), "success");
}

TEST_F(ModuleAnswerTest, FailLockCountsFailuresWhereItIsToldTo) {
  EXPECT_EQ(Answer("pam_faillock.so preauth"), "success");
  EXPECT_EQ(Answer("pam_faillock.so authfail"), "auth_err");
}

TEST_F(ModuleAnswerTest, SucceedIfIsEvaluated) {
  EXPECT_EQ(Answer("pam_succeed_if.so uid >= 1000"), "success");
  EXPECT_EQ(Answer("pam_succeed_if.so uid < 1000"), "auth_err");
  EXPECT_EQ(Answer("pam_succeed_if.so uid < 1000", Operation::SetCredentials), "ignore");
}

TEST_F(ModuleAnswerTest, AnUnknownModuleSucceedsWithTheRightPassword) {
  EXPECT_EQ(Answer("pam_mystery.so"), "success");
  circumstances.rightPassword = false;
  EXPECT_EQ(Answer("pam_mystery.so"), "auth_err");
  EXPECT_EQ(Answer("pam_mystery.so", Operation::OpenSession), "success");
}

TEST_F(ModuleAnswerTest, WhatIsAssumedIsNoted) {
  StackEntry entry;
  entry.module = "pam_mystery.so";
  EXPECT_EQ(AnswerOf(entry, Operation::Authenticate, circumstances).note, "assumed: it succeeds");
}

}  // namespace

}  // namespace velmorctltest
