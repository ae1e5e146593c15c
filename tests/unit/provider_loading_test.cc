// Which shared object becomes the provider, and which ones are refused.

#include <dlfcn.h>
#include <elf.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstring>
#include <list>
#include <string>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "providers/active_directory_provider.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"

namespace quenix::authentication {
namespace {

using testsupport::BuiltPlugin;
using testsupport::InstalledPlugin;
using testsupport::InstallPlugin;
using testsupport::TakeOver;
namespace calls = testsupport::calls;

using Words = std::list<std::string>;

const std::string INVALID = "The specified Active Directory provider '";

bool IsLoaded(const std::string& path) {
  return testsupport::ReadFile("/proc/self/maps").find(path + "\n") != std::string::npos;
}

TEST(ProviderLoadingTest, APluginInThePluginFolderIsLoaded) {
  InstallPlugin("version3");
  const ActiveDirectoryProvider provider("version3");
  EXPECT_TRUE(IsLoaded("/usr/libexec/velmor/libversion3.so"));
}

TEST(ProviderLoadingTest, APluginInLib64ComesFirst) {
  testsupport::MakeFolders("/usr/libexec/velmor/lib64");
  testsupport::CopyFile(BuiltPlugin("version2"), "/usr/libexec/velmor/lib64/libx.so");
  testsupport::CopyFile(BuiltPlugin("version3"), "/usr/libexec/velmor/libx.so");
  const ActiveDirectoryProvider provider("x");
  EXPECT_TRUE(IsLoaded("/usr/libexec/velmor/lib64/libx.so"));
  EXPECT_FALSE(IsLoaded("/usr/libexec/velmor/libx.so"));
}

TEST(ProviderLoadingTest, AFaultyPluginInLib64IsPassedOver) {
  testsupport::MakeFolders("/usr/libexec/velmor/lib64");
  testsupport::WriteFile("/usr/libexec/velmor/lib64/libversion3.so", "no shared object");
  InstallPlugin("version3");
  const ActiveDirectoryProvider provider("version3");
  EXPECT_TRUE(IsLoaded("/usr/libexec/velmor/libversion3.so"));
}

TEST(ProviderLoadingTest, BothPlacesAreTriedInOrderWithLazyAndGlobalBinding) {
  std::vector<std::pair<std::string, int>> opened;
  const TakeOver watch(calls::dlopen, [&](const char* path, int flags) {
    opened.emplace_back(path, flags);
    return calls::dlopen.Real(path, flags);
  });
  InstallPlugin("version3");
  const ActiveDirectoryProvider provider("version3");
  EXPECT_EQ(opened, (std::vector<std::pair<std::string, int>>{
                        {"/usr/libexec/velmor/lib64/libversion3.so", RTLD_LAZY | RTLD_GLOBAL},
                        {"/usr/libexec/velmor/libversion3.so", RTLD_LAZY | RTLD_GLOBAL}}));
}

TEST(ProviderLoadingTest, AnUnresolvedFunctionDoesNotMatterBeforeItIsCalled) {
  InstallPlugin("unresolved_function");
  const ActiveDirectoryProvider provider("unresolved_function");
  EXPECT_EQ(provider.GetAPIVersion(), 3);
}

TEST(ProviderLoadingTest, AMissingPluginIsAnErrorWithTheLoadersText) {
  EXPECT_THROW_WHAT(
      ActiveDirectoryProvider("missing"), IOError,
      "Unable to open provider: /usr/libexec/velmor/libmissing.so: cannot open shared object file: "
      "No such file or directory");
}

TEST(ProviderLoadingTest, AFileThatIsNoSharedObjectIsAnErrorWithTheLoadersText) {
  testsupport::WriteFile(InstalledPlugin("text"), std::string(5000, 'x'));
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("text"), IOError,
                    "Unable to open provider: /usr/libexec/velmor/libtext.so: invalid ELF header");
}

TEST(ProviderLoadingTest, AnEmptyFileIsAnError) {
  testsupport::WriteFile(InstalledPlugin("empty"), "");
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("empty"), IOError,
                    "Unable to open provider: /usr/libexec/velmor/libempty.so: file too short");
}

TEST(ProviderLoadingTest, AFolderInThePluginsPlaceIsAnError) {
  testsupport::MakeFolders(InstalledPlugin("folder"));
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("folder"), IOError,
                    "Unable to open provider: /usr/libexec/velmor/libfolder.so: cannot read file data: "
                    "Is a directory");
}

TEST(ProviderLoadingTest, ALoaderWithoutATextIsAnErrorAllTheSame) {
  const TakeOver silence(calls::dlerror, []() -> char* { return nullptr; });
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("missing"), IOError, "Unable to open provider: ");
}

