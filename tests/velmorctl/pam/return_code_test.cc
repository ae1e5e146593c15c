#include "pam/return_code.h"

#include <gtest/gtest.h>
#include <security/_pam_types.h>

namespace velmorctltest {

namespace {

using velmorctl::pam::IsKnown;
using velmorctl::pam::NameOf;
using velmorctl::pam::ReturnCode;
using velmorctl::pam::ReturnCodeOf;

struct NamedCode {
  int number;
  const char* name;
};

constexpr NamedCode CODES[] = {{PAM_SUCCESS, "success"},
                               {PAM_OPEN_ERR, "open_err"},
                               {PAM_SYMBOL_ERR, "symbol_err"},
                               {PAM_SERVICE_ERR, "service_err"},
                               {PAM_SYSTEM_ERR, "system_err"},
                               {PAM_BUF_ERR, "buf_err"},
                               {PAM_PERM_DENIED, "perm_denied"},
                               {PAM_AUTH_ERR, "auth_err"},
                               {PAM_CRED_INSUFFICIENT, "cred_insufficient"},
                               {PAM_AUTHINFO_UNAVAIL, "authinfo_unavail"},
                               {PAM_USER_UNKNOWN, "user_unknown"},
                               {PAM_MAXTRIES, "maxtries"},
                               {PAM_NEW_AUTHTOK_REQD, "new_authtok_reqd"},
                               {PAM_ACCT_EXPIRED, "acct_expired"},
                               {PAM_SESSION_ERR, "session_err"},
                               {PAM_CRED_UNAVAIL, "cred_unavail"},
                               {PAM_CRED_EXPIRED, "cred_expired"},
                               {PAM_CRED_ERR, "cred_err"},
                               {PAM_NO_MODULE_DATA, "no_module_data"},
                               {PAM_CONV_ERR, "conv_err"},
                               {PAM_AUTHTOK_ERR, "authtok_err"},
                               {PAM_AUTHTOK_RECOVERY_ERR, "authtok_recover_err"},
                               {PAM_AUTHTOK_LOCK_BUSY, "authtok_lock_busy"},
                               {PAM_AUTHTOK_DISABLE_AGING, "authtok_disable_aging"},
                               {PAM_TRY_AGAIN, "try_again"},
                               {PAM_IGNORE, "ignore"},
                               {PAM_ABORT, "abort"},
                               {PAM_AUTHTOK_EXPIRED, "authtok_expired"},
                               {PAM_MODULE_UNKNOWN, "module_unknown"},
                               {PAM_BAD_ITEM, "bad_item"},
                               {PAM_CONV_AGAIN, "conv_again"},
                               {PAM_INCOMPLETE, "incomplete"}};

TEST(ReturnCodeTest, NumbersAndNamesAreThoseOfPam) {
  static_assert(std::size(CODES) == _PAM_RETURN_VALUES);
  for (const NamedCode& code : CODES) {
    EXPECT_EQ(NameOf(static_cast<ReturnCode>(code.number)), code.name);
    EXPECT_EQ(ReturnCodeOf(code.name), static_cast<ReturnCode>(code.number));
    EXPECT_TRUE(IsKnown(static_cast<ReturnCode>(code.number)));
  }
}

TEST(ReturnCodeTest, NamesOfTheHeaderAreTakenToo) {
  EXPECT_EQ(ReturnCodeOf("PAM_AUTH_ERR"), ReturnCode::AuthenticationError);
}

TEST(ReturnCodeTest, OtherNumbersHaveNoName) {
  for (int number : {-1, 32, 1000}) {
    EXPECT_FALSE(IsKnown(static_cast<ReturnCode>(number)));
    EXPECT_EQ(NameOf(static_cast<ReturnCode>(number)), std::to_string(number));
  }
  EXPECT_EQ(ReturnCodeOf("auth_error"), std::nullopt);
  EXPECT_EQ(ReturnCodeOf(""), std::nullopt);
}

}  // namespace

}  // namespace velmorctltest
