#include "config/atomic_file_stream.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <ios>
#include <string>
#include <vector>

#include "authentication/library_exceptions.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"

namespace quenix::authentication {
namespace {

using testsupport::Exists;
using testsupport::ModeOf;
using testsupport::NamesIn;
using testsupport::ReadFile;
using testsupport::TakeOver;
using testsupport::WriteFile;
namespace calls = testsupport::calls;

class AtomicFileStreamTest : public ::testing::Test {
 protected:
  /// The one temporary file in the folder.
  std::string Temporary() const {
    for (const std::string& name : NamesIn(folder_.Path())) {
      if (name != "target") {
        return folder_.Path() + name;
      }
    }
    return "";
  }

  const testsupport::ScratchFolder folder_;
  const std::string target_ = folder_.Path() + "target";
};

TEST_F(AtomicFileStreamTest, WritesATemporaryFileBesideItsTarget) {
  WriteFile(target_, "old");
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new" << std::flush;
  const std::string temporary = Temporary();
  EXPECT_EQ(temporary.substr(0, target_.size() + 1), target_ + ".");
  EXPECT_EQ(temporary.size(), target_.size() + 7);
  EXPECT_EQ(ReadFile(temporary), "new");
  EXPECT_EQ(ModeOf(temporary), 0600U);
  EXPECT_EQ(ReadFile(target_), "old");
}

TEST_F(AtomicFileStreamTest, CommitReplacesTheTarget) {
  WriteFile(target_, "old");
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new";
  stream.Commit();
  EXPECT_FALSE(stream.is_open());
  EXPECT_EQ(ReadFile(target_), "new");
  EXPECT_EQ(Temporary(), "");
}

TEST_F(AtomicFileStreamTest, WithoutCommitTheTargetStaysAndTheTemporaryFileToo) {
  WriteFile(target_, "old");
  {
    AtomicFileStream stream(target_.c_str(), std::ios_base::out);
    stream << "new";
  }
  EXPECT_EQ(ReadFile(target_), "old");
  EXPECT_EQ(ReadFile(Temporary()), "new");
}

TEST_F(AtomicFileStreamTest, AModeWithoutOutputIsOpenedForOutputAllTheSame) {
  AtomicFileStream stream(target_.c_str(), std::ios_base::binary);
  stream << "new";
  EXPECT_TRUE(stream.good());
  stream.Commit();
  EXPECT_EQ(ReadFile(target_), "new");
}

TEST_F(AtomicFileStreamTest, ATemporaryFileThatCannotBeOpenedOnlyFailsTheStream) {
  const TakeOver replaceByFolder(calls::mkstemp, [](char* pattern) {
    const int descriptor = calls::mkstemp.Real(pattern);
    testsupport::RemoveFile(pattern);
    testsupport::MakeFolders(pattern);
    return descriptor;
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  EXPECT_TRUE(stream.fail());
}

TEST_F(AtomicFileStreamTest, ATemporaryFileThatCannotBeCreatedIsAnError) {
  const std::string path = folder_.Path() + "missing/target";
  EXPECT_THROW_WHAT(AtomicFileStream(path.c_str(), std::ios_base::out), IOError,
                    "Unable to create temporary file to write '" + path + "': No such file or directory");
}

TEST_F(AtomicFileStreamTest, ATargetNameBeyondTheBufferCannotBeCreated) {
  const std::string path = folder_.Path() + std::string(4096, 'x');
  EXPECT_THROW_WHAT(AtomicFileStream(path.c_str(), std::ios_base::out), IOError,
                    "Unable to create temporary file to write '" + path + "': Invalid argument");
  EXPECT_TRUE(NamesIn(folder_.Path()).empty());
}

TEST_F(AtomicFileStreamTest, TheDescriptorOfTheCreationIsClosed) {
  int created = -1;
  const TakeOver watch(calls::mkstemp, [&](char* pattern) {
    created = fcntl(calls::mkstemp.Real(pattern), F_DUPFD_CLOEXEC, 100);
    return created;
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  ASSERT_GE(created, 100);
  EXPECT_EQ(fcntl(created, F_GETFD), -1);
}

TEST_F(AtomicFileStreamTest, ANewTargetKeepsTheTemporaryFilesMode) {
  bool changed = false;
  const TakeOver watch(calls::chmod, [&](const char* path, mode_t mode) {
    changed = true;
    return calls::chmod.Real(path, mode);
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream.Commit();
  EXPECT_EQ(ModeOf(target_), 0600U);
  EXPECT_FALSE(changed);
}

TEST_F(AtomicFileStreamTest, AnExistingTargetsModeIsCarriedOver) {
  WriteFile(target_, "old");
  testsupport::SetMode(target_, 01751);
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream.Commit();
  EXPECT_EQ(ModeOf(target_), 01751U);
}

TEST_F(AtomicFileStreamTest, StepsComeInOrderAndTheDataIsOnTheDiskBeforeTheRename) {
  WriteFile(target_, "old");
  std::vector<std::string> steps;
  const TakeOver watchFsync(calls::fsync, [&](int descriptor) {
    struct stat status {};
    fstat(descriptor, &status);
    steps.push_back("fsync " + std::to_string(status.st_size));
    return calls::fsync.Real(descriptor);
  });
  const TakeOver watchStat(calls::stat, [&](const char* path, struct stat* status) {
    if (path == target_) {
      steps.push_back("stat");
    }
    return calls::stat.Real(path, status);
  });
  const TakeOver watchRename(calls::rename, [&](const char* from, const char* to) {
    steps.push_back("rename");
    return calls::rename.Real(from, to);
  });
  const TakeOver watchChmod(calls::chmod, [&](const char* path, mode_t mode) {
    steps.push_back("chmod");
    return calls::chmod.Real(path, mode);
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new content";
  stream.Commit();
  EXPECT_EQ(steps, (std::vector<std::string>{"fsync 11", "stat", "rename", "chmod"}));
}

TEST_F(AtomicFileStreamTest, AStatusThatCannotBeTakenIsReportedAfterTheRename) {
  WriteFile(target_, "old");
  bool modeChanged = false;
  const TakeOver refuse(calls::stat, [&](const char* path, struct stat* status) {
    if (path == target_) {
      errno = EIO;
      return -1;
    }
    return calls::stat.Real(path, status);
  });
  const TakeOver watchChmod(calls::chmod, [&](const char*, mode_t) {
    modeChanged = true;
    return 0;
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new";
  EXPECT_THROW_WHAT(stream.Commit(), FilePermissionError,
                    "Failed to save file permissions, file permissions may be incorrect: Input/output error");
  EXPECT_EQ(ReadFile(target_), "new");
  EXPECT_FALSE(modeChanged);
}

TEST_F(AtomicFileStreamTest, TheReasonIsTheOneFromBeforeTheRename) {
  WriteFile(target_, "old");
  const TakeOver refuse(calls::stat, [&](const char* path, struct stat* status) {
    if (path == target_) {
      errno = EACCES;
      return -1;
    }
    return calls::stat.Real(path, status);
  });
  const TakeOver spoil(calls::rename, [](const char* from, const char* to) {
    const int result = calls::rename.Real(from, to);
    errno = ENOMEM;
    return result;
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  EXPECT_THROW_WHAT(stream.Commit(), FilePermissionError,
                    "Failed to save file permissions, file permissions may be incorrect: Permission denied");
}

TEST_F(AtomicFileStreamTest, AFailedRenameIsAnErrorWhateverTheStatusWas) {
  for (const int statusError : {0, ENOENT, EIO}) {
    const TakeOver answerStat(calls::stat, [&](const char* path, struct stat* status) {
      if (path == target_ && statusError != 0) {
        errno = statusError;
        return -1;
      }
      return calls::stat.Real(path, status);
    });
    const TakeOver refuse(calls::rename, [](const char*, const char*) {
      errno = EROFS;
      return -1;
    });
    WriteFile(target_, "old");
    AtomicFileStream stream(target_.c_str(), std::ios_base::out);
    const std::string temporary = Temporary();
    EXPECT_THROW_WHAT(stream.Commit(), IOError,
                      "Unable to rename '" + temporary + "' to '" + target_ + "': Read-only file system");
    EXPECT_EQ(ReadFile(target_), "old");
    testsupport::RemoveFile(temporary);
  }
}

TEST_F(AtomicFileStreamTest, ATemporaryFileThatHasGoneFailsTheRename) {
  for (const bool targetExists : {false, true}) {
    if (targetExists) WriteFile(target_, "old");
    AtomicFileStream stream(target_.c_str(), std::ios_base::out);
    const std::string temporary = Temporary();
    testsupport::RemoveFile(temporary);
    EXPECT_THROW_WHAT(stream.Commit(), IOError,
                      "Unable to rename '" + temporary + "' to '" + target_ + "': No such file or directory");
    EXPECT_EQ(Exists(target_), targetExists);
  }
}

TEST_F(AtomicFileStreamTest, AFailedModeChangeIsReportedWithTheNewContentInPlace) {
  WriteFile(target_, "old");
  const TakeOver refuse(calls::chmod, [](const char*, mode_t) {
    errno = EPERM;
    return -1;
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new";
  EXPECT_THROW_WHAT(
      stream.Commit(), FilePermissionError,
      "Failed to save file permissions, file permissions may be incorrect: Operation not permitted");
  EXPECT_EQ(ReadFile(target_), "new");
}

TEST_F(AtomicFileStreamTest, DataThatCannotBeBroughtToTheDiskLeavesTheTarget) {
  WriteFile(target_, "old");
  const TakeOver refuse(calls::fsync, [](int) {
    errno = EIO;
    return -1;
  });
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new";
  EXPECT_THROW_WHAT(stream.Commit(), IOError, "Unable to write '" + target_ + "': Input/output error");
  EXPECT_EQ(ReadFile(target_), "old");
  EXPECT_EQ(ReadFile(Temporary()), "new");
}

TEST_F(AtomicFileStreamTest, ADanglingLinkAsTargetIsReplaced) {
  ASSERT_EQ(symlink("nowhere", target_.c_str()), 0);
  AtomicFileStream stream(target_.c_str(), std::ios_base::out);
  stream << "new";
  stream.Commit();
  EXPECT_EQ(ReadFile(target_), "new");
  EXPECT_EQ(ModeOf(target_), 0600U);
}

}  // namespace
}  // namespace quenix::authentication
