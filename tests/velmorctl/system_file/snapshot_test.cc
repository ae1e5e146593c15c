#include "system_file/snapshot.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "failure_of.h"
#include "support/files.h"
#include "support/machine.h"

namespace velmorctltest {

namespace {

using testsupport::WriteFile;
using velmorctl::ExitCode;
using velmorctl::FileProblem;
using velmorctl::InspectSystemFile;
using velmorctl::IsStillAsRead;
using velmorctl::RootFolder;
using velmorctl::Snapshot;
using velmorctl::SnapshotInspection;

class SnapshotTest : public ::testing::Test {
 protected:
  SnapshotTest() : root_(scratch_.Path()), path_(scratch_.Path() + "file") {}

  FileProblem Problem() const {
    const SnapshotInspection inspection = InspectSystemFile(root_, "/file");
    EXPECT_EQ(inspection.snapshot.content, "");
    EXPECT_FALSE(inspection.snapshot.Exists());
    EXPECT_TRUE(inspection.problem.has_value());
    return inspection.problem.value_or(FileProblem());
  }

  Snapshot Read() const { return velmorctl::ReadSystemFile(root_, "/file"); }

  testsupport::ScratchFolder scratch_;
  RootFolder root_;
  std::string path_;
};

TEST_F(SnapshotTest, HoldsContentAndNames) {
  WriteFile(path_, "one\r\ntwo\tthree \xe9\xff");
  const Snapshot snapshot = Read();
  EXPECT_EQ(snapshot.content, "one\r\ntwo\tthree \xe9\xff");
  EXPECT_EQ(snapshot.name, "/file");
  EXPECT_EQ(snapshot.path, path_);
  EXPECT_EQ(snapshot.shown, path_);
  EXPECT_TRUE(snapshot.Exists());
}

TEST_F(SnapshotTest, OfAnEmptyFileIsThere) {
  WriteFile(path_, "");
  EXPECT_TRUE(Read().Exists());
}

TEST_F(SnapshotTest, OfAMissingFileSaysSo) {
  EXPECT_EQ(Problem().kind, FileProblem::Kind::Missing);
  EXPECT_FALSE(velmorctl::ReadSystemFileIfThere(root_, "/file").Exists());
  const velmorctl::Failure failure = FailureOf([&] { Read(); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_EQ(DetailOf(failure, "file"), path_);
}

TEST_F(SnapshotTest, NamesWhereADanglingLinkLeads) {
  ASSERT_EQ(symlink("/nowhere", path_.c_str()), 0);
  EXPECT_EQ(Problem().kind, FileProblem::Kind::Missing);
  EXPECT_EQ(Problem().reason, "it leads to '" + scratch_.Path() + "nowhere', which does not exist");
}

TEST_F(SnapshotTest, IsOfTheFileBehindALink) {
  WriteFile(scratch_.Path() + "target", "text\n");
  ASSERT_EQ(symlink("/target", path_.c_str()), 0);
  EXPECT_EQ(Read().content, "text\n");
  EXPECT_EQ(Read().path, scratch_.Path() + "target");
}

TEST_F(SnapshotTest, RefusesAFolder) {
  testsupport::MakeFolders(path_);
  EXPECT_EQ(Problem().reason, "it is not a regular file");
}

TEST_F(SnapshotTest, RefusesAPipeWithoutWaitingForAWriter) {
  ASSERT_EQ(mkfifo(path_.c_str(), 0600), 0);
  EXPECT_EQ(Problem().reason, "it is not a regular file");
}

TEST_F(SnapshotTest, RefusesAGreatFileUnread) {
  WriteFile(path_, "");
  ASSERT_EQ(truncate(path_.c_str(), 100'000'000), 0);
  EXPECT_EQ(Problem().kind, FileProblem::Kind::Unreadable);
  EXPECT_EQ(Problem().reason, "it has more than a mebibyte, so it is no configuration file");
}

TEST_F(SnapshotTest, RefusesAnEndlessLine) {
  WriteFile(path_, std::string((1 << 20) + 1, 'a'));
  EXPECT_EQ(Problem().kind, FileProblem::Kind::Unreadable);
}

TEST_F(SnapshotTest, TakesAMebibyte) {
  WriteFile(path_, std::string(1 << 20, 'a'));
  EXPECT_EQ(Read().content.size(), 1U << 20U);
}

TEST_F(SnapshotTest, RefusesANullByteAndNamesItsLine) {
  WriteFile(path_, std::string("one\ntwo\0three\n", 14));
  EXPECT_EQ(Problem().kind, FileProblem::Kind::Malformed);
  EXPECT_EQ(Problem().line, 2);
  EXPECT_EQ(Problem().value, "0x00");
}

TEST_F(SnapshotTest, RefusesControlCharactersThatNoTextHas) {
  WriteFile(path_, "\x1b[2J");
  EXPECT_EQ(Problem().line, 1);
  EXPECT_EQ(Problem().value, "0x1b");
  WriteFile(path_, "\x7f");
  EXPECT_EQ(Problem().value, "0x7f");
}

TEST_F(SnapshotTest, ReportsAFileThatCannotBeRead) {
  WriteFile(path_, "text\n");
  testsupport::SetMode(path_, 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_EQ(Problem().kind, FileProblem::Kind::Unreadable);
  EXPECT_EQ(Problem().reason, "Permission denied");
}

/// The kernel gives the size of such a file as 0 and makes it up as it is read: to the reader it is always in
/// the middle of a change.
TEST_F(SnapshotTest, RefusesAFileThatIsNeverTheSame) {
  const SnapshotInspection inspection = InspectSystemFile(RootFolder("/"), "/proc/version");
  ASSERT_TRUE(inspection.problem.has_value());
  EXPECT_EQ(inspection.problem->reason, "it is changed while it is read");
}

TEST_F(SnapshotTest, KnowsAFileThatNobodyHasChanged) {
  WriteFile(path_, "text\n");
  EXPECT_TRUE(IsStillAsRead(root_, Read()));
}

TEST_F(SnapshotTest, NoticesOtherContent) {
  WriteFile(path_, "text\n");
  const Snapshot snapshot = Read();
  WriteFile(path_, "test\n");
  EXPECT_FALSE(IsStillAsRead(root_, snapshot));
}

TEST_F(SnapshotTest, NoticesAnotherFileWithTheSameContent) {
  WriteFile(path_, "text\n");
  const Snapshot snapshot = Read();
  WriteFile(path_ + ".new", "text\n");
  ASSERT_EQ(rename((path_ + ".new").c_str(), path_.c_str()), 0);
  EXPECT_FALSE(IsStillAsRead(root_, snapshot));
}

TEST_F(SnapshotTest, NoticesAnotherMode) {
  WriteFile(path_, "text\n");
  const Snapshot snapshot = Read();
  testsupport::SetMode(path_, 0604);
  EXPECT_FALSE(IsStillAsRead(root_, snapshot));
}

TEST_F(SnapshotTest, NoticesALinkThatLeadsElsewhere) {
  WriteFile(scratch_.Path() + "target", "text\n");
  ASSERT_EQ(symlink("target", path_.c_str()), 0);
  const Snapshot snapshot = Read();
  ASSERT_EQ(link((scratch_.Path() + "target").c_str(), (scratch_.Path() + "other").c_str()), 0);
  testsupport::RemoveFile(path_);
  ASSERT_EQ(symlink("other", path_.c_str()), 0);
  EXPECT_FALSE(IsStillAsRead(root_, snapshot));
}

TEST_F(SnapshotTest, NoticesAFileThatIsGone) {
  WriteFile(path_, "text\n");
  const Snapshot snapshot = Read();
  testsupport::RemoveFile(path_);
  EXPECT_FALSE(IsStillAsRead(root_, snapshot));
}

TEST_F(SnapshotTest, NoticesAFileThatHasAppeared) {
  const Snapshot snapshot = velmorctl::ReadSystemFileIfThere(root_, "/file");
  EXPECT_TRUE(IsStillAsRead(root_, snapshot));
  WriteFile(path_, "");
  EXPECT_FALSE(IsStillAsRead(root_, snapshot));
}

}  // namespace

}  // namespace velmorctltest
