// The tree of advanced options and the file behind it.
#include "hostmgmt/advanced_options.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "hostmgmt/host.h"
#include "hostmgmt/host_management_exception.h"
#include "support/expect_throw_what.h"
#include "support/files.h"

namespace {

using HostMgmt::HostFactory;
using HostMgmt::Adv::AdvancedIntegerOption;
using HostMgmt::Adv::AdvancedOption;
using HostMgmt::Adv::AdvancedStringOption;
using HostMgmt::Lib::HostMgmtException;

const std::string kFile = "/etc/quenix/options.conf";
const std::string kVerify = "UserVars.ActiveDirectoryVerifyCAMCertificate";

std::shared_ptr<const AdvancedOption> Find(const std::string& branchName, const std::string& name) {
  const auto root = HostFactory::GetHost()->GetAdvancedOptions();
  const auto branch = root ? root->GetChild(branchName) : nullptr;
  return branch ? branch->GetOption(name) : nullptr;
}

/// The value of an integer option; -1 for anything else.
std::int64_t IntegerOf(const std::string& branch, const std::string& name) {
  const auto option = std::dynamic_pointer_cast<const AdvancedIntegerOption>(Find(branch, name));
  return option ? option->GetValue() : -1;
}

std::string TextOf(const std::string& branch, const std::string& name) {
  const auto option = std::dynamic_pointer_cast<const AdvancedStringOption>(Find(branch, name));
  return option ? option->GetValue() : "no text";
}

void ExpectBadLine(const std::string& content, const std::string& where) {
  testsupport::WriteFile(kFile, content);
  EXPECT_THROW_WHAT(HostFactory::GetHost()->GetAdvancedOptions(), HostMgmtException,
                    "Unable to read '" + kFile + "': " + where);
}

TEST(AdvancedOptionsTest, AFreshHostVerifiesTheCertificate) {
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), 1);
  EXPECT_FALSE(testsupport::Exists(kFile));
}

TEST(AdvancedOptionsTest, AFreshHostHasNoConfiguredManagementInterface) {
  EXPECT_EQ(TextOf("Net", "ManagementInterface"), "");
}

TEST(AdvancedOptionsTest, AnUnreadableConfigurationStoreHidesNoOption) {
  testsupport::WriteFile("/var/lib/quenix/configstore.db", "damaged");
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), 1);
}

TEST(AdvancedOptionsTest, TheFileOverrulesADefault) {
  testsupport::WriteFile(kFile, kVerify + " = 0\n");
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), 0);
}

TEST(AdvancedOptionsTest, AnotherLineOfTheFileLeavesTheDefault) {
  testsupport::WriteFile(kFile, "UserVars.Other = 5\n");
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), 1);
  EXPECT_EQ(IntegerOf("UserVars", "Other"), 5);
}

TEST(AdvancedOptionsTest, AnOptionCanBeTakenAwayFromTheHost) {
  testsupport::WriteFile(kFile, kVerify + " = none\nUserVars.Other = 5\n");
  EXPECT_FALSE(Find("UserVars", "ActiveDirectoryVerifyCAMCertificate"));
  EXPECT_TRUE(Find("UserVars", "Other"));
}

TEST(AdvancedOptionsTest, ABranchWithoutOptionsIsNotThere) {
  testsupport::WriteFile(kFile, kVerify + " = none\n");
  const auto root = HostFactory::GetHost()->GetAdvancedOptions();
  ASSERT_TRUE(root);
  EXPECT_FALSE(root->GetChild("UserVars"));
}

TEST(AdvancedOptionsTest, AHostWithoutOptionsHasNoTree) {
  testsupport::WriteFile(kFile, kVerify + " = none\nNet.ManagementInterface = none\n");
  EXPECT_FALSE(HostFactory::GetHost()->GetAdvancedOptions());
}

TEST(AdvancedOptionsTest, TextInTheFileMakesATextOption) {
  testsupport::WriteFile(kFile, kVerify + " = \"1\"\n");
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), -1);
  EXPECT_EQ(TextOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), "1");
}

