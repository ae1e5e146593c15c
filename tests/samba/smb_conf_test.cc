// Whose smb.conf it is, and what the provider writes.

#include "common/smb_conf.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "expect_failure.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

const std::string DISTRIBUTION = "# sample\n[global]\n   workgroup = WORKGROUP\n   panic action = x\n";

State Joined() {
  State state;
  state.joined = true;
  state.dnsDomain = "corp.example";
  state.netbiosDomain = "CORP";
  state.hostName = "HOST1";
  return state;
}

bool HasLine(const std::string& text, const std::string& line) {
  return ("\n" + text).find("\n  " + line + "\n") != std::string::npos;
}

TEST(SmbConfTest, AMissingFileIsNobodys) {
  EXPECT_EQ(OwnerOfSmbConf(std::nullopt, std::nullopt, DISTRIBUTION), SmbConfOwner::kNobody);
}

TEST(SmbConfTest, TheFileThatWeWroteIsOurs) {
  EXPECT_EQ(OwnerOfSmbConf("ours", "ours", DISTRIBUTION), SmbConfOwner::kProvider);
}

TEST(SmbConfTest, OurFileWithAChangeIsTheAdministrators) {
  EXPECT_EQ(OwnerOfSmbConf("ours\n# and theirs", "ours", DISTRIBUTION), SmbConfOwner::kAdministrator);
}

TEST(SmbConfTest, TheUntouchedDefaultIsTheDistributions) {
  EXPECT_EQ(OwnerOfSmbConf(DISTRIBUTION, std::nullopt, DISTRIBUTION), SmbConfOwner::kDistribution);
}

TEST(SmbConfTest, TheDefaultMayNameAnotherWorkgroup) {
  const std::string renamed = "# sample\n[global]\n   workgroup = HOME\n   panic action = x\n";
  EXPECT_EQ(OwnerOfSmbConf(renamed, std::nullopt, DISTRIBUTION), SmbConfOwner::kDistribution);
}

TEST(SmbConfTest, TheDefaultWithOneMoreLineIsTheAdministrators) {
  EXPECT_EQ(OwnerOfSmbConf(DISTRIBUTION + "[share]\n", std::nullopt, DISTRIBUTION),
            SmbConfOwner::kAdministrator);
}

TEST(SmbConfTest, AnyFileIsTheAdministratorsWithoutADefaultToCompareWith) {
  EXPECT_EQ(OwnerOfSmbConf(DISTRIBUTION, std::nullopt, std::nullopt), SmbConfOwner::kAdministrator);
}

TEST(SmbConfTest, AnEmptyFileIsTheAdministrators) {
  EXPECT_EQ(OwnerOfSmbConf("", std::nullopt, DISTRIBUTION), SmbConfOwner::kAdministrator);
}

TEST(SmbConfTest, AnAdministratorsFileIsNotReplaceable) {
  testsupport::MakeFolders("/etc/samba");
  const testsupport::SmallFileSystem folder("/etc/samba", 65536);
  testsupport::WriteFile("/etc/samba/smb.conf", "[global]\n  workgroup = MINE\n");
  EXPECT_FAILURE(RequireSmbConfIsReplaceable(), 1064);
}

TEST(SmbConfTest, ALinkToTheUntouchedDefaultIsNotReplaceable) {
  testsupport::MakeFolders("/etc/samba");
  const testsupport::SmallFileSystem folder("/etc/samba", 65536);
  std::filesystem::create_symlink("/usr/share/samba/smb.conf", "/etc/samba/smb.conf");
  EXPECT_FAILURE(RequireSmbConfIsReplaceable(), 1064);
}

TEST(SmbConfTest, WhatIsWrittenIsKnownAsOursLater) {
  testsupport::MakeFolders("/etc/samba");
  testsupport::MakeFolders("/var/lib/quenix/samba");
  const testsupport::SmallFileSystem folder("/etc/samba", 65536);
  WriteSmbConf(FormatSmbConf(Joined(), Settings{}, KeytabUse::kKept));
  EXPECT_NO_THROW(RequireSmbConfIsReplaceable());
}

TEST(SmbConfTest, AMemberNamesItsDomain) {
  const std::string text = FormatSmbConf(Joined(), Settings{}, KeytabUse::kKept);
  EXPECT_TRUE(HasLine(text, "workgroup = CORP"));
  EXPECT_TRUE(HasLine(text, "realm = CORP.EXAMPLE"));
  EXPECT_TRUE(HasLine(text, "security = ADS"));
  EXPECT_TRUE(HasLine(text, "netbios name = HOST1"));
}

TEST(SmbConfTest, NoKeytabIsKeptWhileTheJoinIsMade) {
  EXPECT_EQ(FormatSmbConf(Joined(), Settings{}, KeytabUse::kDuringJoin).find("kerberos method"),
            std::string::npos);
  EXPECT_TRUE(
      HasLine(FormatSmbConf(Joined(), Settings{}, KeytabUse::kKept), "kerberos method = secrets and keytab"));
}

TEST(SmbConfTest, PreferredControllersStandBeforeAllOthers) {
  State state = Joined();
  state.preferredDomainControllers = {"dc3.corp.example", "10.0.0.1"};
  EXPECT_TRUE(HasLine(FormatSmbConf(state, Settings{}, KeytabUse::kKept),
                      "password server = dc3.corp.example 10.0.0.1 *"));
}

TEST(SmbConfTest, WithoutPreferredControllersThereIsNoSuchLine) {
  EXPECT_EQ(FormatSmbConf(Joined(), Settings{}, KeytabUse::kKept).find("password server"), std::string::npos);
}

TEST(SmbConfTest, TheRequestTimeOutComesFromTheSettings) {
  Settings settings;
  settings.winbindRequestTimeout = std::chrono::seconds(90);
  EXPECT_TRUE(HasLine(FormatSmbConf(Joined(), settings, KeytabUse::kKept), "winbind request timeout = 90"));
}

}  // namespace
}  // namespace sambaprovider
