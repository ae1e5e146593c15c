#include "stores/ad_cache.h"

#include <gtest/gtest.h>

#include <deque>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace quenix::authentication {
namespace {

using Names = std::vector<std::string>;

ActiveDirectoryStoreConfiguration Filled() {
  ActiveDirectoryStoreConfiguration configuration;
  configuration.activeDomain = Domain("example.test", "EXAMPLE");
  configuration.preferredDomainControllers = {"dc2", "dc1"};
  configuration.machineAccountDN = "CN=HOST";
  return configuration;
}

TEST(ADCacheTest, IsEmptyAtFirstWithTrustStateSeven) {
  const ADCache cache;
  EXPECT_EQ(cache.GetDomainTrustState(), 7U);
  EXPECT_TRUE(cache.GetTrustedDomains().empty());
  EXPECT_FALSE(cache.IsDomainMember());
  EXPECT_EQ(cache.GetConfiguration().activeDomain.dnsName, "");
  EXPECT_TRUE(cache.GetConfiguration().preferredDomainControllers.empty());
  EXPECT_EQ(cache.GetConfiguration().machineAccountDN, "");
  EXPECT_FALSE(cache.IsSmartCardAuthenticationEnabled(nullptr, 0));
}

TEST(ADCacheTest, GivesTheConfigurationThatItTook) {
  ADCache cache;
  cache.SetConfiguration(Filled());
  const ActiveDirectoryStoreConfiguration configuration = cache.GetConfiguration();
  EXPECT_EQ(configuration.activeDomain.dnsName, "example.test");
  EXPECT_EQ(configuration.activeDomain.netbiosName, "EXAMPLE");
  EXPECT_EQ(configuration.preferredDomainControllers, (std::deque<std::string>{"dc2", "dc1"}));
  EXPECT_EQ(configuration.machineAccountDN, "CN=HOST");
}

TEST(ADCacheTest, GivesCopies) {
  ADCache cache;
  cache.SetConfiguration(Filled());
  cache.GetConfiguration().preferredDomainControllers.clear();
  EXPECT_EQ(cache.GetConfiguration().preferredDomainControllers.size(), 2U);
}

TEST(ADCacheTest, AnEmptyConfigurationEmptiesIt) {
  ADCache cache;
  cache.SetConfiguration(Filled());
  cache.SetConfiguration(ActiveDirectoryStoreConfiguration());
  EXPECT_FALSE(cache.IsDomainMember());
  EXPECT_EQ(cache.GetConfiguration().machineAccountDN, "");
  EXPECT_TRUE(cache.GetConfiguration().preferredDomainControllers.empty());
}

TEST(ADCacheTest, OnlyTheDnsNameMakesAMember) {
  ADCache cache;
  ActiveDirectoryStoreConfiguration configuration;
  configuration.activeDomain = Domain("", "EXAMPLE");
  cache.SetConfiguration(std::move(configuration));
  EXPECT_FALSE(cache.IsDomainMember());
  cache.SetConfiguration(Filled());
  EXPECT_TRUE(cache.IsDomainMember());
}

TEST(ADCacheTest, TrustedDomainsAreReplacedAsAWhole) {
  ADCache cache;
  cache.SetTrustedDomains({Domain("b.test", "B"), Domain("a.test", "A")});
  cache.SetTrustedDomains({Domain("c.test", "C")});
  ASSERT_EQ(cache.GetTrustedDomains().size(), 1U);
  EXPECT_EQ(cache.GetTrustedDomains()[0].dnsName, "c.test");
}

TEST(ADCacheTest, AllDomainsAreTheJoinedOneAndThenTheTrustedOnesInOrder) {
  ADCache cache;
  cache.SetConfiguration(Filled());
  cache.SetTrustedDomains({Domain("b.test", "B"), Domain("a.test", "A")});
  const std::vector<Domain> domains = cache.GetAllDomains();
  ASSERT_EQ(domains.size(), 3U);
  EXPECT_EQ(domains[0].dnsName, "example.test");
  EXPECT_EQ(domains[1].dnsName, "b.test");
  EXPECT_EQ(domains[2].netbiosName, "A");
  EXPECT_EQ(domains.capacity(), 3U);
}

TEST(ADCacheTest, AllDomainsOfAHostThatIsNotJoinedAreOneWithEmptyNames) {
  const ADCache cache;
  const std::vector<Domain> domains = cache.GetAllDomains();
  ASSERT_EQ(domains.size(), 1U);
  EXPECT_EQ(domains[0].dnsName + domains[0].netbiosName, "");
}

TEST(ADCacheTest, TheTrustStateIsOverwritten) {
  ADCache cache;
  cache.SetDomainTrustState(TRUST_STATE_HEALTHY);
  EXPECT_EQ(cache.GetDomainTrustState(), TRUST_STATE_HEALTHY);
  cache.SetDomainTrustState(static_cast<TrustState>(0xffffffffU));
  EXPECT_EQ(cache.GetDomainTrustState(), 0xffffffffU);
}

TEST(ADCacheTest, AnUnknownDomainHasRelationshipSix) {
  const ADCache cache;
  EXPECT_EQ(cache.GetDomainTrustRelationship("example.test"), 6U);
  EXPECT_EQ(cache.GetDomainTrustRelationship(""), 6U);
}

TEST(ADCacheTest, RelationshipsAreKeptByExactName) {
  ADCache cache;
  cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_TWO_WAY);
  EXPECT_EQ(cache.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_TWO_WAY);
  EXPECT_EQ(cache.GetDomainTrustRelationship("A.test"), 6U);
  cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_INBOUND);
  EXPECT_EQ(cache.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_INBOUND);
}

