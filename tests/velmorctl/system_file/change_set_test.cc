#include "system_file/change_set.h"

#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <filesystem>
#include <system_error>

#include "failure_of.h"
#include "marked_file.h"
#include "support/files.h"
#include "support/interpose.h"
#include "system_file/edit_lock.h"

namespace velmorctltest {

namespace {

using testsupport::Exists;
using testsupport::ReadFile;
using testsupport::WriteFile;
using velmorctl::BackupStore;
using velmorctl::ChangeSet;
using velmorctl::ExitCode;
using velmorctl::Failure;
using velmorctl::RootFolder;

/// A root with the files "first" and "second", and a set of changes that is not applied yet.
class ChangeSetTest : public ::testing::Test {
 protected:
  ChangeSetTest() : folder_(scratch_.Path()), root_(folder_), changes_(root_, "nss", "nss add x y") {
    WriteFile(folder_ + "first", "first\n");
    WriteFile(folder_ + "second", "second\n");
  }

  velmorctl::Snapshot Read(const std::string& name) const {
    return velmorctl::ReadSystemFileIfThere(root_, name);
  }

  void PlanBoth() {
    changes_.Write(Read("/first"), "first, changed\n");
    changes_.Write(Read("/second"), "second, changed\n");
  }

  void ExpectUnchanged() const {
    EXPECT_EQ(ReadFile(folder_ + "first"), "first\n");
    EXPECT_EQ(ReadFile(folder_ + "second"), "second\n");
  }

  std::vector<std::string> Backups() const { return BackupStore(root_, "nss").Ids(); }

