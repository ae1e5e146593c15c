#include <dlfcn.h>
#include <gtest/gtest.h>

#include "process/loaded_library.h"
#include "support/files.h"

namespace testsupport {
namespace {

using Catch = const char* (*)(int);

class ModuleTest : public ::testing::Test {
 protected:
  ModuleTest() : module_(dlopen(VELMOR_CATCHING_MODULE, RTLD_NOW | RTLD_LOCAL)) {
    if (module_ != nullptr) {
      catch_ = reinterpret_cast<Catch>(dlsym(module_, "CatchByClass"));
    }
  }
  ~ModuleTest() override {
    if (module_ != nullptr) {
      dlclose(module_);
    }
  }

  void SetUp() override { ASSERT_NE(catch_, nullptr) << dlerror(); }

  void* module_;
  Catch catch_ = nullptr;
};

TEST_F(ModuleTest, CatchesTheLibrarysExceptionsByTheirClass) {
  EXPECT_STREQ(catch_(0), "IOError");
  EXPECT_STREQ(catch_(1), "InvalidActiveDirectoryProviderException");
}

TEST_F(ModuleTest, CatchesThePlatformsExceptionsByTheirClass) {
  WriteFile("/var/lib/quenix/configstore.db", std::string(5000, 'x'));
  EXPECT_STREQ(catch_(2), "ConfigStoreException");
}

TEST_F(ModuleTest, CatchesStandardExceptions) {
  EXPECT_STREQ(catch_(3), "std::exception");
}

TEST_F(ModuleTest, TakesTheLibraryWithItWhenItIsUnloaded) {
  EXPECT_STREQ(catch_(0), "IOError");
  dlclose(module_);
  module_ = nullptr;
  EXPECT_FALSE(LibraryIsMapped());
}

TEST_F(ModuleTest, SharesTheLibraryWithItsHost) {
  WriteFile("/etc/quenix/velmor/provider.conf", "");
  const LoadedLibrary library;
  EXPECT_THROW(library.CreateStore("Active Directory"), std::exception);
  EXPECT_STREQ(catch_(1), "InvalidActiveDirectoryProviderException");
}

}  // namespace
}  // namespace testsupport
