#include "authentication/cam_thumbprint_store.h"

#include <gtest/gtest.h>

#include "authentication/library_exceptions.h"
#include "support/files.h"
#include "support/interpose.h"

using namespace quenix::authentication;
using namespace testsupport;

namespace {

class CAMThumbprintStoreTest : public testing::Test {
 protected:
  CAMThumbprintStoreTest() { WriteFile(path_, "10.0.0.1 = \"AA:BB\"\n"); }

  ScratchFolder folder_;
  std::string path_ = folder_.Path() + "thumbprints";
};

}  // namespace

TEST_F(CAMThumbprintStoreTest, MissingFileIsAnError) {
  EXPECT_THROW(CAMThumbprintStore(folder_.Path() + "absent"), IOError);
}

TEST_F(CAMThumbprintStoreTest, KnownServerHasItsThumbprint) {
  EXPECT_EQ(CAMThumbprintStore(path_).LookupThumbprint("10.0.0.1"), "AA:BB");
}

TEST_F(CAMThumbprintStoreTest, UnknownServerHasAnEmptyOne) {
  EXPECT_EQ(CAMThumbprintStore(path_).LookupThumbprint("10.0.0.2"), "");
}

TEST_F(CAMThumbprintStoreTest, NewServerIsAddedToTheFile) {
  CAMThumbprintStore(path_).ImportThumbprint("CC", "10.0.0.2");
  EXPECT_EQ(ReadFile(path_), "10.0.0.1 = \"AA:BB\"\n10.0.0.2 = \"CC\"\n");
}

TEST_F(CAMThumbprintStoreTest, OtherThumbprintReplacesTheStoredOne) {
  CAMThumbprintStore(path_).ImportThumbprint("CC", "10.0.0.1");
  EXPECT_EQ(ReadFile(path_), "10.0.0.1 = \"CC\"\n");
}

TEST_F(CAMThumbprintStoreTest, SameThumbprintTwiceWritesTheFileOnce) {
  int renames = 0;
  TakeOver<int(const char*, const char*)> watch(calls::rename, [&renames](const char* from, const char* to) {
    ++renames;
    return calls::rename.Real(from, to);
  });
  CAMThumbprintStore store(path_);
  store.ImportThumbprint("CC", "10.0.0.2");
  store.ImportThumbprint("CC", "10.0.0.2");
  EXPECT_EQ(renames, 1);
}