  testsupport::ScratchFolder scratch_;
  std::string folder_;
  RootFolder root_;
  ChangeSet changes_;
};

/// Answers rename() onto the file itself; other renames go through.
class RenameOnto : public testsupport::TakeOver<int(const char*, const char*)> {
 public:
  RenameOnto(const std::string& target, const std::function<int(const char*, const char*)>& answer)
      : TakeOver(testsupport::calls::rename, [target, answer](const char* from, const char* to) {
          return to == target ? answer(from, to) : testsupport::calls::rename.Real(from, to);
        }) {}
};

int FailToWrite(const char*, const char*) {
  errno = EIO;
  return -1;
}

/// Does something once the backup is complete and before any file is written.
class AfterTheBackup : public testsupport::TakeOver<int(const char*, const char*)> {
 public:
  explicit AfterTheBackup(const std::function<void()>& action)
      : TakeOver(testsupport::calls::rename, [action](const char* from, const char* to) {
          const int result = testsupport::calls::rename.Real(from, to);
          if (std::string(from).find("/.unfinished.") != std::string::npos) {
            action();
          }
          return result;
        }) {}
};

/// Does something once, when a file whose path begins so has been written and has not taken its place yet.
class DuringTheWrite : public testsupport::TakeOver<int(int)> {
 public:
  DuringTheWrite(const std::string& path, const std::function<void()>& action)
      : TakeOver(testsupport::calls::fsync, [path, action, done = false](int descriptor) mutable {
          const std::string link = "/proc/self/fd/" + std::to_string(descriptor);
          if (!done && std::filesystem::read_symlink(link).string().starts_with(path)) {
            done = true;
            action();
          }
          return testsupport::calls::fsync.Real(descriptor);
        }) {}
};

TEST_F(ChangeSetTest, WritesEveryFile) {
  PlanBoth();
  changes_.Apply();
  EXPECT_EQ(ReadFile(folder_ + "first"), "first, changed\n");
  EXPECT_EQ(ReadFile(folder_ + "second"), "second, changed\n");
}

TEST_F(ChangeSetTest, BacksUpEveryFileFirst) {
  PlanBoth();
  const velmorctl::Backup backup = BackupStore(root_, "nss").Read(changes_.Apply());
  EXPECT_EQ(backup.command, "nss add x y");
  ASSERT_EQ(backup.files.size(), 2U);
  EXPECT_EQ(backup.files[0].name, "/first");
  EXPECT_EQ(backup.files[0].content, "first\n");
  EXPECT_EQ(backup.files[1].content, "second\n");
}

TEST_F(ChangeSetTest, ShowsTheChangesInTheirOrder) {
  PlanBoth();
  EXPECT_EQ(changes_.Diff(),
            "--- a/first\n+++ b/first\n@@ -1 +1 @@\n-first\n+first, changed\n"
            "--- a/second\n+++ b/second\n@@ -1 +1 @@\n-second\n+second, changed\n");
}

TEST_F(ChangeSetTest, HasNoChangeWhenTheContentIsThereAlready) {
  changes_.Write(Read("/first"), "first\n");
  changes_.Remove(Read("/none"));
  EXPECT_TRUE(changes_.ChangesNothing());
  EXPECT_EQ(changes_.Diff(), "");
}

TEST_F(ChangeSetTest, KeepsModeAndAttributes) {
  testsupport::SetMode(folder_ + "first", 0640);
  ASSERT_TRUE(Mark(folder_ + "first", "mark"));
  PlanBoth();
  changes_.Apply();
  EXPECT_EQ(testsupport::ModeOf(folder_ + "first"), 0640U);
  EXPECT_EQ(MarkOf(folder_ + "first"), "mark");
}

TEST_F(ChangeSetTest, WritesTheFileBehindALink) {
  ASSERT_EQ(symlink("/first", (folder_ + "link").c_str()), 0);
  changes_.Write(Read("/link"), "new\n");
  changes_.Apply();
  EXPECT_EQ(ReadFile(folder_ + "first"), "new\n");
  struct stat status {};
  ASSERT_EQ(lstat((folder_ + "link").c_str(), &status), 0);
  EXPECT_TRUE(S_ISLNK(status.st_mode));
}

TEST_F(ChangeSetTest, MakesANewFileWithItsMode) {
  umask(0077);
  changes_.Write(Read("/new"), "new\n", {.mode = 0644});
  changes_.Apply();
  EXPECT_EQ(ReadFile(folder_ + "new"), "new\n");
  EXPECT_EQ(testsupport::ModeOf(folder_ + "new"), 0644U);
}

TEST_F(ChangeSetTest, RemovesAFile) {
  changes_.Remove(Read("/first"));
  EXPECT_EQ(changes_.Diff(), "--- a/first\n+++ /dev/null\n@@ -1 +0,0 @@\n-first\n");
  changes_.Apply();
  EXPECT_FALSE(Exists(folder_ + "first"));
}

TEST_F(ChangeSetTest, RefusesAFileThatSomebodyElseHasChanged) {
  PlanBoth();
  WriteFile(folder_ + "second", "another's\n");
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(failure.Code(), ExitCode::Conflict);
  EXPECT_EQ(DetailOf(failure, "file"), folder_ + "second");
  EXPECT_EQ(ReadFile(folder_ + "first"), "first\n");
  EXPECT_EQ(ReadFile(folder_ + "second"), "another's\n");
  EXPECT_TRUE(Backups().empty());
}

TEST_F(ChangeSetTest, RefusesAFileThatIsChangedWhileTheBackupIsWritten) {
  PlanBoth();
  const AfterTheBackup change([this] { WriteFile(folder_ + "second", "another's\n"); });
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(failure.Code(), ExitCode::Conflict);
  EXPECT_EQ(DetailOf(failure, "file"), folder_ + "second");
  EXPECT_EQ(ReadFile(folder_ + "first"), "first\n");
  EXPECT_EQ(ReadFile(folder_ + "second"), "another's\n");
  EXPECT_TRUE(Backups().empty());
}

TEST_F(ChangeSetTest, FollowsNoLinkThatTakesTheFilesPlaceWhileTheBackupIsWritten) {
  const testsupport::ScratchFolder outside;
  WriteFile(outside.Path() + "first", "first\n");
  PlanBoth();
  const AfterTheBackup link([&] {
    testsupport::RemoveFile(folder_ + "first");
    ASSERT_EQ(symlink((outside.Path() + "first").c_str(), (folder_ + "first").c_str()), 0);
  });
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Conflict);
  EXPECT_EQ(ReadFile(outside.Path() + "first"), "first\n");
}

TEST_F(ChangeSetTest, FollowsNoLinkThatTakesAFoldersPlaceWhileTheBackupIsWritten) {
  const testsupport::ScratchFolder outside;
  WriteFile(outside.Path() + "file", "file\n");
  testsupport::MakeFolders(folder_ + "etc");
  WriteFile(folder_ + "etc/file", "file\n");
  changes_.Write(Read("/etc/file"), "changed\n");
  const AfterTheBackup link([&] {
    ASSERT_EQ(testsupport::calls::rename.Real((folder_ + "etc").c_str(), (folder_ + "old").c_str()), 0);
    ASSERT_EQ(symlink(outside.Path().c_str(), (folder_ + "etc").c_str()), 0);
  });
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Conflict);
  EXPECT_EQ(ReadFile(outside.Path() + "file"), "file\n");
}

