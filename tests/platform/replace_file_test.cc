// Files are replaced whole, with all that belongs to them, or not at all.
#include "hostmgmt/replace_file.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <csignal>
#include <string>
#include <vector>

#include "hostmgmt/host_management_exception.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/machine.h"

namespace {

using HostMgmt::ReplaceFile;
using HostMgmt::ReplaceFileIn;
using HostMgmt::Lib::HostMgmtException;

const std::string kFolder = "/run/files/";
const std::string kFile = kFolder + "file.conf";

class ReplaceFileTest : public testing::Test {
 protected:
  void SetUp() override { testsupport::MakeFolders(kFolder); }

  static struct stat StatusOf(const std::string& path) {
    struct stat status {};
    EXPECT_EQ(stat(path.c_str(), &status), 0);
    return status;
  }

  static void ExpectFailure(const std::string& reason) {
    EXPECT_THROW_WHAT(ReplaceFile(kFile, "new"), HostMgmtException,
                      "Unable to write '" + kFile + "': " + reason);
  }
};

TEST_F(ReplaceFileTest, MakesANewFileWithTheModeWhateverTheUmask) {
  umask(0077);
  ReplaceFile(kFile, "new", 0640);
  EXPECT_EQ(testsupport::ReadFile(kFile), "new");
  EXPECT_EQ(testsupport::ModeOf(kFile), 0640U);
}

TEST_F(ReplaceFileTest, ReplacesAndLeavesNothingBeside) {
  testsupport::WriteFile(kFile, "old and longer");
  ReplaceFile(kFile, "new");
  EXPECT_EQ(testsupport::ReadFile(kFile), "new");
  EXPECT_EQ(testsupport::NamesIn(kFolder), std::vector<std::string>{"file.conf"});
}

TEST_F(ReplaceFileTest, AReaderKeepsTheOldFile) {
  testsupport::WriteFile(kFile, "old");
  const int reader = open(kFile.c_str(), O_RDONLY | O_CLOEXEC);
  ReplaceFile(kFile, "new");
  char content[8] = {};
  EXPECT_EQ(read(reader, content, sizeof content), 3);
  EXPECT_STREQ(content, "old");
  close(reader);
}

TEST_F(ReplaceFileTest, KeepsTheMode) {
  testsupport::WriteFile(kFile, "old");
  ASSERT_EQ(chmod(kFile.c_str(), 04751), 0);
  ReplaceFile(kFile, "new");
  EXPECT_EQ(StatusOf(kFile).st_mode & 07777U, 04751U);
}

TEST_F(ReplaceFileTest, KeepsOwnerAndGroup) {
  testsupport::WriteFile(kFile, "old");
  // In a user namespace with one user, the file stays that user's.
  static_cast<void>(!chown(kFile.c_str(), 65534, 12));
  const struct stat before = StatusOf(kFile);
  ReplaceFile(kFile, "new");
  EXPECT_EQ(StatusOf(kFile).st_uid, before.st_uid);
  EXPECT_EQ(StatusOf(kFile).st_gid, before.st_gid);
}

/// A file with an attribute. Which attributes a file system takes depends on it and on whose it is.
struct MarkedFile {
  std::string path;
  std::string attribute;
};

bool Mark(const MarkedFile& file, const std::string& value) {
  testsupport::WriteFile(file.path, "old");
  return setxattr(file.path.c_str(), file.attribute.c_str(), value.data(), value.size(), 0) == 0;
}

TEST_F(ReplaceFileTest, KeepsExtendedAttributes) {
  const std::string value("va\0lue", 6);
  // In a user namespace only "user." attributes can be set, and those not in the sandbox's memory.
  MarkedFile file{kFile, "security.replace_file_test"};
  if (!Mark(file, value)) file = {"replace_file_test.marked", "user.replace_file_test"};
  ASSERT_TRUE(Mark(file, value));
  ReplaceFile(file.path, "new");
  char kept[16] = {};
  ASSERT_EQ(getxattr(file.path.c_str(), file.attribute.c_str(), kept, sizeof kept), 6);
  EXPECT_EQ(std::string(kept, 6), value);
  testsupport::RemoveFile(file.path);
}

TEST_F(ReplaceFileTest, KeepsTheAccessList) {
  testsupport::WriteFile(kFile, "old");
  // Version 2: the owner reads and writes, the group "0" reads, the rest nothing.
  const std::string list(
      "\x02\0\0\0"
      "\x01\0\x06\0\xff\xff\xff\xff"
      "\x04\0\x04\0\xff\xff\xff\xff"
      "\x08\0\x04\0\0\0\0\0"
      "\x10\0\x04\0\xff\xff\xff\xff"
      "\x20\0\0\0\xff\xff\xff\xff",
      44);
  ASSERT_EQ(setxattr(kFile.c_str(), "system.posix_acl_access", list.data(), list.size(), 0), 0);
  ReplaceFile(kFile, "new");
  char kept[64] = {};
  ASSERT_EQ(getxattr(kFile.c_str(), "system.posix_acl_access", kept, sizeof kept), 44);
  EXPECT_EQ(std::string(kept, 44), list);
}

TEST_F(ReplaceFileTest, EditsTheFileBehindALink) {
  testsupport::MakeFolders("/run/elsewhere");
  testsupport::WriteFile("/run/elsewhere/target", "old");
  ASSERT_EQ(symlink("../elsewhere/target", (kFolder + "middle").c_str()), 0);
  ASSERT_EQ(symlink("middle", kFile.c_str()), 0);
  ReplaceFile(kFile, "new");
  EXPECT_EQ(testsupport::ReadFile("/run/elsewhere/target"), "new");
  struct stat status {};
  ASSERT_EQ(lstat(kFile.c_str(), &status), 0);
  EXPECT_TRUE(S_ISLNK(status.st_mode));
}

TEST_F(ReplaceFileTest, MakesTheFileThatALinkLeadsTo) {
  ASSERT_EQ(symlink("/run/files/target", kFile.c_str()), 0);
  ReplaceFile(kFile, "new");
  EXPECT_EQ(testsupport::ReadFile("/run/files/target"), "new");
}

TEST_F(ReplaceFileTest, ACircleOfLinksIsReported) {
  ASSERT_EQ(symlink("file.conf", kFile.c_str()), 0);
  EXPECT_THROW_WHAT(ReplaceFile(kFile, "new"), HostMgmtException,
                    "Unable to follow '" + kFile + "': Too many levels of symbolic links");
}

/// A file in a folder that is open already.
class ReplaceFileInTest : public ReplaceFileTest {
 protected:
  void SetUp() override {
    ReplaceFileTest::SetUp();
    testsupport::MakeFolders("/run/outside");
    testsupport::WriteFile("/run/outside/file.conf", "outside");
    folder_ = open(kFolder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_GE(folder_, 0);
  }
  void TearDown() override { close(folder_); }

  int folder_ = -1;
};

TEST_F(ReplaceFileInTest, WritesIntoTheFolderWhereverItsPathLeadsByNow) {
  testsupport::WriteFile(kFile, "old");
  ASSERT_EQ(rename("/run/files", "/run/moved"), 0);
  ASSERT_EQ(symlink("/run/outside", "/run/files"), 0);
  ReplaceFileIn(folder_, kFile, "new");
  EXPECT_EQ(testsupport::ReadFile("/run/moved/file.conf"), "new");
  EXPECT_EQ(testsupport::NamesIn("/run/moved"), std::vector<std::string>{"file.conf"});
  EXPECT_EQ(testsupport::ReadFile("/run/outside/file.conf"), "outside");
}

TEST_F(ReplaceFileInTest, RefusesALinkInTheFilesPlace) {
  ASSERT_EQ(symlink("/run/outside/file.conf", kFile.c_str()), 0);
  EXPECT_THROW_WHAT(ReplaceFileIn(folder_, kFile, "new"), HostMgmtException,
                    "Unable to write '" + kFile + "': it is not a regular file");
  EXPECT_EQ(testsupport::ReadFile("/run/outside/file.conf"), "outside");
}

TEST_F(ReplaceFileInTest, MakesANewFileWithItsAttributesWhateverTheUmask) {
  umask(0077);
  ReplaceFileIn(folder_, kFile, "new", {.mode = 02640, .owner = getuid(), .group = getgid()});
  EXPECT_EQ(testsupport::ReadFile(kFile), "new");
  EXPECT_EQ(StatusOf(kFile).st_mode & 07777U, 02640U);
}

class MountedFileTest : public ReplaceFileTest {
 protected:
  void SetUp() override {
    ReplaceFileTest::SetUp();
    testsupport::WriteFile("/run/source", "old content that is longer");
    ASSERT_EQ(chmod("/run/source", 0604), 0);
    testsupport::WriteFile(kFile, "");
    ASSERT_EQ(mount("/run/source", kFile.c_str(), nullptr, MS_BIND, nullptr), 0);
  }
};

TEST_F(MountedFileTest, IsRewrittenInPlace) {
  ReplaceFile(kFile, "new");
  EXPECT_EQ(testsupport::ReadFile(kFile), "new");
  EXPECT_EQ(testsupport::ReadFile("/run/source"), "new");
  EXPECT_EQ(testsupport::ModeOf("/run/source"), 0604U);
  EXPECT_EQ(testsupport::NamesIn(kFolder), std::vector<std::string>{"file.conf"});
}

TEST_F(MountedFileTest, IsRewrittenInAReadOnlyFolder) {
  // Not below the read-only mount itself: the file's own mount must stay writable.
  ASSERT_EQ(mount(kFolder.c_str(), kFolder.c_str(), nullptr, MS_BIND, nullptr), 0);
  ASSERT_EQ(mount("/run/source", kFile.c_str(), nullptr, MS_BIND, nullptr), 0);
  ASSERT_EQ(mount(nullptr, kFolder.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY | MS_NOSUID, nullptr),
            0);
  ReplaceFile(kFile, "new");
  EXPECT_EQ(testsupport::ReadFile("/run/source"), "new");
}

TEST_F(MountedFileTest, KeepsItsContentWhenTheNewOneDoesNotFit) {
  testsupport::MakeFolders("/run/small");
  const testsupport::SmallFileSystem small("/run/small", 4096);
  testsupport::WriteFile("/run/small/source", "old");
  ASSERT_EQ(mount("/run/small/source", kFile.c_str(), nullptr, MS_BIND, nullptr), 0);
  EXPECT_THROW_WHAT(ReplaceFile(kFile, std::string(100000, 'x')), HostMgmtException,
                    "Unable to write '" + kFile + "': No space left on device");
  EXPECT_EQ(testsupport::ReadFile(kFile), "old");
  ASSERT_EQ(umount(kFile.c_str()), 0);
}

TEST_F(ReplaceFileTest, AFullDiskLeavesTheOldFileAndNothingElse) {
  const testsupport::SmallFileSystem small(kFolder, 8192);
  testsupport::WriteFile(kFile, "old");
  EXPECT_THROW_WHAT(ReplaceFile(kFile, std::string(100000, 'x')), HostMgmtException,
                    "Unable to write '" + kFile + "': No space left on device");
  EXPECT_EQ(testsupport::ReadFile(kFile), "old");
  EXPECT_EQ(testsupport::NamesIn(kFolder), std::vector<std::string>{"file.conf"});
}

TEST_F(ReplaceFileTest, AReadOnlyFileSystemIsReported) {
  testsupport::WriteFile(kFile, "old");
  ASSERT_EQ(mount(kFolder.c_str(), kFolder.c_str(), nullptr, MS_BIND, nullptr), 0);
  ASSERT_EQ(mount(nullptr, kFolder.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY | MS_NOSUID, nullptr),
            0);
  ExpectFailure("Read-only file system");
  EXPECT_EQ(testsupport::ReadFile(kFile), "old");
}

TEST_F(ReplaceFileTest, AFolderWithoutTheRightToWriteIsReported) {
  testsupport::WriteFile(kFile, "old");
  ASSERT_EQ(chmod(kFolder.c_str(), 0555), 0);
  const testsupport::WithoutFilePowers powerless;
  ExpectFailure("Permission denied");
}

TEST_F(ReplaceFileTest, AMissingFolderIsReported) {
  EXPECT_THROW_WHAT(ReplaceFile("/run/missing/file", "new"), HostMgmtException,
                    "Unable to write '/run/missing/file': No such file or directory");
}

TEST_F(ReplaceFileTest, AFolderInTheFilesPlaceIsReported) {
  testsupport::MakeFolders(kFile);
  ExpectFailure("it is not a regular file");
}

TEST_F(ReplaceFileTest, AKilledWriterLeavesTheOldContentOrTheNew) {
  const std::string contents[] = {std::string(300000, 'a'), std::string(300000, 'b')};
  ReplaceFile(kFile, contents[0]);
  for (int round = 0; round < 20; ++round) {
    int ready[2];
    ASSERT_EQ(pipe(ready), 0);
    const pid_t child = fork();
    if (child == 0) {
      for (int number = 0;; ++number) {
        ReplaceFile(kFile, contents[number % 2]);
        if (write(ready[1], "x", 1) != 1) _exit(1);
      }
    }
    char byte = 0;
    for (int number = 0; number <= round % 4; ++number) ASSERT_EQ(read(ready[0], &byte, 1), 1);
    kill(child, SIGKILL);
    waitpid(child, nullptr, 0);
    close(ready[0]);
    close(ready[1]);
    const std::string content = testsupport::ReadFile(kFile);
    ASSERT_TRUE(content == contents[0] || content == contents[1]) << content.size();
  }
}

}  // namespace
