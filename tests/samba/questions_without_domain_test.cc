// Questions on a host whose winbindd does not run: what the state file answers, and what is said of the rest.

#include <gtest/gtest.h>

#include <string>

#include "loaded_plugin.h"
#include "support/files.h"

namespace {

using sambatest::InstallJoinedState;
using sambatest::LoadedPlugin;

class QuestionsWithoutDomainTest : public testing::Test {
 protected:
  const LoadedPlugin plugin_;
  ActiveDirectoryFree release_ = nullptr;
  char* text_ = nullptr;
  char** names_ = nullptr;
};

TEST_F(QuestionsWithoutDomainTest, AnUnjoinedHostHasNoActiveDomain) {
  ActiveDirectoryDomainPair domain = {nullptr, nullptr};
  EXPECT_EQ(plugin_->getActiveDomain(&domain, &release_), 0U);
  EXPECT_EQ(domain.dnsName, nullptr);
  EXPECT_EQ(domain.netbiosName, nullptr);
}

TEST_F(QuestionsWithoutDomainTest, AJoinedHostHasItsDomainsNames) {
  InstallJoinedState();
  ActiveDirectoryDomainPair domain = {nullptr, nullptr};
  ASSERT_EQ(plugin_->getActiveDomain(&domain, &release_), 0U);
  EXPECT_STREQ(domain.dnsName, "corp.example");
  EXPECT_STREQ(domain.netbiosName, "CORP");
  release_(domain.dnsName);
  release_(domain.netbiosName);
}

TEST_F(QuestionsWithoutDomainTest, ADamagedStateIsAnError) {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  testsupport::WriteFile("/var/lib/quenix/samba/state.json", "{");
  ActiveDirectoryDomainPair domain = {nullptr, nullptr};
  EXPECT_EQ(plugin_->getActiveDomain(&domain, &release_), 1359U);
}

TEST_F(QuestionsWithoutDomainTest, TheMachineAccountIsRemembered) {
  InstallJoinedState();
  ASSERT_EQ(plugin_->getMachineAccountDN(&text_, &release_), 0U);
  EXPECT_STREQ(text_, "CN=HOST1,DC=corp,DC=example");
  release_(text_);
}

TEST_F(QuestionsWithoutDomainTest, TheHostPrincipalIsThatOfTheJoinedDomain) {
  InstallJoinedState();
  ASSERT_EQ(plugin_->getHostPrincipalForDomain("CORP.example", &text_, &release_), 0U);
  EXPECT_STREQ(text_, "HOST/host1.corp.example@CORP.EXAMPLE");
  release_(text_);
}

TEST_F(QuestionsWithoutDomainTest, ThereIsNoHostPrincipalInAnotherDomain) {
  InstallJoinedState();
  EXPECT_EQ(plugin_->getHostPrincipalForDomain("other.example", &text_, &release_), 1355U);
}

TEST_F(QuestionsWithoutDomainTest, PreferredControllersAreReadBack) {
  InstallJoinedState();
  ASSERT_EQ(plugin_->getPreferredDomainControllers(&names_, &release_), 0U);
  EXPECT_STREQ(names_[0], "dc1.corp.example");
  EXPECT_EQ(names_[1], nullptr);
  release_(names_);
}

TEST_F(QuestionsWithoutDomainTest, SmartCardServicesAreKept) {
  const char* const services[] = {"sshd", "login", nullptr};
  ASSERT_EQ(plugin_->setSmartCardEnabledServices(services), 0U);
  ASSERT_EQ(plugin_->getSmartCardEnabledServices(&names_, &release_), 0U);
  EXPECT_STREQ(names_[0], "sshd");
  EXPECT_STREQ(names_[1], "login");
  EXPECT_EQ(names_[2], nullptr);
  release_(names_);
}

TEST_F(QuestionsWithoutDomainTest, TheTrustOfAnUnjoinedHostIsCalledSo) {
  EXPECT_EQ(plugin_->getDomainTrustState(), 9U);
}

TEST_F(QuestionsWithoutDomainTest, TheTrustOfAJoinedHostWithoutItsServiceIsCalledSo) {
  InstallJoinedState();
  EXPECT_EQ(plugin_->getDomainTrustState(), 8U);
}

TEST_F(QuestionsWithoutDomainTest, AnUnjoinedHostTrustsNobody) {
  ActiveDirectoryDomainPair** domains = nullptr;
  ASSERT_EQ(plugin_->getTrustedDomains(&domains, &release_), 0U);
  EXPECT_EQ(domains[0], nullptr);
  release_(domains);
  EXPECT_EQ(plugin_->getDomainTrustRelationship("corp.example"), 8U);
}

TEST_F(QuestionsWithoutDomainTest, ItsOwnDomainIsKnownWithoutTheService) {
  InstallJoinedState();
  EXPECT_EQ(plugin_->getDomainTrustRelationship("CORP"), 1U);
}

TEST_F(QuestionsWithoutDomainTest, NothingIsKnownOfOtherDomainsWithoutTheService) {
  InstallJoinedState();
  EXPECT_EQ(plugin_->getDomainTrustRelationship("other.example"), 6U);
}

TEST_F(QuestionsWithoutDomainTest, AServiceThatDoesNotRunIsReported) {
  InstallJoinedState();
  ActiveDirectoryDomainPair** domains = nullptr;
  EXPECT_EQ(plugin_->getTrustedDomains(&domains, &release_), 1062U);
  EXPECT_EQ(plugin_->getAnyDomainController(nullptr, "corp.example", &text_, &release_), 1062U);
  EXPECT_EQ(plugin_->convertCanonicalUsername("alice", &text_, &release_), 1062U);
}

TEST_F(QuestionsWithoutDomainTest, AnEmptyUserNameIsMalformed) {
  InstallJoinedState();
  EXPECT_EQ(plugin_->convertCanonicalUsername("", &text_, &release_), 1315U);
}

}  // namespace