TEST(ProviderLoadingTest, AnEarlierErrorOfTheLoaderIsNotReported) {
  EXPECT_EQ(dlopen("/nonexistent/earlier.so", RTLD_NOW), nullptr);
  InstallPlugin("no_metadata");
  try {
    const ActiveDirectoryProvider provider("no_metadata");
    FAIL();
  } catch (const InvalidActiveDirectoryProviderException& exception) {
    EXPECT_EQ(std::string(exception.what()).find("earlier"), std::string::npos) << exception.what();
  }
}

TEST(ProviderLoadingTest, AMissingMetadataRecordIsNamed) {
  InstallPlugin("no_metadata");
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("no_metadata"), InvalidActiveDirectoryProviderException,
                    INVALID + "no_metadata' is invalid: " + InstalledPlugin("no_metadata") +
                        ": undefined symbol: ActiveDirectoryClientMetadata");
  EXPECT_FALSE(IsLoaded(InstalledPlugin("no_metadata")));
}

TEST(ProviderLoadingTest, AMissingTableOfOperationsIsNamed) {
  InstallPlugin("no_operations");
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("no_operations"), InvalidActiveDirectoryProviderException,
                    INVALID + "no_operations' is invalid: " + InstalledPlugin("no_operations") +
                        ": undefined symbol: ActiveDirectoryClientOperations");
  EXPECT_FALSE(IsLoaded(InstalledPlugin("no_operations")));
}

TEST(ProviderLoadingTest, ASharedObjectThatIsNoPluginLacksTheMetadataFirst) {
  InstallPlugin("no_symbols");
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("no_symbols"), InvalidActiveDirectoryProviderException,
                    INVALID + "no_symbols' is invalid: " + InstalledPlugin("no_symbols") +
                        ": undefined symbol: ActiveDirectoryClientMetadata");
}

TEST(ProviderLoadingTest, AMissingSymbolWithoutTheLoadersTextHasAnEmptyReason) {
  InstallPlugin("no_symbols");
  const TakeOver silence(calls::dlerror, []() -> char* { return nullptr; });
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("no_symbols"), InvalidActiveDirectoryProviderException,
                    INVALID + "no_symbols' is invalid: ");
}

TEST(ProviderLoadingTest, VersionFourIsRefused) {
  InstallPlugin("version4");
  EXPECT_THROW_WHAT(ActiveDirectoryProvider("version4"), InvalidActiveDirectoryProviderException,
                    INVALID +
                        "version4' is invalid: The API version (4) is not supported by this version of "
                        "libvelmor");
  EXPECT_FALSE(IsLoaded(InstalledPlugin("version4")));
}

class AcceptedVersionTest : public ::testing::TestWithParam<int> {};

TEST_P(AcceptedVersionTest, IsLoaded) {
  const std::string name = "version" + std::to_string(GetParam());
  InstallPlugin(name);
  const ActiveDirectoryProvider provider(name);
  EXPECT_EQ(provider.PAMModule(), "pam_test");
}

INSTANTIATE_TEST_SUITE_P(Versions, AcceptedVersionTest, ::testing::Values(3, 2, 1, 0, -7),
                         [](const auto& version) {
                           return version.param < 0 ? "Negative" : std::to_string(version.param);
                         });

TEST(ProviderLoadingTest, ThePluginIsUnloadedWithTheProvider) {
  InstallPlugin("version3");
  { const ActiveDirectoryProvider provider("version3"); }
  EXPECT_FALSE(IsLoaded(InstalledPlugin("version3")));
}

TEST(ProviderLoadingTest, TheMetadataIsCached) {
  InstallPlugin("version3");
  const ActiveDirectoryProvider provider("version3");
  EXPECT_EQ(provider.PAMModule(), "pam_test");
  EXPECT_EQ(provider.PAMModuleParameters(), (Words{"pam_first", "pam_second"}));
  EXPECT_EQ(provider.NSSModule(), "nss_test");
  EXPECT_EQ(provider.NSSModuleParameters(), (Words{"nss_first"}));
}

TEST(ProviderLoadingTest, NullParametersAreAnEmptyList) {
  InstallPlugin("null_parameters");
  const ActiveDirectoryProvider provider("null_parameters");
  EXPECT_TRUE(provider.PAMModuleParameters().empty());
  EXPECT_TRUE(provider.NSSModuleParameters().empty());
}

TEST(ProviderLoadingTest, ParametersAreSplitAtAnyWhiteSpace) {
  InstallPlugin("spaced_parameters");
  const ActiveDirectoryProvider provider("spaced_parameters");
  EXPECT_EQ(provider.PAMModuleParameters(), (Words{"one", "two", "three"}));
  EXPECT_EQ(provider.NSSModuleParameters(), (Words{"four", "five"}));
}

