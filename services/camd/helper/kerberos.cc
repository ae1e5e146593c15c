#include "helper/kerberos.h"

#include <krb5/krb5.h>

#include "common/status.h"
#include "velmor/kerberos.h"

namespace camd {
namespace {

uint32_t StatusOf(krb5_error_code error) {
  switch (error) {
    case KRB5KDC_ERR_PREAUTH_FAILED:
    case KRB5KRB_AP_ERR_BAD_INTEGRITY:
    case KRB5_PREAUTH_FAILED:
    case KRB5KDC_ERR_C_PRINCIPAL_UNKNOWN:
    case KRB5KDC_ERR_CLIENT_REVOKED:
    case KRB5KDC_ERR_NAME_EXP:
    case KRB5KDC_ERR_KEY_EXP:
    case KRB5KDC_ERR_POLICY:
      return kServiceLogonFailed;
    case KRB5KRB_AP_ERR_SKEW:
    case KRB5_KDCREP_SKEW:
      return kTimeSkew;
    case KRB5_KDC_UNREACH:
    case KRB5_REALM_UNKNOWN:
    case KRB5_REALM_CANT_RESOLVE:
      return kNoLogonServers;
    default:
      return kInternalError;
  }
}

}  // namespace

void LogOn(const std::string& realm, const std::string& user, const Secret& password) {
  try {
    velmor::LogOn(realm, user, velmor::NameForm::OfTheRealm, password);
  } catch (const velmor::KerberosError& error) {
    throw Failure(StatusOf(error.Code()),
                  std::string("the service's account cannot log on: ") + error.what());
  }
}

}  // namespace camd