TEST(AdvancedOptionsTest, BranchesNestToAnyDepth) {
  testsupport::WriteFile(kFile, "A.B.C.D = 4\n");
  const auto branch =
      HostFactory::GetHost()->GetAdvancedOptions()->GetChild("A")->GetChild("B")->GetChild("C");
  ASSERT_TRUE(branch);
  EXPECT_EQ(branch->GetOptionNames(), std::vector<std::string>{"D"});
  EXPECT_EQ(branch->GetOption("D")->GetName(), "D");
  EXPECT_EQ(branch->GetOption("D")->GetText(), "4");
  EXPECT_FALSE(branch->GetChild("D"));
}

TEST(AdvancedOptionsTest, ListsItsBranches) {
  testsupport::WriteFile(kFile, "Branch.Option = 1\n");
  EXPECT_EQ(HostFactory::GetHost()->GetAdvancedOptions()->GetChildNames(),
            (std::vector<std::string>{"Branch", "Net", "UserVars"}));
}

TEST(AdvancedOptionsTest, NamesAreExact) {
  EXPECT_FALSE(Find("uservars", "ActiveDirectoryVerifyCAMCertificate"));
  EXPECT_FALSE(Find("UserVars", "activedirectoryverifycamcertificate"));
}

TEST(AdvancedOptionsTest, CommentsBlanksAndLineEndsDoNotMatter) {
  testsupport::WriteFile(
      kFile,
      "# comment\r\n\r\n  A.One=1# comment\r\n\tA.Two\t=\t-2  \r\nA.Three = \"#3\" # x\n \nA.Four = 4");
  EXPECT_EQ(IntegerOf("A", "One"), 1);
  EXPECT_EQ(IntegerOf("A", "Two"), -2);
  EXPECT_EQ(TextOf("A", "Three"), "#3");
  EXPECT_EQ(IntegerOf("A", "Four"), 4);
}

TEST(AdvancedOptionsTest, ABadLineIsNamedWithItsReason) {
  ExpectBadLine("# fine\nA.B = 1\nrubbish\n", "line 3: there is no '='");
  ExpectBadLine("A.B = maybe\n", "line 1: the value is neither an integer nor text in double quotes");
  ExpectBadLine("A.B =\n", "line 1: the value is neither an integer nor text in double quotes");
  ExpectBadLine("A.B = 1x\n", "line 1: the value is neither an integer nor text in double quotes");
  ExpectBadLine("A.B = 9223372036854775808\n", "line 1: the number is too large");
  ExpectBadLine("A.B = 1 2\n", "line 1: something follows the value");
  ExpectBadLine("A.B = \"text\n", "line 1: the closing quote is missing");
  ExpectBadLine("A.B = \"te\\xt\"\n", "line 1: a backslash must stand before a quote or a backslash");
  ExpectBadLine("A.B = \"te\\", "line 1: a backslash must stand before a quote or a backslash");
  ExpectBadLine("A.B = \"te\x01xt\"\n", "line 1: the text holds a control character");
  ExpectBadLine("AB = 1\n", "line 1: 'AB' is not the path of an option");
  ExpectBadLine(".A = 1\n", "line 1: '.A' is not the path of an option");
  ExpectBadLine("A..B = 1\n", "line 1: 'A..B' is not the path of an option");
  ExpectBadLine("A.B C = 1\n", "line 1: 'A.B C' is not the path of an option");
  ExpectBadLine(" = 1\n", "line 1: '' is not the path of an option");
  ExpectBadLine("A.B = 1\nA.B = 1\n", "line 2: 'A.B' is set a second time");
}

TEST(AdvancedOptionsTest, AVeryLongLineIsReadWhole) {
  const std::string text(1 << 20, 'x');
  testsupport::WriteFile(kFile, "A.B = \"" + text + "\"\n");
  EXPECT_TRUE(TextOf("A", "B") == text);
}

TEST(AdvancedOptionsTest, AFileThatCannotBeReadIsReported) {
  ASSERT_EQ(mkdir(kFile.c_str(), 0755), 0);
  EXPECT_THROW_WHAT(HostFactory::GetHost()->GetAdvancedOptions(), HostMgmtException,
                    "Unable to read '" + kFile + "': it is not a regular file");
}

TEST(SetAdvancedOptionTest, TheFirstSettingMakesTheFile) {
  HostFactory::GetHost()->SetIntegerOption(kVerify, 0);
  EXPECT_EQ(testsupport::ReadFile(kFile),
            "# Advanced options of this host, one 'path = value' to a line.\n" + kVerify + " = 0\n");
  EXPECT_EQ(testsupport::ModeOf(kFile), 0644U);
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), 0);
}

