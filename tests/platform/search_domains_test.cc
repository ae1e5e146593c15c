// How a search domain is added to a /etc/resolv.conf that nobody else owns.
#include <gtest/gtest.h>
#include <resolv.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "hostmgmt/host_management_exception.h"
#include "kernctl/dns_config.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/machine.h"

namespace {

using HostMgmt::Lib::HostMgmtException;
using KernCtl::Network::DnsConfigImpl;

const std::string kFile = "/etc/resolv.conf";

void Add(const std::vector<std::string>& domains) {
  DnsConfigImpl configuration("defaultTcpipStack");
  for (const std::string& domain : domains) configuration.AddUserSearchDomain(domain);
  configuration.SaveConfig();
}

/// What the file holds after the domains have been added to `before`.
std::string After(const std::string& before, const std::vector<std::string>& domains = {"corp.example"}) {
  testsupport::WriteFile(kFile, before);
  Add(domains);
  return testsupport::ReadFile(kFile);
}

TEST(SearchDomainsTest, AddsASearchLine) {
  EXPECT_EQ(After("nameserver 10.0.0.1\n"), "nameserver 10.0.0.1\nsearch corp.example\n");
}

TEST(SearchDomainsTest, AppendsToTheSearchLine) {
  EXPECT_EQ(After("search a.example b.example\nnameserver 10.0.0.1\n"),
            "search a.example b.example corp.example\nnameserver 10.0.0.1\n");
}

TEST(SearchDomainsTest, KeepsEverythingElse) {
  const std::string rest =
      "; comment\n# another\n\nnameserver 10.0.0.1\noptions timeout:1\nsortlist 10.0.0.0\nodd\n";
  EXPECT_EQ(After(rest), rest + "search corp.example\n");
}

TEST(SearchDomainsTest, TurnsADomainLineIntoASearchLine) {
  EXPECT_EQ(After("domain a.example\nnameserver 10.0.0.1\n"),
            "search a.example corp.example\nnameserver 10.0.0.1\n");
}

TEST(SearchDomainsTest, ASearchLineBehindADomainLineHolds) {
  EXPECT_EQ(After("domain a.example\nsearch b.example\n"),
            "domain a.example\nsearch b.example corp.example\n");
}

TEST(SearchDomainsTest, ADomainLineBehindASearchLineHolds) {
  EXPECT_EQ(After("search b.example corp.example\ndomain a.example\n"),
            "search b.example corp.example\nsearch a.example corp.example\n");
}

TEST(SearchDomainsTest, TheLastOfSeveralSearchLinesHolds) {
  EXPECT_EQ(After("search corp.example\nsearch b.example\n"),
            "search corp.example\nsearch b.example corp.example\n");
}

TEST(SearchDomainsTest, AKeywordWithoutAValueDoesNotHold) {
  EXPECT_EQ(After("search a.example\nsearch\ndomain \n"), "search a.example corp.example\nsearch\ndomain \n");
}

TEST(SearchDomainsTest, AKeywordMustBeginTheLine) {
  EXPECT_EQ(After(" search a.example\nsearching b.example\n#search c.example\n"),
            " search a.example\nsearching b.example\n#search c.example\nsearch corp.example\n");
}

TEST(SearchDomainsTest, TheResolverSearchesWhatWasThereAndTheDomain) {
  After("domain a.example\nnameserver 10.0.0.1\n");
  struct __res_state state {};
  ASSERT_EQ(res_ninit(&state), 0);
  EXPECT_STREQ(state.dnsrch[0], "a.example");
  EXPECT_STREQ(state.dnsrch[1], "corp.example");
  EXPECT_EQ(state.dnsrch[2], nullptr);
  res_nclose(&state);
}

TEST(SearchDomainsTest, AddingTwiceChangesNothing) {
  const std::string once = After("nameserver 10.0.0.1\n");
  struct stat before {};
  stat(kFile.c_str(), &before);
  Add({"corp.example"});
  struct stat after {};
  stat(kFile.c_str(), &after);
  EXPECT_EQ(testsupport::ReadFile(kFile), once);
  EXPECT_EQ(before.st_ino, after.st_ino);
}

TEST(SearchDomainsTest, LetterCaseAndATrailingDotMakeNoOtherDomain) {
  for (const std::string line :
       {"search CORP.Example\n", "search x corp.example.\n", "domain Corp.example.\n"}) {
    EXPECT_EQ(After(line), line);
  }
  EXPECT_EQ(After("search corp.example\n", {"CORP.EXAMPLE."}), "search corp.example\n");
}

TEST(SearchDomainsTest, APartOfADomainIsAnotherDomain) {
  EXPECT_EQ(After("search sub.corp.example\n"), "search sub.corp.example corp.example\n");
}

TEST(SearchDomainsTest, AddsEachOfSeveralDomainsOnce) {
  EXPECT_EQ(After("search a.example\n", {"b.example", "A.example", "B.EXAMPLE", "c.example"}),
            "search a.example b.example c.example\n");
}

TEST(SearchDomainsTest, KeepsACommentAtTheEndOfTheLine) {
  EXPECT_EQ(After("search a.example # note\n"), "search a.example corp.example # note\n");
}

TEST(SearchDomainsTest, EndsALastLineThatWasNotEnded) {
  EXPECT_EQ(After("nameserver 10.0.0.1"), "nameserver 10.0.0.1\nsearch corp.example\n");
  EXPECT_EQ(After("search a.example"), "search a.example corp.example");
}

TEST(SearchDomainsTest, KeepsCarriageReturns) {
  EXPECT_EQ(After("search a.example\r\nnameserver 10.0.0.1\r\n"),
            "search a.example corp.example\r\nnameserver 10.0.0.1\r\n");
}

TEST(SearchDomainsTest, AVeryLongLineIsKept) {
  const std::string line = "search " + std::string(100000, 'a');
  EXPECT_TRUE(After(line + "\n") == line + " corp.example\n");
}

TEST(SearchDomainsTest, MakesAMissingFile) {
  testsupport::RemoveFile(kFile);
  Add({"corp.example"});
  EXPECT_EQ(testsupport::ReadFile(kFile), "search corp.example\n");
  EXPECT_EQ(testsupport::ModeOf(kFile), 0644U);
}

TEST(SearchDomainsTest, TakesTheHostsOwnDomainOver) {
  testsupport::SetHostName("host.own.example");
  EXPECT_EQ(After("nameserver 10.0.0.1\n"), "nameserver 10.0.0.1\nsearch own.example corp.example\n");
}

TEST(SearchDomainsTest, TheHostsOwnDomainIsSearchedAlready) {
  testsupport::SetHostName("host.corp.example");
  EXPECT_EQ(After("nameserver 10.0.0.1\n"), "nameserver 10.0.0.1\n");
}

TEST(SearchDomainsTest, NothingIsWrittenBeforeSaving) {
  const std::string before = testsupport::ReadFile(kFile);
  DnsConfigImpl("defaultTcpipStack").AddUserSearchDomain("corp.example");
  EXPECT_EQ(testsupport::ReadFile(kFile), before);
}

TEST(SearchDomainsTest, SavingNothingChangesNothing) {
  testsupport::RemoveFile(kFile);
  DnsConfigImpl("defaultTcpipStack").SaveConfig();
  EXPECT_FALSE(testsupport::Exists(kFile));
}

TEST(SearchDomainsTest, WorksOnTheFileAsItIsAtTheCall) {
  DnsConfigImpl configuration("defaultTcpipStack");
  configuration.AddUserSearchDomain("corp.example");
  testsupport::WriteFile(kFile, "search later.example\n");
  configuration.SaveConfig();
  EXPECT_EQ(testsupport::ReadFile(kFile), "search later.example corp.example\n");
}

TEST(SearchDomainsTest, KeepsTheMode) {
  ASSERT_EQ(chmod(kFile.c_str(), 0604), 0);
  Add({"corp.example"});
  EXPECT_EQ(testsupport::ModeOf(kFile), 0604U);
}

TEST(SearchDomainsTest, EditsTheFileBehindAForeignLink) {
  testsupport::RemoveFile(kFile);
  testsupport::MakeFolders("/run/elsewhere");
  testsupport::WriteFile("/run/elsewhere/resolv.conf", "nameserver 10.0.0.1\n");
  ASSERT_EQ(symlink("/run/elsewhere/resolv.conf", kFile.c_str()), 0);
  Add({"corp.example"});
  EXPECT_EQ(testsupport::ReadFile("/run/elsewhere/resolv.conf"),
            "nameserver 10.0.0.1\nsearch corp.example\n");
}

TEST(SearchDomainsTest, RewritesAMountedFileInPlace) {
  testsupport::WriteFile("/run/mounted", "search a.example\n");
  ASSERT_EQ(mount("/run/mounted", kFile.c_str(), nullptr, MS_BIND, nullptr), 0);
  Add({"corp.example"});
  EXPECT_EQ(testsupport::ReadFile("/run/mounted"), "search a.example corp.example\n");
}

TEST(SearchDomainsTest, RefusesWhatCannotBeADomain) {
  DnsConfigImpl configuration("defaultTcpipStack");
  for (const std::string domain :
       {"", ".", "a b", "a\nnameserver 10.6.6.6", "a#b", "a..b", ".a", "-a", "a;b"}) {
    EXPECT_THROW_WHAT(configuration.AddUserSearchDomain(domain), HostMgmtException,
                      "'" + domain + "' cannot be a DNS search domain");
  }
}

TEST(SearchDomainsTest, TheHostHasOneStack) {
  EXPECT_THROW_WHAT(DnsConfigImpl("otherStack"), HostMgmtException,
                    "The host has no network stack 'otherStack'");
}

TEST(SearchDomainsTest, AFileThatCannotBeReadFailsAtOpening) {
  ASSERT_EQ(chmod(kFile.c_str(), 0), 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_THROW_WHAT(DnsConfigImpl("defaultTcpipStack"), HostMgmtException,
                    "Unable to read '/etc/resolv.conf': Permission denied");
}

}  // namespace
