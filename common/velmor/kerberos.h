/// One Kerberos log-on with a password, in this process's memory only.
#ifndef VELMOR_KERBEROS_H
#define VELMOR_KERBEROS_H

#include <cstdint>
#include <stdexcept>
#include <string>

#include "velmor/secret.h"

namespace velmor {

/// A code of the Kerberos library, with the library's text for it.
class KerberosError : public std::runtime_error {
 public:
  KerberosError(int32_t code, const std::string& text) : std::runtime_error(text), code_(code) {}

  int32_t Code() const { return code_; }

 private:
  int32_t code_;
};

/// Makes the Kerberos and GSSAPI libraries of this process ask `controller` for the realm, or the ones that
/// DNS names where it is empty, and take host names as they are. The host's own krb5.conf still counts for
/// all else. Call it before any other use of them and before any thread is started, since it changes the
/// environment. Throws std::system_error.
void DirectKerberosTo(const std::string& realm, const std::string& controller);

enum class NameForm { OfTheRealm, Enterprise };

/// Asks once for a ticket for `user` in `realm` and keeps it where GSSAPI finds it, until the process ends.
/// An enterprise name ("user@domain") is left to the controller to understand. Blocks as long as the Kerberos
/// library does, some seconds for each controller. Throws KerberosError.
void LogOn(const std::string& realm, const std::string& user, NameForm form, const Secret& password);

}  // namespace velmor

#endif  // VELMOR_KERBEROS_H
