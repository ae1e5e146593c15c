// What the pre-check makes of the libraries' answers.

#include <gtest/gtest.h>
#include <krb5/krb5.h>

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

TEST(ControllersAccountTest, ItIsKnownByItsFlags) {
  EXPECT_TRUE(IsControllersAccount("532480"));
  EXPECT_TRUE(IsControllersAccount("83890176"));
}

TEST(ControllersAccountTest, AMembersAccountIsNone) {
  EXPECT_FALSE(IsControllersAccount("4096"));
  EXPECT_FALSE(IsControllersAccount("4098"));
  EXPECT_FALSE(IsControllersAccount(""));
}

}  // namespace
}  // namespace sambaprovider