TEST_F(ChangeSetTest, FollowsNoLinkThatTakesAFoldersPlaceWhileTheFileIsWritten) {
  const testsupport::ScratchFolder outside;
  WriteFile(outside.Path() + "file", "file\n");
  testsupport::MakeFolders(folder_ + "etc");
  WriteFile(folder_ + "etc/file", "file\n");
  changes_.Write(Read("/etc/file"), "changed\n");
  const DuringTheWrite link(folder_ + "etc/.file.", [&] {
    std::filesystem::rename(folder_ + "etc", folder_ + "old");
    std::filesystem::create_symlink(outside.Path(), folder_ + "etc");
  });
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Configuration);
  EXPECT_EQ(ReadFile(outside.Path() + "file"), "file\n");
  EXPECT_EQ(ReadFile(folder_ + "old/file"), "changed\n");
}

TEST_F(ChangeSetTest, PutsNothingBackThroughALink) {
  const testsupport::ScratchFolder outside;
  WriteFile(outside.Path() + "file", "changed\n");
  testsupport::MakeFolders(folder_ + "etc");
  testsupport::MakeFolders(folder_ + outside.Path());
  WriteFile(folder_ + "etc/file", "file\n");
  WriteFile(folder_ + outside.Path() + "file", "changed\n");
  changes_.Write(Read("/etc/file"), "changed\n");
  changes_.Write(Read("/second"), "second, changed\n");
  const RenameOnto second(folder_ + "second", [&](const char* from, const char* to) {
    testsupport::calls::rename.Real((folder_ + "etc").c_str(), (folder_ + "old").c_str());
    EXPECT_EQ(symlink(outside.Path().c_str(), (folder_ + "etc").c_str()), 0);
    return FailToWrite(from, to);
  });
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(DetailOf(failure, "left"), folder_ + "etc/file: not put back");
  EXPECT_EQ(ReadFile(outside.Path() + "file"), "changed\n");
}

TEST_F(ChangeSetTest, WritesBothNamesOfOneFile) {
  testsupport::RemoveFile(folder_ + "second");
  ASSERT_EQ(link((folder_ + "first").c_str(), (folder_ + "second").c_str()), 0);
  PlanBoth();
  changes_.Apply();
  EXPECT_EQ(ReadFile(folder_ + "first"), "first, changed\n");
  EXPECT_EQ(ReadFile(folder_ + "second"), "second, changed\n");
}

TEST_F(ChangeSetTest, RefusesToMakeAFileThatSomebodyElseHasMade) {
  changes_.Write(Read("/new"), "new\n");
  WriteFile(folder_ + "new", "another's\n");
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Conflict);
  EXPECT_EQ(ReadFile(folder_ + "new"), "another's\n");
}

TEST_F(ChangeSetTest, RefusesToWorkBesideAnotherCommand) {
  PlanBoth();
  const velmorctl::EditLock another(root_);
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Conflict);
  ExpectUnchanged();
}

TEST_F(ChangeSetTest, PutsEverythingBackWhenOneFileCannotBeWritten) {
  PlanBoth();
  const RenameOnto second(folder_ + "second", FailToWrite);
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_STREQ(failure.what(), ("Unable to write '" + folder_ + "second': Input/output error").c_str());
  ExpectUnchanged();
  EXPECT_TRUE(Backups().empty());
}

TEST_F(ChangeSetTest, PutsARemovedFileBackWithItsMode) {
  testsupport::SetMode(folder_ + "first", 0604);
  changes_.Remove(Read("/first"));
  changes_.Write(Read("/second"), "changed\n");
  const RenameOnto second(folder_ + "second", FailToWrite);
  FailureOf([&] { changes_.Apply(); });
  ExpectUnchanged();
  EXPECT_EQ(testsupport::ModeOf(folder_ + "first"), 0604U);
}

TEST_F(ChangeSetTest, TakesANewFileAwayAgain) {
  changes_.Write(Read("/new"), "new\n");
  changes_.Write(Read("/second"), "changed\n");
  const RenameOnto second(folder_ + "second", FailToWrite);
  FailureOf([&] { changes_.Apply(); });
  EXPECT_FALSE(Exists(folder_ + "new"));
}

