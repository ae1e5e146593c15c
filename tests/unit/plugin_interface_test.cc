// The records that cross to a plug-in, as a plug-in that was built years ago knows them.

#include <gtest/gtest.h>

#include <cstddef>
#include <type_traits>

#include "authentication/plugin/active_directory_client.h"

namespace {

using Metadata = struct ActiveDirectoryClientMetadata;
using Operations = struct ActiveDirectoryClientOperations;

TEST(PluginInterfaceTest, EveryFieldOfTheMetadataHasItsPlace) {
  EXPECT_EQ(offsetof(Metadata, apiVersion), 0U);
  EXPECT_EQ(offsetof(Metadata, pamModule), 8U);
  EXPECT_EQ(offsetof(Metadata, pamModuleParameters), 16U);
  EXPECT_EQ(offsetof(Metadata, nssModule), 24U);
  EXPECT_EQ(offsetof(Metadata, nssModuleParameters), 32U);
  EXPECT_EQ(sizeof(Metadata), 40U);
}

TEST(PluginInterfaceTest, EverySlotOfTheTableHasItsPlace) {
  // Slot n stands at 8 * (n - 1): the version in slot 1 is padded to a pointer's size.
  EXPECT_EQ(offsetof(Operations, apiVersion), 8U * 0);
  EXPECT_EQ(offsetof(Operations, joinDomain), 8U * 1);
  EXPECT_EQ(offsetof(Operations, partDomain), 8U * 2);
  EXPECT_EQ(offsetof(Operations, getActiveDomain), 8U * 3);
  EXPECT_EQ(offsetof(Operations, setPreferredDomainControllers), 8U * 4);
  EXPECT_EQ(offsetof(Operations, getPreferredDomainControllers), 8U * 5);
  EXPECT_EQ(offsetof(Operations, reserved), 8U * 6);
  EXPECT_EQ(offsetof(Operations, getDomainTrustState), 8U * 7);
  EXPECT_EQ(offsetof(Operations, getTrustedDomains), 8U * 8);
  EXPECT_EQ(offsetof(Operations, getMachineAccountDN), 8U * 9);
  EXPECT_EQ(offsetof(Operations, getAnyDomainController), 8U * 10);
  EXPECT_EQ(offsetof(Operations, convertCanonicalUsername), 8U * 11);
  EXPECT_EQ(offsetof(Operations, joinDomainWithMachineAccount), 8U * 12);
  EXPECT_EQ(offsetof(Operations, getHostPrincipalForDomain), 8U * 13);
  EXPECT_EQ(offsetof(Operations, getDomainTrustRelationship), 8U * 14);
  EXPECT_EQ(offsetof(Operations, setSmartCardEnabledServices), 8U * 15);
  EXPECT_EQ(offsetof(Operations, getSmartCardEnabledServices), 8U * 16);
  EXPECT_EQ(sizeof(Operations), 8U * 17);
}

TEST(PluginInterfaceTest, TheVersionsAreSigned) {
  EXPECT_TRUE((std::is_same_v<decltype(Metadata::apiVersion), std::int32_t>));
  EXPECT_TRUE((std::is_same_v<decltype(Operations::apiVersion), std::int32_t>));
}

TEST(PluginInterfaceTest, CredentialsAreTwoPointers) {
  EXPECT_EQ(offsetof(Credentials, username), 0U);
  EXPECT_EQ(offsetof(Credentials, password), 8U);
  EXPECT_EQ(sizeof(Credentials), 16U);
}

TEST(PluginInterfaceTest, TheEnumerationsAre32BitsWideAndTakeEveryValue) {
  EXPECT_EQ(sizeof(TrustState), 4U);
  EXPECT_EQ(sizeof(TrustRelationship), 4U);
  EXPECT_TRUE((std::is_same_v<std::underlying_type_t<TrustState>, std::uint32_t>));
  EXPECT_TRUE((std::is_same_v<std::underlying_type_t<TrustRelationship>, std::uint32_t>));
}

TEST(PluginInterfaceTest, TheValuesThatTheLibrarySetsHaveTheirNumbers) {
  EXPECT_EQ(TRUST_STATE_NOT_PROVIDED, 0U);
  EXPECT_EQ(TRUST_STATE_TIMED_OUT, 2U);
  EXPECT_EQ(TRUST_STATE_NOT_KNOWN, 7U);
  EXPECT_EQ(TRUST_RELATIONSHIP_NOT_PROVIDED, 0U);
  EXPECT_EQ(TRUST_RELATIONSHIP_UNKNOWN, 6U);
}

}  // namespace