TEST(SetAdvancedOptionTest, ChangesItsLineOnly) {
  testsupport::WriteFile(kFile, "# top\r\nA.B = 1 # why\r\n\r\nA.C = \"x\"");
  HostFactory::GetHost()->SetIntegerOption("A.B", 2);
  HostFactory::GetHost()->SetStringOption("A.D", "y");
  EXPECT_EQ(testsupport::ReadFile(kFile), "# top\r\nA.B = 2 # why\r\n\r\nA.C = \"x\"\r\nA.D = \"y\"\r\n");
}

TEST(SetAdvancedOptionTest, AnIntegerOptionCanBecomeText) {
  HostFactory::GetHost()->SetStringOption(kVerify, "yes");
  EXPECT_EQ(TextOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), "yes");
}

TEST(SetAdvancedOptionTest, TextIsReadBackAsItWasSet) {
  for (const std::string text :
       {"", " ", "\\", "\"", "a \"b\" \\c", "# no comment", "\t", "\xc3\xa4", "none"}) {
    HostFactory::GetHost()->SetStringOption("A.B", text);
    EXPECT_EQ(TextOf("A", "B"), text);
  }
}

TEST(SetAdvancedOptionTest, EveryNumberIsReadBackAsItWasSet) {
  for (const std::int64_t number : {std::int64_t{0}, std::numeric_limits<std::int64_t>::min(),
                                    std::numeric_limits<std::int64_t>::max()}) {
    HostFactory::GetHost()->SetIntegerOption("A.B", number);
    EXPECT_EQ(IntegerOf("A", "B"), number);
  }
}

TEST(SetAdvancedOptionTest, RefusesWhatCannotStandInTheFile) {
  const auto host = HostFactory::GetHost();
  EXPECT_THROW_WHAT(host->SetIntegerOption("A", 1), HostMgmtException,
                    "Unable to change '" + kFile + "': 'A' is not the path of an option");
  EXPECT_THROW_WHAT(host->SetIntegerOption("A.B = 1\nC.D", 1), HostMgmtException,
                    "Unable to change '" + kFile + "': 'A.B = 1\nC.D' is not the path of an option");
  EXPECT_THROW_WHAT(host->SetStringOption("A.B", "x\ny"), HostMgmtException,
                    "Unable to change '" + kFile + "': the text holds a control character");
  EXPECT_FALSE(testsupport::Exists(kFile));
}

TEST(SetAdvancedOptionTest, ABadFileIsNotWrittenOver) {
  testsupport::WriteFile(kFile, "rubbish\n");
  EXPECT_THROW_WHAT(HostFactory::GetHost()->SetIntegerOption("A.B", 1), HostMgmtException,
                    "Unable to read '" + kFile + "': line 1: there is no '='");
  EXPECT_EQ(testsupport::ReadFile(kFile), "rubbish\n");
}

TEST(SetAdvancedOptionTest, ResettingBringsTheDefaultBack) {
  const auto host = HostFactory::GetHost();
  host->SetIntegerOption(kVerify, 0);
  host->SetIntegerOption("A.B", 1);
  host->ResetOption(kVerify);
  host->ResetOption("A.B");
  host->ResetOption("A.Unknown");
  EXPECT_EQ(IntegerOf("UserVars", "ActiveDirectoryVerifyCAMCertificate"), 1);
  EXPECT_FALSE(Find("A", "B"));
}

TEST(SetAdvancedOptionTest, NoSettingOfSeveralProcessesIsLost) {
  std::vector<pid_t> children;
  for (int process = 0; process < 4; ++process) {
    const pid_t child = fork();
    if (child == 0) {
      for (int number = 0; number < 10; ++number) {
        HostFactory::GetHost()->SetIntegerOption(
            "P" + std::to_string(process) + ".N" + std::to_string(number), number);
      }
      _exit(0);
    }
    children.push_back(child);
  }
  for (const pid_t child : children) {
    int status = -1;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
  }
  for (int process = 0; process < 4; ++process) {
    for (int number = 0; number < 10; ++number) {
      EXPECT_EQ(IntegerOf("P" + std::to_string(process), "N" + std::to_string(number)), number);
    }
  }
}

}  // namespace
