/// The calls of libnetapi that work for a member: made offline in two halves, and undone.
#ifndef SAMBA_HELPER_NETAPI_H
#define SAMBA_HELPER_NETAPI_H

#include <string>

#include "velmor/secret.h"

namespace sambaprovider::netapi {

/// libnetapi reads smb.conf at the first call and never again in this process. Every operation may block for
/// half a minute when the controller stops answering, and throws Failure with libnetapi's code and text.

/// Makes, or takes again, the computer account, and returns the text that the second half needs. The
/// organisational unit is a DN that exists, or empty.
velmor::Secret ProvisionAccount(const std::string& dnsDomain, const std::string& computer,
                                const std::string& organizationalUnitDn, const std::string& controller,
                                const std::string& user, const velmor::Secret& password);

/// Writes the machine's secrets on this host; needs no network. smb.conf must be that of a member already.
void StoreSecrets(const velmor::Secret& blob);

/// Disables the computer account and removes the machine's secrets from this host.
void Unjoin(const std::string& user, const velmor::Secret& password);

/// Removes the machine's secrets from this host; needs neither network nor account.
void UnjoinLocally();

}  // namespace sambaprovider::netapi

#endif  // SAMBA_HELPER_NETAPI_H
