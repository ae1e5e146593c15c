#include "precheck/kerberos.h"

#include <krb5/krb5.h>

#include <cerrno>

#include "common/status.h"
#include "velmor/kerberos.h"

namespace sambaprovider {

uint32_t StatusOfKerberosError(int32_t error) {
  switch (error) {
    case KRB5KDC_ERR_PREAUTH_FAILED:
    case KRB5KRB_AP_ERR_BAD_INTEGRITY:
    case KRB5_PREAUTH_FAILED:
      return kInvalidPassword;
    case KRB5KDC_ERR_C_PRINCIPAL_UNKNOWN:
    case KRB5KDC_ERR_WRONG_REALM:
      return kNoSuchUser;
    case KRB5KDC_ERR_CLIENT_REVOKED:
    case KRB5KDC_ERR_NAME_EXP:
      return kAccountDisabled;
    case KRB5KDC_ERR_KEY_EXP:
      return kPasswordExpired;
    case KRB5KRB_AP_ERR_SKEW:
    case KRB5_KDCREP_SKEW:
      return kTimeSkew;
    case KRB5KDC_ERR_POLICY:
      return kAccessDenied;
    case KRB5_KDC_UNREACH:
    case KRB5_REALM_UNKNOWN:
    case KRB5_REALM_CANT_RESOLVE:
      return kNoLogonServers;
    case KRB5_PARSE_MALFORMED:
      return kInvalidAccountName;
    case ENOMEM:
      return kNotEnoughMemory;
    default:
      return kInternalError;
  }
}

void LogOn(const std::string& realm, const AccountName& account, const velmor::Secret& password) {
  // A name with a domain may belong to another realm; the controller resolves it, or refers us on.
  const bool named = !account.domain.empty() && !EqualWithoutCase(account.domain, realm);
  try {
    velmor::LogOn(realm, named ? account.user + "@" + account.domain : account.user,
                  named ? velmor::NameForm::Enterprise : velmor::NameForm::OfTheRealm, password);
  } catch (const velmor::KerberosError& error) {
    throw Failure(StatusOfKerberosError(error.Code()), error.what());
  }
}

}  // namespace sambaprovider
