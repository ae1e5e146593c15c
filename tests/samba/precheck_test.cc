// What the pre-check makes of the libraries' answers.

#include <gtest/gtest.h>
#include <krb5/krb5.h>

#include "expect_failure.h"
#include "precheck/directory.h"
#include "precheck/kerberos.h"

namespace sambaprovider {
namespace {

TEST(KerberosStatusTest, EveryReasonHasItsStatus) {
  EXPECT_EQ(StatusOfKerberosError(KRB5KDC_ERR_PREAUTH_FAILED), 86U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KRB_AP_ERR_BAD_INTEGRITY), 86U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KDC_ERR_C_PRINCIPAL_UNKNOWN), 1317U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KDC_ERR_CLIENT_REVOKED), 1331U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KDC_ERR_NAME_EXP), 1331U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KDC_ERR_KEY_EXP), 1330U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KRB_AP_ERR_SKEW), 1398U);
  EXPECT_EQ(StatusOfKerberosError(KRB5_KDC_UNREACH), 1311U);
  EXPECT_EQ(StatusOfKerberosError(KRB5KDC_ERR_POLICY), 5U);
}

TEST(KerberosStatusTest, AnyOtherReasonIsAnInternalError) {
  EXPECT_EQ(StatusOfKerberosError(KRB5_CC_NOTFOUND), 1359U);
}

TEST(GeneralizedTimeTest, ItIsUniversalTime) {
  EXPECT_EQ(ParseGeneralizedTime("19700102000001.0Z"), 86401);
  EXPECT_EQ(ParseGeneralizedTime("20261121010203.0Z"), 1795222923);
}

TEST(GeneralizedTimeTest, AnythingElseIsRefused) {
  EXPECT_FAILURE(ParseGeneralizedTime(""), 1359);
  EXPECT_FAILURE(ParseGeneralizedTime("tomorrow"), 1359);
}

TEST(ControllersAccountTest, ItIsKnownByItsFlags) {
  EXPECT_TRUE(IsControllersAccount("532480"));
  EXPECT_TRUE(IsControllersAccount("83890176"));
}

TEST(ControllersAccountTest, AMembersAccountIsNone) {
  EXPECT_FALSE(IsControllersAccount("4096"));
  EXPECT_FALSE(IsControllersAccount("4098"));
  EXPECT_FALSE(IsControllersAccount(""));
}

TEST(DirectoryTest, AControllerThatDoesNotAnswerIsReportedAsSuch) {
  Directory directory("127.0.0.1", std::chrono::seconds(5));
  EXPECT_FAILURE(directory.ReadRootEntry(), 1311);
}

}  // namespace
}  // namespace sambaprovider
