// winbindd's answers in the terms of the plug-in interface.

#include "plugin/trust_mapping.h"

#include <gtest/gtest.h>

namespace sambaprovider {
namespace {

uint32_t StateOf(wbcErr error, uint32_t ntStatus = 0, bool serviceRuns = true) {
  return TrustStateOf({error, ntStatus}, serviceRuns);
}

TEST(TrustMappingTest, AnAcceptedPasswordIsHealthy) {
  EXPECT_EQ(StateOf(WBC_ERR_SUCCESS), 1U);
}

TEST(TrustMappingTest, AMissingOrDisabledAccountIsUnusable) {
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC000018B), 3U);
}

TEST(TrustMappingTest, APasswordThatWasResetIsWrong) {
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC0000022), 4U);
}

TEST(TrustMappingTest, ASilentControllerIsNone) {
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC0000233), 5U);
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC000005E), 5U);
}

TEST(TrustMappingTest, AServiceThatGaveTheQuestionUpFoundNoController) {
  EXPECT_EQ(StateOf(WBC_ERR_WINBIND_NOT_AVAILABLE, 0, true), 5U);
}

TEST(TrustMappingTest, AServiceThatDoesNotRunIsDown) {
  EXPECT_EQ(StateOf(WBC_ERR_WINBIND_NOT_AVAILABLE, 0, false), 8U);
}

TEST(TrustMappingTest, MissingSecretsMeanNotJoined) {
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC00000C9), 9U);
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC00000DF), 9U);
}

TEST(TrustMappingTest, AnythingElseIsBroken) {
  EXPECT_EQ(StateOf(WBC_ERR_AUTH_ERROR, 0xC0000001), 10U);
  EXPECT_EQ(StateOf(WBC_ERR_UNKNOWN_FAILURE), 10U);
}

TEST(TrustMappingTest, NoAnswerHasAMeaningThatTheLibrarySetsItself) {
  for (const uint32_t status : {0xC000018BU, 0xC0000022U, 0xC0000233U, 0xC00000C9U, 0xC0000001U, 0U}) {
    const uint32_t state = StateOf(WBC_ERR_AUTH_ERROR, status);
    EXPECT_TRUE(state != 0 && state != 2 && state != 6 && state != 7) << state;
  }
}

TEST(TrustMappingTest, ARelationshipFollowsTheDirections) {
  EXPECT_EQ(
      RelationshipOf(WBC_DOMINFO_TRUST_INCOMING | WBC_DOMINFO_TRUST_OUTGOING | WBC_DOMINFO_TRUST_TRANSITIVE),
      3U);
  EXPECT_EQ(RelationshipOf(WBC_DOMINFO_TRUST_INCOMING), 4U);
  EXPECT_EQ(RelationshipOf(WBC_DOMINFO_TRUST_OUTGOING), 5U);
  EXPECT_EQ(RelationshipOf(0), 8U);
}

winbind::TrustedDomain JoinedDomain(uint32_t flags, bool online) {
  return {"corp.example", "CORP", flags, online};
}

TEST(LearningTest, AnOfflineDomainAloneIsNoAnswer) {
  EXPECT_TRUE(winbind::IsBeforeLearning({JoinedDomain(WBC_DOMINFO_TRUST_TRANSITIVE, false)}));
}

TEST(LearningTest, ADomainFromTheConfigurationAloneIsNoAnswer) {
  EXPECT_TRUE(winbind::IsBeforeLearning(
      {JoinedDomain(WBC_DOMINFO_TRUST_TRANSITIVE | WBC_DOMINFO_TRUST_OUTGOING, true)}));
}

TEST(LearningTest, ADomainThatTrustsNobodyIsAnAnswer) {
  EXPECT_FALSE(winbind::IsBeforeLearning({JoinedDomain(WBC_DOMINFO_TRUST_TRANSITIVE, true)}));
}

TEST(LearningTest, WhatWasLearntBeforeAnOutageIsAnAnswer) {
  EXPECT_FALSE(winbind::IsBeforeLearning(
      {JoinedDomain(WBC_DOMINFO_TRUST_TRANSITIVE, false), {"other.example", "OTHER", 7, false}}));
}

}  // namespace
}  // namespace sambaprovider
