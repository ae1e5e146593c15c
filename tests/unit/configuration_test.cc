#include "authentication/configuration.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <functional>
#include <map>
#include <string>
#include <thread>
#include <type_traits>
#include <vector>

#include "authentication/library_exceptions.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"
#include "support/machine.h"

namespace quenix::authentication {
namespace {

using testsupport::ModeOf;
using testsupport::NamesIn;
using testsupport::ReadFile;
using testsupport::TakeOver;
using testsupport::WriteFile;
namespace calls = testsupport::calls;

using Map = std::map<std::string, std::string>;

class ConfigurationTest : public ::testing::Test {
 protected:
  /// A configuration read from a file of this content.
  Configuration Read(const std::string& content) {
    WriteFile(path_, content);
    return Configuration(path_);
  }

  const testsupport::ScratchFolder folder_;
  const std::string path_ = folder_.Path() + "test.conf";
};

static_assert(std::is_same_v<Map::key_compare, std::less<std::string>>);
static_assert(std::is_convertible_v<Configuration*, Map*>);

TEST_F(ConfigurationTest, AnEmptyFileIsAnEmptyMap) {
  EXPECT_TRUE(Read("").empty());
}

TEST_F(ConfigurationTest, EveryLineIsAnEntry) {
  EXPECT_EQ(Map(Read("b = \"2\"\na = '1'\nc=3\n")), (Map{{"a", "1"}, {"b", "2"}, {"c", "3"}}));
}

TEST_F(ConfigurationTest, ALastLineWithoutNewlineIsRead) {
  EXPECT_EQ(Map(Read("a = \"1\"\nb = \"2\"")), (Map{{"a", "1"}, {"b", "2"}}));
}

TEST_F(ConfigurationTest, BlankLinesAreSkipped) {
  EXPECT_EQ(Map(Read("\n \t \n\t\na = \"1\"\n\n")), (Map{{"a", "1"}}));
}

TEST_F(ConfigurationTest, FirstOfTwoEqualKeysWins) {
  const Configuration configuration = Read(
      "remote-authentication-store = \"None\"\n"
      "remote-authentication-store = \"Active Directory\"\n");
  EXPECT_EQ(configuration["remote-authentication-store"], "None");
}

TEST_F(ConfigurationTest, KeysThatDifferInCaseAreTwo) {
  EXPECT_EQ(Map(Read("a = 1\nA = 2\n")), (Map{{"A", "2"}, {"a", "1"}}));
}

TEST_F(ConfigurationTest, ACommentLineIsAnErrorAndBlankLinesBeforeItCount) {
  EXPECT_THROW_WHAT(Read("\n  \na = \"1\"\n# comment\n"), ConfigurationError,
                    "Error parsing configuration on line 4: no delimiter found");
}

TEST_F(ConfigurationTest, ABlankLineWithACarriageReturnIsAnError) {
  EXPECT_THROW_WHAT(Read("\r\n"), ConfigurationError,
                    "Error parsing configuration on line 1: no delimiter found");
}

TEST_F(ConfigurationTest, ALoneQuoteIsAnErrorThatNamesItsLine) {
  EXPECT_THROW_WHAT(Read("a = \"1\"\nb = \"\n"), ConfigurationError,
                    "Error parsing configuration at line 2: invalid quoting");
}

TEST_F(ConfigurationTest, OfTwoMalformedPartsTheLineIsNamedOnce) {
  EXPECT_THROW_WHAT(Read("' = \"\n"), ConfigurationError,
                    "Error parsing configuration at line 1: invalid quoting");
}

TEST_F(ConfigurationTest, AFaultyDuplicateIsStillAnError) {
  EXPECT_THROW_WHAT(Read("a = 1\na = '\n"), ConfigurationError,
                    "Error parsing configuration at line 2: invalid quoting");
}

TEST_F(ConfigurationTest, ALineEndOfDosKeepsTheQuotes) {
  EXPECT_EQ(Read("a = \"1\"\r\n")["a"], "\"1\"\r");
}

TEST_F(ConfigurationTest, AMissingFileCannotBeOpened) {
  EXPECT_THROW_WHAT(Configuration(folder_.Path() + "none.conf"), IOError,
                    "Unable to open '" + folder_.Path() + "none.conf': No such file or directory");
}

TEST_F(ConfigurationTest, AFileWithoutPermissionCannotBeOpened) {
  WriteFile(path_, "a = 1\n");
  testsupport::SetMode(path_, 0);
  const testsupport::WithoutFilePowers powers;
  EXPECT_THROW_WHAT(Configuration(path_), IOError, "Unable to open '" + path_ + "': Permission denied");
}

TEST_F(ConfigurationTest, ALinkInACircleCannotBeOpened) {
  ASSERT_EQ(symlink(path_.c_str(), path_.c_str()), 0);
  EXPECT_THROW_WHAT(Configuration(path_), IOError,
                    "Unable to open '" + path_ + "': Too many levels of symbolic links");
}

TEST_F(ConfigurationTest, AFolderIsNoEmptyConfiguration) {
  EXPECT_THROW_WHAT(Configuration(folder_.Path()), IOError,
                    "Unable to read '" + folder_.Path() + "': Is a directory");
}

TEST_F(ConfigurationTest, AMissingKeyIsAnErrorForReaders) {
  const Configuration configuration = Read("a = \"1\"\n");
  EXPECT_EQ(configuration["a"], "1");
  EXPECT_THROW_WHAT(configuration["b"], InvalidKeyException,
                    "The specified key 'b' was not found in this configuration");
}

TEST_F(ConfigurationTest, AMissingKeyIsNeverCreated) {
  Configuration configuration = Read("a = \"1\"\n");
  EXPECT_THROW_WHAT(configuration["b"] = "2", InvalidKeyException,
                    "The specified key 'b' was not found in this configuration");
  EXPECT_EQ(Map(configuration), (Map{{"a", "1"}}));
}

TEST_F(ConfigurationTest, AnExistingValueIsReplacedInPlace) {
  Configuration configuration = Read("a = \"1\"\n");
  configuration["a"] = "changed";
  EXPECT_EQ(configuration.find("a")->second, "changed");
}

TEST_F(ConfigurationTest, TheMapsOwnInsertionAddsAKey) {
  Configuration configuration = Read("");
  configuration.insert({"b", "2"});
  EXPECT_EQ(configuration["b"], "2");
  configuration.erase("b");
  EXPECT_TRUE(configuration.empty());
}

TEST_F(ConfigurationTest, ASnapshotDoesNotNoticeLaterChanges) {
  const Configuration configuration = Read("a = \"1\"\n");
  WriteFile(path_, "a = \"2\"\n");
  EXPECT_EQ(configuration["a"], "1");
}

TEST_F(ConfigurationTest, WritesOneLineForEachKeyInAscendingOrder) {
  Configuration configuration = Read("");
  configuration.insert({"b", "2"});
  configuration.insert({"a", "1"});
  configuration.Write();
  EXPECT_EQ(ReadFile(path_), "a = \"1\"\nb = \"2\"\n");
}

TEST_F(ConfigurationTest, WritesValuesWithoutEscapes) {
  Configuration configuration = Read("");
  configuration.insert({"k", "a \"quoted\" \\ value"});
  configuration.Write();
  EXPECT_EQ(ReadFile(path_), "k = \"a \"quoted\" \\ value\"\n");
}

TEST_F(ConfigurationTest, AFileReadAndWrittenBackLosesBlankLinesDuplicatesOrderAndQuotesOfKeys) {
  Read("\n'b' = 2\n\na = 1\nb = 3\n").Write();
  EXPECT_EQ(ReadFile(path_), "a = \"1\"\nb = \"2\"\n");
}

TEST_F(ConfigurationTest, WhatIsWrittenIsReadBack) {
  Configuration configuration = Read("");
  const Map values{{"empty", ""},     {"blanks", "  "},  {"quoted", "\"x\""}, {"single", "'"},
                   {"equals", "a=b"}, {"key two", "\t"}, {"double", "\""}};
  configuration.insert(values.begin(), values.end());
  configuration.Write();
  EXPECT_EQ(Map(Configuration(path_)), values);
}

TEST_F(ConfigurationTest, AnEmptyKeyComesBackAsABlank) {
  Configuration configuration = Read("");
  configuration.insert({"", "value"});
  configuration.Write();
  EXPECT_EQ(ReadFile(path_), " = \"value\"\n");
  EXPECT_EQ(Map(Configuration(path_)), (Map{{" ", "value"}}));
}

TEST_F(ConfigurationTest, AnEmptyMapIsAnEmptyFile) {
  Configuration configuration = Read("a = 1\n");
  configuration.clear();
  configuration.Write();
  EXPECT_EQ(ReadFile(path_), "");
}

TEST_F(ConfigurationTest, WritingOverAFileKeepsItsMode) {
  for (const unsigned int mode : {0644U, 0600U, 0664U, 0400U}) {
    const Configuration configuration = Read("a = \"1\"\n");
    testsupport::SetMode(path_, mode);
    configuration.Write();
    EXPECT_EQ(ModeOf(path_), mode);
  }
}

TEST_F(ConfigurationTest, WritingANewFileLeavesItToItsOwner) {
  const Configuration configuration = Read("a = \"1\"\n");
  testsupport::RemoveFile(path_);
  configuration.Write();
  EXPECT_EQ(ModeOf(path_), 0600U);
  EXPECT_EQ(ReadFile(path_), "a = \"1\"\n");
}

TEST_F(ConfigurationTest, WritingReplacesTheFileAndLeavesNothingBeside) {
  const Configuration configuration = Read("a = \"1\"\n");
  const int before = open(path_.c_str(), O_RDONLY | O_CLOEXEC);
  WriteFile(folder_.Path() + "other", "");
  configuration.Write();
  struct stat old {};
  ASSERT_EQ(fstat(before, &old), 0);
  EXPECT_EQ(old.st_nlink, 0U);  // The old file is whole, for those who have it open.
  close(before);
  EXPECT_EQ(NamesIn(folder_.Path()), (std::vector<std::string>{"other", "test.conf"}));
}

TEST_F(ConfigurationTest, WritingInAMissingFolderCannotCreateTheTemporaryFile) {
  const testsupport::ScratchFolder outer;
  const std::string path = outer.Path() + "inner/test.conf";
  testsupport::MakeFolders(outer.Path() + "inner");
  WriteFile(path, "a = 1\n");
  const Configuration configuration(path);
  testsupport::RemoveFile(path);
  ASSERT_EQ(rmdir((outer.Path() + "inner").c_str()), 0);
  EXPECT_THROW_WHAT(configuration.Write(), IOError,
                    "Unable to create temporary file to write '" + path + "': No such file or directory");
}

TEST_F(ConfigurationTest, AFailedWriteLeavesTheOldFileAndTheLeftover) {
  const testsupport::ScratchFolder small;
  const testsupport::SmallFileSystem fileSystem(small.Path(), 16 * 4096);
  const std::string path = small.Path() + "test.conf";
  WriteFile(path, "a = \"1\"\n");
  Configuration configuration(path);
  configuration["a"] = std::string(32 * 4096, 'x');
  EXPECT_THROW_WHAT(configuration.Write(), IOError,
                    "Unable to write '" + path + "': No space left on device");
  EXPECT_EQ(ReadFile(path), "a = \"1\"\n");
  const auto names = NamesIn(small.Path());
  ASSERT_EQ(names.size(), 2U);
  EXPECT_EQ(names[0], "test.conf");
  EXPECT_EQ(names[1].substr(0, 10), "test.conf.");
  EXPECT_EQ(names[1].size(), 16U);
}

TEST_F(ConfigurationTest, AWriteThatFailsAtItsLastByteIsNoticed) {
  const testsupport::ScratchFolder small;
  const testsupport::SmallFileSystem fileSystem(small.Path(), 4 * 4096);
  const std::string path = small.Path() + "test.conf";
  WriteFile(path, "a = \"1\"\n");
  Configuration configuration(path);
  // One page is the old file's; the new one needs exactly one byte more than the other three.
  configuration["a"] = std::string(3 * 4096 + 1 - std::string("a = \"\"\n").size(), 'x');
  EXPECT_THROW_WHAT(configuration.Write(), IOError,
                    "Unable to write '" + path + "': No space left on device");
  EXPECT_EQ(ReadFile(path), "a = \"1\"\n");
  for (const std::string& name : NamesIn(small.Path())) {
    if (name != "test.conf") {
      testsupport::RemoveFile(small.Path() + name);
    }
  }
  configuration["a"].pop_back();
  configuration.Write();
  EXPECT_EQ(ReadFile(path).size(), 3U * 4096U);
}

TEST_F(ConfigurationTest, AFailedRenameLeavesTheOldFileAndTheLeftover) {
  const Configuration configuration = Read("a = \"1\"\n");
  WriteFile(path_, "old");
  std::string temporary;
  const TakeOver refuse(calls::rename, [&](const char* from, const char* to) {
    EXPECT_EQ(to, path_);
    temporary = from;
    errno = EXDEV;
    return -1;
  });
  try {
    configuration.Write();
    FAIL();
  } catch (const IOError& error) {
    EXPECT_EQ(error.what(),
              "Unable to rename '" + temporary + "' to '" + path_ + "': Invalid cross-device link");
  }
  EXPECT_EQ(ReadFile(path_), "old");
  EXPECT_EQ(ReadFile(temporary), "a = \"1\"\n");
}

TEST_F(ConfigurationTest, AModeThatCannotBeSetIsReportedWithTheNewContentInPlace) {
  const Configuration configuration = Read("a = \"1\"\n");
  WriteFile(path_, "old");
  const TakeOver refuse(calls::chmod, [](const char*, mode_t) {
    errno = EPERM;
    return -1;
  });
  EXPECT_THROW_WHAT(
      configuration.Write(), FilePermissionError,
      "Failed to save file permissions, file permissions may be incorrect: Operation not permitted");
  EXPECT_EQ(ReadFile(path_), "a = \"1\"\n");
}

TEST_F(ConfigurationTest, ConcurrentWritersLeaveAWholeFile) {
  Read("a = \"0\"\n");
  std::vector<std::thread> writers;
  for (const char letter : {'x', 'y', 'z'}) {
    writers.emplace_back([this, letter] {
      Configuration configuration(path_);
      configuration["a"] = std::string(5000, letter);
      for (int round = 0; round < 20; ++round) {
        configuration.Write();
      }
    });
  }
  for (int round = 0; round < 50; ++round) {
    const std::string value = Configuration(path_)["a"];
    ASSERT_EQ(value, std::string(value.size(), value[0]));
    ASSERT_TRUE(value.size() == 1 || value.size() == 5000);
  }
  for (std::thread& writer : writers) {
    writer.join();
  }
}

TEST(FixedConfigurationTest, EachClassReadsItsOwnFile) {
  WriteFile("/etc/quenix/velmor/authentication.conf", "remote-authentication-store = \"A\"\n");
  WriteFile("/etc/quenix/velmor/provider.conf", "provider = \"B\"\n");
  WriteFile("/etc/quenix/velmor/camprovider.conf", "provider = \"C\"\n");
  EXPECT_EQ(AuthenticationConfiguration()["remote-authentication-store"], "A");
  EXPECT_EQ(ProviderConfiguration()["provider"], "B");
  EXPECT_EQ(CAMProviderConfiguration()["provider"], "C");
}

TEST(FixedConfigurationTest, EachClassWritesItsOwnFile) {
  for (const std::string name : {"authentication", "provider", "camprovider"}) {
    WriteFile("/etc/quenix/velmor/" + name + ".conf", "key = \"old\"\n");
  }
  AuthenticationConfiguration authentication;
  ProviderConfiguration provider;
  CAMProviderConfiguration camProvider;
  authentication["key"] = "1";
  provider["key"] = "2";
  camProvider["key"] = "3";
  for (const Configuration* configuration :
       {static_cast<const Configuration*>(&authentication), static_cast<const Configuration*>(&provider),
        static_cast<const Configuration*>(&camProvider)}) {
    configuration->Write();
  }
  EXPECT_EQ(ReadFile("/etc/quenix/velmor/authentication.conf"), "key = \"1\"\n");
  EXPECT_EQ(ReadFile("/etc/quenix/velmor/provider.conf"), "key = \"2\"\n");
  EXPECT_EQ(ReadFile("/etc/quenix/velmor/camprovider.conf"), "key = \"3\"\n");
}

TEST(FixedConfigurationTest, AMissingFileIsAnErrorForEachClass) {
  EXPECT_THROW_WHAT(AuthenticationConfiguration(), IOError,
                    "Unable to open '/etc/quenix/velmor/authentication.conf': No such file or directory");
  EXPECT_THROW_WHAT(ProviderConfiguration(), IOError,
                    "Unable to open '/etc/quenix/velmor/provider.conf': No such file or directory");
  EXPECT_THROW_WHAT(CAMProviderConfiguration(), IOError,
                    "Unable to open '/etc/quenix/velmor/camprovider.conf': No such file or directory");
}

TEST(FixedConfigurationTest, TheirErrorsHaveCodeZero) {
  try {
    const ProviderConfiguration configuration;
    FAIL();
  } catch (const IOError& error) {
    EXPECT_EQ(error.Code(), 0UL);
  }
}

}  // namespace
}  // namespace quenix::authentication