TEST_F(ChangeSetTest, KeepsTheBackupWhenAFileCouldNotBePutBack) {
  PlanBoth();
  int renames = 0;
  const auto writeOnce = [&renames](const char* from, const char* to) {
    return ++renames == 1 ? testsupport::calls::rename.Real(from, to) : FailToWrite(from, to);
  };
  const std::string first = folder_ + "first";
  const std::string second = folder_ + "second";
  const testsupport::TakeOver both(testsupport::calls::rename, [&](const char* from, const char* to) {
    return to == second  ? FailToWrite(from, to)
           : to == first ? writeOnce(from, to)
                         : testsupport::calls::rename.Real(from, to);
  });
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(DetailOf(failure, "left"), first + ": not put back");
  ASSERT_EQ(Backups().size(), 1U);
  EXPECT_EQ(failure.Advice(), "velmorctl nss restore " + Backups().front() + " --root " +
                                  scratch_.Path().substr(0, scratch_.Path().size() - 1));
  EXPECT_EQ(ReadFile(first), "first, changed\n");
}

TEST_F(ChangeSetTest, LeavesAloneWhatSomebodyElseHasWrittenMeanwhile) {
  PlanBoth();
  const RenameOnto second(folder_ + "second", [this](const char* from, const char* to) {
    WriteFile(folder_ + "first", "another's\n");
    return FailToWrite(from, to);
  });
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(DetailOf(failure, "left"), folder_ + "first: not put back");
  EXPECT_EQ(ReadFile(folder_ + "first"), "another's\n");
}

TEST_F(ChangeSetTest, NoticesAFileThatIsNotWhatWasWritten) {
  PlanBoth();
  const RenameOnto second(folder_ + "second", [](const char* from, const char* to) {
    WriteFile(from, "second, damaged\n");
    return testsupport::calls::rename.Real(from, to);
  });
  const Failure failure = FailureOf([&] { changes_.Apply(); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_STREQ(failure.what(), ("'" + folder_ + "second' is not what was written to it").c_str());
  EXPECT_EQ(ReadFile(folder_ + "first"), "first\n");
}

volatile std::sig_atomic_t signalsSeen = 0;

TEST_F(ChangeSetTest, IsNotCutShortByASignal) {
  PlanBoth();
  struct sigaction action = {};
  action.sa_handler = [](int) { signalsSeen = signalsSeen + 1; };
  sigaction(SIGTERM, &action, nullptr);
  const RenameOnto first(folder_ + "first", [](const char* from, const char* to) {
    raise(SIGTERM);
    EXPECT_EQ(signalsSeen, 0);
    return testsupport::calls::rename.Real(from, to);
  });
  changes_.Apply();
  EXPECT_EQ(signalsSeen, 1);
  EXPECT_EQ(ReadFile(folder_ + "second"), "second, changed\n");
}

/// A root on a file system of its own.
class ChangeSetOnASmallDiskTest : public ::testing::Test {
 protected:
  ChangeSetOnASmallDiskTest()
      : disk_(scratch_.Path(), 64 << 10), root_(scratch_.Path()), changes_(root_, "nss", "nss add x y") {
    WriteFile(scratch_.Path() + "file", "text\n");
    changes_.Write(velmorctl::ReadSystemFile(root_, "/file"), "changed\n");
  }

  testsupport::ScratchFolder scratch_;
  testsupport::SmallFileSystem disk_;
  RootFolder root_;
  ChangeSet changes_;
};

TEST_F(ChangeSetOnASmallDiskTest, ChangesNothingWhenTheDiskIsFull) {
  EXPECT_THROW(WriteFile(scratch_.Path() + "rest", std::string(1 << 20, 'a')), std::system_error);
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Configuration);
  EXPECT_EQ(ReadFile(scratch_.Path() + "file"), "text\n");
  EXPECT_TRUE(BackupStore(root_, "nss").Ids().empty());
}

TEST_F(ChangeSetOnASmallDiskTest, ChangesNothingWhenTheDiskCannotBeWritten) {
  ASSERT_EQ(mount("", scratch_.Path().c_str(), "", MS_REMOUNT | MS_RDONLY, ""), 0);
  EXPECT_EQ(FailureOf([&] { changes_.Apply(); }).Code(), ExitCode::Configuration);
  EXPECT_EQ(ReadFile(scratch_.Path() + "file"), "text\n");
}

}  // namespace

}  // namespace velmorctltest
