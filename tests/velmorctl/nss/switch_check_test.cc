#include "nss/switch_check.h"

#include <gtest/gtest.h>

#include "support/files.h"

namespace velmorctltest {

namespace {

using velmorctl::FileProblem;
using velmorctl::RootFolder;
using velmorctl::ServiceModules;

/// A root whose libraries have the modules of "sss" and "compat".
class SwitchCheckTest : public ::testing::Test {
 protected:
  SwitchCheckTest() : root_(scratch_.Path()) {
    testsupport::MakeFolders(scratch_.Path() + "usr/lib/x86_64-linux-gnu");
    testsupport::WriteFile(scratch_.Path() + "usr/lib/x86_64-linux-gnu/libnss_sss.so.2", "");
    testsupport::WriteFile(scratch_.Path() + "usr/lib/libnss_compat.so.2", "");
  }

  std::vector<FileProblem> Check(const std::string& text) const {
    return CheckSwitchFile(velmorctl::SwitchFile(text), "nsswitch.conf", ServiceModules(root_));
  }

  /// The only finding.
  FileProblem Finding(const std::string& text) const {
    const std::vector<FileProblem> findings = Check(text);
    EXPECT_EQ(findings.size(), 1U) << text;
    return findings.empty() ? FileProblem() : findings.front();
  }

  void ExpectFine(const std::string& text) const {
    for (const FileProblem& finding : Check(text)) {
      ADD_FAILURE() << text << finding.reason;
    }
  }

  testsupport::ScratchFolder scratch_;
  RootFolder root_;
};

TEST_F(SwitchCheckTest, FindsNothingInAGoodFile) {
  ExpectFine("# comment\n\npasswd: files sss\ngroup: compat sss\nhosts: files dns\nsudoers: files x\n");
}

TEST_F(SwitchCheckTest, NamesFileLineValueAndRemedy) {
  const FileProblem finding = Finding("hosts: files\npasswd: files winbind\n");
  EXPECT_EQ(finding.file, "nsswitch.conf");
  EXPECT_EQ(finding.line, 2);
  EXPECT_EQ(finding.value, "winbind");
  EXPECT_EQ(finding.reason, "the library folders have no module libnss_winbind.so.2");
  EXPECT_NE(finding.remedy.find("velmorctl nss remove passwd winbind"), std::string::npos);
}

TEST_F(SwitchCheckTest, KnowsTheServicesThatAreBuiltIn) {
  ExpectFine("hosts: files dns\n");
}

TEST_F(SwitchCheckTest, LeavesModulesAloneThatDebianDoesNotBring) {
  ExpectFine("protocols: db files\nservices: db files\nethers: db files\nrpc: db files\nnetgroup: nis\n");
  EXPECT_EQ(Finding("passwd: files nis\n").value, "nis");
}

TEST_F(SwitchCheckTest, LooksForNoModulesInATreeWithoutLibraries) {
  const testsupport::ScratchFolder bare;
  EXPECT_TRUE(CheckSwitchFile(velmorctl::SwitchFile("passwd: files winbind\n"), "nsswitch.conf",
                              ServiceModules(RootFolder(bare.Path())))
                  .empty());
}

TEST_F(SwitchCheckTest, FindsFilesThatDoNotStandFirst) {
  for (const char* database : {"passwd", "group", "shadow"}) {
    EXPECT_EQ(Finding(std::string(database) + ": sss files\n").value, "sss");
  }
  ExpectFine("gshadow: sss files\nhosts: dns files\n");
}

TEST_F(SwitchCheckTest, FindsADatabaseWithoutServices) {
  EXPECT_EQ(Finding("hosts:\n").value, "hosts");
}

TEST_F(SwitchCheckTest, FindsAServiceThatStandsTwice) {
  EXPECT_EQ(Finding("passwd: files sss files\n").value, "files");
}

TEST_F(SwitchCheckTest, FindsTheLineThatDoesNotCount) {
  const FileProblem finding = Finding("passwd: files\ngroup: files\npasswd: files sss\n");
  EXPECT_EQ(finding.line, 1);
  EXPECT_EQ(finding.reason, "a later line of the same database takes the place of this one");
}

TEST_F(SwitchCheckTest, FindsADatabaseThatNobodyReads) {
  EXPECT_EQ(Finding("pasword: files\n").value, "pasword");
}

TEST_F(SwitchCheckTest, FindsServicesThatAreNeverAsked) {
  EXPECT_EQ(Finding("passwd: files [NOTFOUND=return] sss\n").value, "sss");
  EXPECT_EQ(Finding("hosts: files [!SUCCESS=return] dns\n").value, "dns");
  ExpectFine("hosts: sss [NOTFOUND=return] dns\ngroup: files [SUCCESS=merge] sss\n");
}

TEST_F(SwitchCheckTest, SaysThatBadBracketsSpoilTheWholeFile) {
  EXPECT_NE(Finding("hosts: files [FOUND=return]\n").reason.find("no line of the file"), std::string::npos);
  EXPECT_EQ(Finding("sudoers: files [FOUND=return]\n").reason, "the brackets have no meaning");
}

TEST_F(SwitchCheckTest, FindsEveryFaultOfALine) {
  for (const char* text :
       {": files\n", "hosts files\n", "hosts:: files\n", "hosts: files [NOTFOUND=return] []\n",
        "hosts: files # remark\n", "hosts: files"}) {
    EXPECT_EQ(Check(text).size(), 1U) << text;
  }
}

}  // namespace

}  // namespace velmorctltest
