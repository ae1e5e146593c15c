#include "system_file/file_calls.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include "failure_of.h"
#include "support/files.h"

namespace velmorctltest {

namespace {

using velmorctl::ExitCode;
using velmorctl::OpenFolder;

class OpenFolderTest : public ::testing::Test {
 protected:
  OpenFolderTest() { testsupport::MakeFolders(scratch_.Path() + "real/folder"); }

  testsupport::ScratchFolder scratch_;
};

TEST_F(OpenFolderTest, OpensWhatIsThere) {
  EXPECT_TRUE(OpenFolder(scratch_.Path() + "real/folder").IsOpen());
}

TEST_F(OpenFolderTest, GoesThroughNoLink) {
  ASSERT_EQ(symlink("real", (scratch_.Path() + "link").c_str()), 0);
  ASSERT_EQ(symlink("folder", (scratch_.Path() + "real/link").c_str()), 0);
  for (const char* name : {"link/folder", "link", "real/link"}) {
    EXPECT_EQ(FailureOf([&] { OpenFolder(scratch_.Path() + name); }).Code(), ExitCode::Conflict) << name;
  }
}

TEST_F(OpenFolderTest, ReportsWhatIsNotThere) {
  EXPECT_EQ(FailureOf([&] { OpenFolder(scratch_.Path() + "none"); }).Code(), ExitCode::Configuration);
}

}  // namespace

}  // namespace velmorctltest
