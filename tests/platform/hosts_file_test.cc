// How the hosts file is edited.
#include "kernctl/hosts_file.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <netdb.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "hostmgmt/host_management_exception.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/machine.h"

namespace {

using HostMgmt::Lib::HostMgmtException;
using KernCtl::Network::HostsFile;

const std::string kFile = "/etc/hosts";

void Add() {
  HostsFile().AddOrReplaceEntry("10.0.0.5", "h.corp.example", {"h"});
}

/// What the file holds after the usual entry has been added to `before`.
std::string After(const std::string& before) {
  testsupport::WriteFile(kFile, before);
  Add();
  return testsupport::ReadFile(kFile);
}

const std::string kEntry = "10.0.0.5\th.corp.example h\n";

TEST(HostsFileTest, AppendsANewEntry) {
  EXPECT_EQ(After("127.0.0.1 localhost\n"), "127.0.0.1 localhost\n" + kEntry);
}

TEST(HostsFileTest, MakesAMissingFile) {
  testsupport::RemoveFile(kFile);
  Add();
  EXPECT_EQ(testsupport::ReadFile(kFile), kEntry);
  EXPECT_EQ(testsupport::ModeOf(kFile), 0644U);
}

TEST(HostsFileTest, FillsAnEmptyFile) {
  EXPECT_EQ(After(""), kEntry);
}

TEST(HostsFileTest, EndsALastLineThatWasNotEnded) {
  EXPECT_EQ(After("127.0.0.1 localhost"), "127.0.0.1 localhost\n" + kEntry);
}

TEST(HostsFileTest, ReplacesTheEntryInItsPlace) {
  EXPECT_EQ(After("127.0.0.1 localhost\n10.0.0.5 old older\n10.0.0.6 other\n"),
            "127.0.0.1 localhost\n" + kEntry + "10.0.0.6 other\n");
}

TEST(HostsFileTest, RemovesFurtherEntriesOfTheAddress) {
  EXPECT_EQ(After("10.0.0.5 one\n10.0.0.6 other\n10.0.0.5 two\n10.0.0.5 three"), kEntry + "10.0.0.6 other\n");
}

TEST(HostsFileTest, KeepsCommentsEmptyLinesAndOrder) {
  const std::string before = "# top\n\n127.0.0.1 localhost # loop\n\t# indented\n#10.0.0.5 commented out\n";
  EXPECT_EQ(After(before), before + kEntry);
}

TEST(HostsFileTest, KeepsTheCommentOfAReplacedEntry) {
  EXPECT_EQ(After("10.0.0.5 old # management\n"), "10.0.0.5\th.corp.example h\t# management\n");
}

TEST(HostsFileTest, KeepsTheCommentOfARemovedEntry) {
  EXPECT_EQ(After("10.0.0.5 one\n10.0.0.5 two # note\n"), kEntry + "# note\n");
}

TEST(HostsFileTest, DoesNotTakeALongerAddressForTheSame) {
  EXPECT_EQ(After("10.0.0.50 other\n110.0.0.5 another\n"), "10.0.0.50 other\n110.0.0.5 another\n" + kEntry);
}

TEST(HostsFileTest, StandsBeforeAnEarlierLineThatWouldWinForItsName) {
  EXPECT_EQ(After("127.0.0.1 localhost\n127.0.1.1 h.corp.example h\n10.0.0.6 other\n"),
            "127.0.0.1 localhost\n" + kEntry + "127.0.1.1 h.corp.example h\n10.0.0.6 other\n");
}

TEST(HostsFileTest, StandsBeforeAnEarlierLineThatWouldWinForItsAlias) {
  EXPECT_EQ(After("127.0.1.1\tx.local\tH # stock\n"), kEntry + "127.0.1.1\tx.local\tH # stock\n");
}

TEST(HostsFileTest, MovesBeforeALineThatWouldWin) {
  EXPECT_EQ(After("127.0.1.1 h\n10.0.0.6 other\n10.0.0.5 h # note\n10.0.0.5 again\n"),
            "10.0.0.5\th.corp.example h\t# note\n127.0.1.1 h\n10.0.0.6 other\n");
}

TEST(HostsFileTest, StaysBeforeALaterLineWithItsName) {
  EXPECT_EQ(After("10.0.0.5 old\n127.0.1.1 h\n"), kEntry + "127.0.1.1 h\n");
}

TEST(HostsFileTest, TheResolverFindsTheNewAddressFirst) {
  After("127.0.0.1 localhost\n127.0.1.1 h.corp.example h\n");
  const hostent* const found = gethostbyname("h");
  ASSERT_TRUE(found);
  EXPECT_EQ(std::string(found->h_addr_list[0], 4), std::string("\x0a\x00\x00\x05", 4));
  EXPECT_STREQ(found->h_name, "h.corp.example");
}

TEST(HostsFileTest, IsNotWrittenWhenNothingChanges) {
  testsupport::WriteFile(kFile, "10.0.0.5   h.corp.example\t h # as it is\n");
  struct stat before {};
  stat(kFile.c_str(), &before);
  Add();
  struct stat after {};
  stat(kFile.c_str(), &after);
  EXPECT_EQ(before.st_ino, after.st_ino);
  EXPECT_EQ(testsupport::ReadFile(kFile), "10.0.0.5   h.corp.example\t h # as it is\n");
}

TEST(HostsFileTest, AddingTwiceIsAddingOnce) {
  const std::string once = After("127.0.0.1 localhost\n127.0.1.1 h\n");
  EXPECT_EQ(After(once), once);
}

TEST(HostsFileTest, KeepsCarriageReturns) {
  EXPECT_EQ(After("127.0.0.1 localhost\r\n10.0.0.5 old\r\n"),
            "127.0.0.1 localhost\r\n10.0.0.5\th.corp.example h\r\n");
  EXPECT_EQ(After("127.0.0.1 localhost\r\n"), "127.0.0.1 localhost\r\n10.0.0.5\th.corp.example h\r\n");
}

TEST(HostsFileTest, LeavesOddLinesAlone) {
  const std::string before = std::string("10.0.0.7\n   \nrubbish\n") + std::string("x\0y z\n", 6) +
                             "10.0.0.8 " + std::string(200000, 'n') + "\n";
  EXPECT_TRUE(After(before) == before + kEntry);
}

TEST(HostsFileTest, LeavesIpv6LinesAlone) {
  const std::string before = "::1 localhost ip6-localhost\nfe80::1%eth0 router\n";
  EXPECT_EQ(After(before), before + kEntry);
}

TEST(HostsFileTest, KnowsAnIpv6AddressInAnyForm) {
  testsupport::WriteFile(kFile, "2001:DB8:0:0::5 old\n");
  HostsFile().AddOrReplaceEntry("2001:db8::5", "h.corp.example", {});
  EXPECT_EQ(testsupport::ReadFile(kFile), "2001:db8::5\th.corp.example\n");
}

TEST(HostsFileTest, WorksOnTheFileAsItIsAtTheCall) {
  HostsFile file;
  testsupport::WriteFile(kFile, "10.0.0.9 later\n");
  file.AddOrReplaceEntry("10.0.0.5", "h.corp.example", {"h"});
  EXPECT_EQ(testsupport::ReadFile(kFile), "10.0.0.9 later\n" + kEntry);
}

TEST(HostsFileTest, KeepsModeAndOwner) {
  ASSERT_EQ(chmod(kFile.c_str(), 0664), 0);
  struct stat before {};
  stat(kFile.c_str(), &before);
  Add();
  struct stat after {};
  stat(kFile.c_str(), &after);
  EXPECT_EQ(before.st_mode, after.st_mode);
  EXPECT_EQ(before.st_uid, after.st_uid);
  EXPECT_EQ(before.st_gid, after.st_gid);
}

TEST(HostsFileTest, RefusesWhatIsNoAddress) {
  HostsFile file;
  for (const std::string address : {"", "host", "10.0.0", "10.0.0.5 x", "10.0.0.5\n"}) {
    EXPECT_THROW_WHAT(file.AddOrReplaceEntry(address, "h", {}), HostMgmtException,
                      "'" + address + "' is not an IP address");
  }
}

TEST(HostsFileTest, RefusesNamesThatWouldBeReadAsSomethingElse) {
  const std::string before = testsupport::ReadFile(kFile);
  HostsFile file;
  for (const std::string name : {"", "a b", "a\tb", "a\n10.0.0.1 b", "a#b"}) {
    const std::string text = "'" + name + "' cannot be a host name in '/etc/hosts'";
    EXPECT_THROW_WHAT(file.AddOrReplaceEntry("10.0.0.5", name, {}), HostMgmtException, text);
    EXPECT_THROW_WHAT(file.AddOrReplaceEntry("10.0.0.5", "h", {name}), HostMgmtException, text);
  }
  EXPECT_EQ(testsupport::ReadFile(kFile), before);
}

TEST(HostsFileTest, AFileThatCannotBeReadFailsAtOpening) {
  ASSERT_EQ(chmod(kFile.c_str(), 0), 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_THROW_WHAT(HostsFile(), HostMgmtException, "Unable to read '/etc/hosts': Permission denied");
}

TEST(HostsFileTest, NothingHangsOnAPipe) {
  testsupport::RemoveFile(kFile);
  ASSERT_EQ(mkfifo(kFile.c_str(), 0644), 0);
  EXPECT_THROW_WHAT(HostsFile(), HostMgmtException, "Unable to read '/etc/hosts': it is not a regular file");
}

TEST(HostsFileTest, AnEditThatAnotherProcessHoldsUpIsReported) {
  Add();
  const int lock = open("/run/quenix/hosts.lock", O_RDWR | O_CLOEXEC);
  ASSERT_EQ(flock(lock, LOCK_EX), 0);
  HostsFile file;
  EXPECT_THROW_WHAT(
      file.AddOrReplaceEntry("10.0.0.6", "other", {}), HostMgmtException,
      "Unable to change '/etc/hosts': cannot lock '/run/quenix/hosts.lock': another process has held "
      "it for ten seconds");
  close(lock);
}

TEST(HostsFileTest, NobodyElseCanHoldUpAnEdit) {
  umask(0);
  Add();
  EXPECT_EQ(testsupport::ModeOf("/run/quenix/hosts.lock"), 0600U);
  EXPECT_EQ(testsupport::ModeOf("/run/quenix"), 0755U);
}

TEST(HostsFileTest, NoEntryOfSeveralProcessesIsLost) {
  std::vector<pid_t> children;
  for (int process = 0; process < 8; ++process) {
    const pid_t child = fork();
    if (child == 0) {
      const std::string number = std::to_string(process);
      HostsFile().AddOrReplaceEntry("10.0.1." + number, "host" + number, {});
      _exit(0);
    }
    children.push_back(child);
  }
  for (const pid_t child : children) {
    int status = -1;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
  }
  const std::string content = testsupport::ReadFile(kFile);
  for (int process = 0; process < 8; ++process) {
    const std::string number = std::to_string(process);
    EXPECT_NE(content.find("10.0.1." + number + "\thost" + number + "\n"), std::string::npos) << content;
  }
}

}  // namespace
