/// Whether joins through the CAM proxy verify the server's certificate.
#ifndef STORES_VERIFY_CERTIFICATE_OPTION_H
#define STORES_VERIFY_CERTIFICATE_OPTION_H

namespace quenix::authentication {

/// The host's advanced option "UserVars.ActiveDirectoryVerifyCAMCertificate". Throws
/// InvalidVerifyCAMCertificateOptionException when the host has no such option or its value is neither 0
/// nor 1.
bool MustVerifyCAMCertificate();

}  // namespace quenix::authentication

#endif  // STORES_VERIFY_CERTIFICATE_OPTION_H
