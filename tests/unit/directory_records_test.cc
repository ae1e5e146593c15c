#include "authentication/directory_records.h"

#include <gtest/gtest.h>

#include <memory>
#include <sstream>
#include <string>
#include <type_traits>
#include <utility>

namespace quenix::authentication {
namespace {

std::string Printed(const Domain& domain) {
  std::ostringstream stream;
  stream << domain;
  return stream.str();
}

TEST(DomainTest, HasItsNamesInOrder) {
  const Domain domain("example.test", "EXAMPLE");
  EXPECT_EQ(domain.dnsName, "example.test");
  EXPECT_EQ(domain.netbiosName, "EXAMPLE");
}

TEST(DomainTest, HasEmptyNamesAtFirst) {
  EXPECT_EQ(Domain().dnsName, "");
  EXPECT_EQ(Domain().netbiosName, "");
}

TEST(DomainTest, PrintsBothNames) {
  EXPECT_EQ(Printed({"example.test", "EXAMPLE"}), "DNS Name: example.test, NetBIOS Name: EXAMPLE");
}

TEST(DomainTest, PrintsTwoUnsetNames) {
  EXPECT_EQ(Printed({}), "DNS Name: (unset), NetBIOS Name: (unset)");
}

TEST(DomainTest, PrintsADnsNameAlone) {
  EXPECT_EQ(Printed({"example.test", ""}), "DNS Name: example.test, NetBIOS Name: (unset)");
}

TEST(DomainTest, PrintsANetbiosNameAlone) {
  EXPECT_EQ(Printed({"", "EXAMPLE"}), "DNS Name: (unset), NetBIOS Name: EXAMPLE");
}

TEST(DomainTest, PrintsNamesAsTheyStand) {
  EXPECT_EQ(Printed({"\"a b\"", " "}), "DNS Name: \"a b\", NetBIOS Name:  ");
}

TEST(DomainTest, PrintingReturnsTheStream) {
  std::ostringstream stream;
  EXPECT_EQ(&(stream << Domain()), &stream);
}

static_assert(std::is_copy_constructible_v<Domain> && std::is_copy_assignable_v<Domain>);
static_assert(std::is_nothrow_move_constructible_v<Domain>);
static_assert(!std::is_polymorphic_v<Domain>);

TEST(ActiveDirectoryStoreConfigurationTest, IsEmptyAtFirst) {
  const ActiveDirectoryStoreConfiguration configuration;
  EXPECT_EQ(configuration.activeDomain.dnsName, "");
  EXPECT_EQ(configuration.activeDomain.netbiosName, "");
  EXPECT_TRUE(configuration.preferredDomainControllers.empty());
  EXPECT_EQ(configuration.machineAccountDN, "");
}

ActiveDirectoryStoreConfiguration Filled() {
  ActiveDirectoryStoreConfiguration configuration;
  configuration.activeDomain = Domain("example.test", "EXAMPLE");
  configuration.preferredDomainControllers = {"dc1.example.test", "dc2.example.test"};
  configuration.machineAccountDN = "CN=HOST,CN=Computers,DC=example,DC=test";
  return configuration;
}

TEST(ActiveDirectoryStoreConfigurationTest, ACopyIsDeep) {
  const ActiveDirectoryStoreConfiguration original = Filled();
  ActiveDirectoryStoreConfiguration copy = original;
  copy.preferredDomainControllers.clear();
  copy.machineAccountDN.clear();
  EXPECT_EQ(original.preferredDomainControllers.size(), 2U);
  EXPECT_EQ(original.machineAccountDN, "CN=HOST,CN=Computers,DC=example,DC=test");
}

TEST(ActiveDirectoryStoreConfigurationTest, MovesItsFields) {
  ActiveDirectoryStoreConfiguration original = Filled();
  const ActiveDirectoryStoreConfiguration moved = std::move(original);
  EXPECT_EQ(moved.activeDomain.dnsName, "example.test");
  EXPECT_EQ(moved.preferredDomainControllers.size(), 2U);
}

// A leak would be reported by the sanitizers.
TEST(ActiveDirectoryStoreConfigurationTest, IsReleasedThroughItsBase) {
  const std::unique_ptr<StoreConfiguration> base =
      std::make_unique<ActiveDirectoryStoreConfiguration>(Filled());
  EXPECT_NE(dynamic_cast<ActiveDirectoryStoreConfiguration*>(base.get()), nullptr);
}

static_assert(std::has_virtual_destructor_v<StoreConfiguration>);

TEST(ProxyJoinRecordsTest, AreEmptyAtFirst) {
  const CAM::DirectoryDomainInfo domain;
  EXPECT_EQ(domain.domainController + domain.netbiosDomainName + domain.dnsDomainName + domain.domainSid, "");
  const CAM::MachineAccountInfo account;
  EXPECT_EQ(account.hostName + account.dnsDomainName + account.organizationalUnit + account.accountName +
                account.joinBlob,
            "");
  const ComputerPrincipalInfo principal;
  EXPECT_EQ(principal.organizationalUnit + principal.accountName + principal.joinBlob, "");
}

TEST(ProxyJoinRecordsTest, HaveTheirFieldsInOrder) {
  const CAM::DirectoryDomainInfo domain{"1", "2", "3", "4"};
  EXPECT_EQ(domain.netbiosDomainName, "2");
  EXPECT_EQ(domain.dnsDomainName, "3");
  EXPECT_EQ(domain.domainSid, "4");
  const CAM::MachineAccountInfo account{"1", "2", "3", "4", "5"};
  EXPECT_EQ(account.hostName, "1");
  EXPECT_EQ(account.dnsDomainName, "2");
}

}  // namespace
}  // namespace quenix::authentication
