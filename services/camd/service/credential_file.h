// Files that hold a secret.
#ifndef CAMD_SERVICE_CREDENTIAL_FILE_H
#define CAMD_SERVICE_CREDENTIAL_FILE_H

#include <string>

#include "common/secret.h"

namespace camd {

// Reads a secret from a file, without the line end that may close it. A name without a slash is that of a
// credential that systemd handed over ($CREDENTIALS_DIRECTORY). Any other file must belong to this user or to
// root and must be open to its owner only. Throws Failure (kInternalError) that names the file and the fault.
Secret ReadCredentialFile(const std::string& name);

// Whether the name is that of a credential and this process has none: systemd hands them over to the service
// only, not to an administrator who starts the same program.
bool IsOutOfReach(const std::string& name);

// Reads a file in which nothing is secret, such as a certificate; the name may stand for a credential all the
// same. Throws Failure (kInternalError).
Secret ReadPublicFile(const std::string& name);

}  // namespace camd

#endif  // CAMD_SERVICE_CREDENTIAL_FILE_H