TEST(ADCacheTest, CleaningUpDropsWhatThisPassDidNotStore) {
  ADCache cache;
  cache.SetDomainTrustRelationship("old.test", TRUST_RELATIONSHIP_TWO_WAY);
  cache.SetDomainTrustRelationship("renewed.test", TRUST_RELATIONSHIP_TWO_WAY);
  cache.IncreaseTrustRelationshipsGenNo();
  cache.SetDomainTrustRelationship("renewed.test", TRUST_RELATIONSHIP_INBOUND);
  cache.CleanupOldTrustRelationships();
  EXPECT_EQ(cache.GetDomainTrustRelationship("old.test"), 6U);
  EXPECT_EQ(cache.GetDomainTrustRelationship("renewed.test"), TRUST_RELATIONSHIP_INBOUND);
}

TEST(ADCacheTest, WithoutANewPassCleaningUpDropsNothing) {
  ADCache cache;
  cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_TWO_WAY);
  cache.CleanupOldTrustRelationships();
  EXPECT_EQ(cache.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_TWO_WAY);
}

TEST(ADCacheTest, AnEntryOfTwoHundredAndFiftySixPassesAgoCountsAsCurrent) {
  ADCache cache;
  cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_TWO_WAY);
  for (int pass = 0; pass < 256; ++pass) {
    cache.IncreaseTrustRelationshipsGenNo();
  }
  cache.CleanupOldTrustRelationships();
  EXPECT_EQ(cache.GetDomainTrustRelationship("a.test"), TRUST_RELATIONSHIP_TWO_WAY);
}

TEST(ADCacheTest, AnEntryOfTwoHundredAndFiftyFivePassesAgoIsDropped) {
  ADCache cache;
  cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_TWO_WAY);
  for (int pass = 0; pass < 255; ++pass) {
    cache.IncreaseTrustRelationshipsGenNo();
  }
  cache.CleanupOldTrustRelationships();
  EXPECT_EQ(cache.GetDomainTrustRelationship("a.test"), 6U);
}

TEST(ADCacheTest, AStampFromBeforeTheWrapIsOld) {
  ADCache cache;
  for (int pass = 0; pass < 255; ++pass) {
    cache.IncreaseTrustRelationshipsGenNo();
  }
  cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_TWO_WAY);
  cache.IncreaseTrustRelationshipsGenNo();
  cache.CleanupOldTrustRelationships();
  EXPECT_EQ(cache.GetDomainTrustRelationship("a.test"), 6U);
}

class SmartCardTest : public ::testing::Test {
 protected:
  bool Enabled(std::vector<const char*> services) const {
    return cache_.IsSmartCardAuthenticationEnabled(services.data(), services.size());
  }

  ADCache cache_;
};

TEST_F(SmartCardTest, WithThePolicyOffNothingIsEnabled) {
  cache_.SetSmartCardEnabledServices({"login"});
  EXPECT_FALSE(Enabled({"login"}));
  EXPECT_FALSE(Enabled({}));
}

TEST_F(SmartCardTest, WithThePolicyOnNoServiceIsEnabledAlways) {
  cache_.SetPcscdSvcPolicyOn(true);
  EXPECT_TRUE(Enabled({}));
  cache_.SetPcscdSvcPolicyOn(false);
  EXPECT_FALSE(Enabled({}));
}

TEST_F(SmartCardTest, EveryServiceMustBeInTheList) {
  cache_.SetPcscdSvcPolicyOn(true);
  cache_.SetSmartCardEnabledServices({"login", "sshd"});
  EXPECT_TRUE(Enabled({"sshd"}));
  EXPECT_TRUE(Enabled({"sshd", "login", "sshd"}));
  EXPECT_FALSE(Enabled({"sshd", "su"}));
  EXPECT_FALSE(Enabled({"su", "sshd"}));
}

TEST_F(SmartCardTest, NamesAreComparedExactly) {
  cache_.SetPcscdSvcPolicyOn(true);
  cache_.SetSmartCardEnabledServices({"sshd"});
  EXPECT_FALSE(Enabled({"SSHD"}));
  EXPECT_FALSE(Enabled({"ssh"}));
  EXPECT_FALSE(Enabled({"sshd "}));
  EXPECT_FALSE(Enabled({""}));
}

TEST_F(SmartCardTest, ANewListReplacesTheOld) {
  cache_.SetPcscdSvcPolicyOn(true);
  cache_.SetSmartCardEnabledServices({"sshd"});
  cache_.SetSmartCardEnabledServices({"login"});
  EXPECT_FALSE(Enabled({"sshd"}));
  EXPECT_TRUE(Enabled({"login"}));
}

TEST(ADCacheTest, MayBeUsedFromSeveralThreads) {
  ADCache cache;
  std::vector<std::thread> threads;
  for (int index = 0; index < 3; ++index) {
    threads.emplace_back([&cache] {
      for (int round = 0; round < 200; ++round) {
        cache.SetConfiguration(Filled());
        cache.SetTrustedDomains({Domain("a.test", "A")});
        cache.SetDomainTrustRelationship("a.test", TRUST_RELATIONSHIP_TWO_WAY);
        cache.IncreaseTrustRelationshipsGenNo();
        cache.CleanupOldTrustRelationships();
        EXPECT_LE(cache.GetAllDomains().size(), 2U);
        EXPECT_EQ(cache.GetConfiguration().machineAccountDN, "CN=HOST");
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
}

}  // namespace
}  // namespace quenix::authentication
