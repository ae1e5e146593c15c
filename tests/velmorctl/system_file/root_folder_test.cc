#include "system_file/root_folder.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "failure_of.h"
#include "support/files.h"
#include "tool.h"

namespace velmorctltest {

namespace {

using testsupport::MakeFolders;
using velmorctl::ExitCode;
using velmorctl::RootFolder;

class RootFolderTest : public ::testing::Test {
 protected:
  RootFolderTest() : folder_(scratch_.Path().substr(0, scratch_.Path().size() - 1)), root_(folder_) {
    MakeFolders(folder_ + "/etc");
  }

  void Link(const std::string& target, const std::string& name) const {
    ASSERT_EQ(symlink(target.c_str(), (folder_ + name).c_str()), 0);
  }

  testsupport::ScratchFolder scratch_;
  std::string folder_;
  RootFolder root_;
};

TEST_F(RootFolderTest, PutsItselfInFrontOfAName) {
  EXPECT_EQ(root_.Resolve("/etc/file"), folder_ + "/etc/file");
  EXPECT_EQ(root_.Shown("/etc/file"), folder_ + "/etc/file");
}

TEST_F(RootFolderTest, OfTheHostLeavesANameAsItIs) {
  const RootFolder host("/");
  EXPECT_TRUE(host.IsHost());
  EXPECT_EQ(host.Shown("/etc/file"), "/etc/file");
  EXPECT_EQ(host.Resolve("/etc/no-such-file"), "/etc/no-such-file");
}

TEST_F(RootFolderTest, FollowsAnAbsoluteLinkInside) {
  Link("/srv/target", "/etc/file");
  EXPECT_EQ(root_.Resolve("/etc/file"), folder_ + "/srv/target");
}

TEST_F(RootFolderTest, FollowsALinkOfAFolderOnTheWay) {
  MakeFolders(folder_ + "/usr/lib");
  Link("usr/lib", "/lib");
  EXPECT_EQ(root_.Resolve("/lib/file"), folder_ + "/usr/lib/file");
}

TEST_F(RootFolderTest, FollowsLinksOneAfterAnother) {
  Link("second", "/etc/first");
  Link("/etc/third", "/etc/second");
  EXPECT_EQ(root_.Resolve("/etc/first"), folder_ + "/etc/third");
}

TEST_F(RootFolderTest, LetsNoLinkLeadOutOfItself) {
  Link("../../../../../../etc/passwd", "/etc/file");
  EXPECT_EQ(root_.Resolve("/etc/file"), folder_ + "/etc/passwd");
}

TEST_F(RootFolderTest, LetsNoNameLeadOutOfItself) {
  EXPECT_EQ(root_.Resolve("/../../etc/./file"), folder_ + "/etc/file");
}

TEST_F(RootFolderTest, GoesUpFromWhereALinkHasLed) {
  MakeFolders(folder_ + "/srv/a/b");
  Link("/srv/a/b", "/etc/folder");
  EXPECT_EQ(root_.Resolve("/etc/folder/../file"), folder_ + "/srv/a/file");
}

TEST_F(RootFolderTest, IsAnOptionThatAShellReadsAsOneWord) {
  EXPECT_EQ(RootFolder("/").Option(), "");
  EXPECT_EQ(root_.Option(), " --root " + folder_);
  for (const char* name : {"/a root", "/it's", "/a$HOME", "/a\"b", "/~*", "/a;b"}) {
    MakeFolders(folder_ + name);
    const std::string script = "printf %s" + RootFolder(folder_ + name).Option();
    EXPECT_EQ(RunTool({"sh", "-c", script}).output, "--root" + folder_ + name);
  }
}

TEST_F(RootFolderTest, ReportsACircleOfLinks) {
  Link("second", "/etc/first");
  Link("first", "/etc/second");
  const velmorctl::Failure failure = FailureOf([&] { root_.Resolve("/etc/first"); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_EQ(DetailOf(failure, "file"), folder_ + "/etc/first");
}

TEST_F(RootFolderTest, IsRefusedWhenItIsNoFolder) {
  testsupport::WriteFile(folder_ + "/file", "");
  EXPECT_EQ(FailureOf([&] { RootFolder(folder_ + "/file"); }).Code(), ExitCode::Usage);
  EXPECT_EQ(FailureOf([&] { RootFolder(folder_ + "/none"); }).Code(), ExitCode::Usage);
  EXPECT_EQ(FailureOf([] { RootFolder(""); }).Code(), ExitCode::Usage);
}

TEST_F(RootFolderTest, MakesFoldersWithTheirModeWhateverTheUmask) {
  umask(0077);
  EXPECT_EQ(root_.MakeFolder("/var/lib/some", 0755), folder_ + "/var/lib/some");
  EXPECT_EQ(testsupport::ModeOf(folder_ + "/var"), 0755U);
  EXPECT_EQ(testsupport::ModeOf(folder_ + "/var/lib/some"), 0755U);
}

TEST_F(RootFolderTest, LeavesTheModeOfAFolderThatIsThere) {
  testsupport::SetMode(folder_ + "/etc", 0711);
  root_.MakeFolder("/etc", 0700);
  EXPECT_EQ(testsupport::ModeOf(folder_ + "/etc"), 0711U);
}

TEST_F(RootFolderTest, MakesTheFolderThatALinkLeadsTo) {
  Link("/srv", "/var");
  MakeFolders(folder_ + "/srv");
  EXPECT_EQ(root_.MakeFolder("/var/lib", 0755), folder_ + "/srv/lib");
  EXPECT_TRUE(testsupport::Exists(folder_ + "/srv/lib"));
}

}  // namespace

}  // namespace velmorctltest