TEST(ProviderLoadingTest, TheVersionIsTheTables) {
  InstallPlugin("old_table");
  EXPECT_EQ(ActiveDirectoryProvider("old_table").GetAPIVersion(), 1);
  InstallPlugin("old_metadata");
  EXPECT_EQ(ActiveDirectoryProvider("old_metadata").GetAPIVersion(), 2);
}

/// Where the last byte stands that the loader maps from the file.
std::size_t LoadedEnd(const std::string& content) {
  Elf64_Ehdr header;
  std::memcpy(&header, content.data(), sizeof header);
  std::size_t end = 0;
  for (std::size_t index = 0; index < header.e_phnum; ++index) {
    Elf64_Phdr segment;
    std::memcpy(&segment, content.data() + header.e_phoff + index * sizeof segment, sizeof segment);
    if (segment.p_type == PT_LOAD) {
      end = std::max<std::size_t>(end, segment.p_offset + segment.p_filesz);
    }
  }
  return end;
}

TEST(CutOffPluginTest, IsAnErrorWhereverItIsCut) {
  const std::string whole = testsupport::ReadFile(BuiltPlugin("version3"));
  const std::size_t end = LoadedEnd(whole);
  ASSERT_GT(end, 4096U);
  std::vector<std::size_t> lengths{1, 3, 4, 15, 16, 63, 64, 65, 100, 512, 1000, 4095, 4096, 4097, end - 1};
  for (std::size_t length = 1500; length < end; length += 1499) {
    lengths.push_back(length);
  }
  for (const std::size_t length : lengths) {
    testsupport::WriteFile(InstalledPlugin("cut"), whole.substr(0, length));
    try {
      const ActiveDirectoryProvider provider("cut");
      ADD_FAILURE() << "loaded with " << length << " of " << whole.size() << " bytes";
    } catch (const IOError& error) {
      EXPECT_EQ(std::string(error.what()).rfind("Unable to open provider: ", 0), 0U) << error.what();
      EXPECT_NE(error.what(), std::string("Unable to open provider: ")) << length;
    }
  }
}

TEST(CutOffPluginTest, OneThatLacksOnlyWhatIsNotLoadedIsLoaded) {
  const std::string whole = testsupport::ReadFile(BuiltPlugin("version3"));
  testsupport::WriteFile(InstalledPlugin("stripped"), whole.substr(0, LoadedEnd(whole)));
  const ActiveDirectoryProvider provider("stripped");
  EXPECT_EQ(provider.PAMModule(), "pam_test");
}

TEST(CutOffPluginTest, OneInLib64IsPassedOver) {
  const std::string whole = testsupport::ReadFile(BuiltPlugin("version3"));
  testsupport::MakeFolders("/usr/libexec/velmor/lib64");
  testsupport::WriteFile("/usr/libexec/velmor/lib64/libversion3.so", whole.substr(0, 8192));
  InstallPlugin("version3");
  const ActiveDirectoryProvider provider("version3");
  EXPECT_TRUE(IsLoaded("/usr/libexec/velmor/libversion3.so"));
}

TEST(CutOffPluginTest, ProgramHeadersBeyondTheFileAreAnError) {
  std::string content = testsupport::ReadFile(BuiltPlugin("version3"));
  Elf64_Ehdr header;
  std::memcpy(&header, content.data(), sizeof header);
  header.e_phoff = 0xffffffffffffff00U;
  std::memcpy(content.data(), &header, sizeof header);
  testsupport::WriteFile(InstalledPlugin("wild"), content);
  EXPECT_THROW(ActiveDirectoryProvider("wild"), IOError);
}

TEST(CutOffPluginTest, ASegmentWhoseEndOverflowsIsAnError) {
  std::string content = testsupport::ReadFile(BuiltPlugin("version3"));
  Elf64_Ehdr header;
  std::memcpy(&header, content.data(), sizeof header);
  for (std::size_t index = 0; index < header.e_phnum; ++index) {
    const std::size_t place = header.e_phoff + index * sizeof(Elf64_Phdr);
    Elf64_Phdr segment;
    std::memcpy(&segment, content.data() + place, sizeof segment);
    if (segment.p_type == PT_LOAD) {
      segment.p_filesz = 0xfffffffffffff000U;
      segment.p_memsz = segment.p_filesz;
    }
    std::memcpy(content.data() + place, &segment, sizeof segment);
  }
  testsupport::WriteFile(InstalledPlugin("wild"), content);
  EXPECT_THROW(ActiveDirectoryProvider("wild"), IOError);
}

}  // namespace
}  // namespace quenix::authentication
