#include "plugin/trust_mapping.h"

namespace sambaprovider {
namespace {

TrustState TrustStateOfNtStatus(uint32_t ntStatus) {
  switch (ntStatus) {
    case 0xC000018B:  // NO_TRUST_SAM_ACCOUNT: missing or disabled, the controller does not say which
    case 0xC0000064:  // NO_SUCH_USER
    case 0xC0000072:  // ACCOUNT_DISABLED
    case 0xC0000193:  // ACCOUNT_EXPIRED
      return TRUST_STATE_ACCOUNT_UNUSABLE;
    case 0xC0000022:  // ACCESS_DENIED: how a netlogon authentication with another password ends
    case 0xC000006A:  // WRONG_PASSWORD
    case 0xC000006D:  // LOGON_FAILURE
      return TRUST_STATE_WRONG_PASSWORD;
    case 0xC0000233:  // DOMAIN_CONTROLLER_NOT_FOUND
    case 0xC000005E:  // NO_LOGON_SERVERS
    case 0xC00000B5:  // IO_TIMEOUT
    case 0xC000023C:  // NETWORK_UNREACHABLE
    case 0xC000023D:  // HOST_UNREACHABLE
    case 0xC0000236:  // CONNECTION_REFUSED
      return TRUST_STATE_NO_DOMAIN_CONTROLLER;
    case 0xC00000C9:  // NETWORK_NAME_DELETED: winbindd's answer when the host's secrets are gone
    case 0xC00000DF:  // NO_SUCH_DOMAIN
      return TRUST_STATE_NOT_JOINED;
    default:
      return TRUST_STATE_BROKEN;
  }
}

}  // namespace

TrustState TrustStateOf(const winbind::TrustCheck& check, bool serviceRuns) {
  switch (check.error) {
    case WBC_ERR_SUCCESS:
      return TRUST_STATE_HEALTHY;
    case WBC_ERR_AUTH_ERROR:
      return TrustStateOfNtStatus(check.ntStatus);
    case WBC_ERR_WINBIND_NOT_AVAILABLE:
      return serviceRuns ? TRUST_STATE_NO_DOMAIN_CONTROLLER : TRUST_STATE_SERVICE_DOWN;
    case WBC_ERR_DOMAIN_NOT_FOUND:
      return TRUST_STATE_NOT_JOINED;
    default:
      return TRUST_STATE_BROKEN;
  }
}

TrustRelationship RelationshipOf(uint32_t trustFlags) {
  const bool inbound = (trustFlags & WBC_DOMINFO_TRUST_INCOMING) != 0;
  const bool outbound = (trustFlags & WBC_DOMINFO_TRUST_OUTGOING) != 0;
  if (inbound && outbound) return TRUST_RELATIONSHIP_TWO_WAY;
  if (inbound) return TRUST_RELATIONSHIP_INBOUND;
  return outbound ? TRUST_RELATIONSHIP_OUTBOUND : TRUST_RELATIONSHIP_NONE;
}

}  // namespace sambaprovider
