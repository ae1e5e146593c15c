/// The failures whose texts the library composes itself; their code is 0.
#ifndef AUTHENTICATION_LIBRARY_EXCEPTIONS_H
#define AUTHENTICATION_LIBRARY_EXCEPTIONS_H

#include <string>

#include "authentication/exception.h"

namespace quenix::authentication {

/// A provider call did not end within the time that its caller was willing to wait.
class VELMOR_EXPORT ProviderCallTimedOutException : public Exception {
 public:
  ProviderCallTimedOutException();
  VELMOR_EXCEPTION_OPERATIONS(ProviderCallTimedOutException)
};

/// A thread could not be started, or a timed wait failed.
class VELMOR_EXPORT ThreadErrorException : public Exception {
 public:
  explicit ThreadErrorException(const std::string& detail);
  VELMOR_EXCEPTION_OPERATIONS(ThreadErrorException)
};

/// A configuration file, or a record of the host configuration store, cannot be used as it is.
class VELMOR_EXPORT ConfigurationError : public Exception {
 public:
  explicit ConfigurationError(const std::string& text);
  VELMOR_EXCEPTION_OPERATIONS(ConfigurationError)
};

/// A file cannot be opened, written or renamed, or a plug-in cannot be loaded.
class VELMOR_EXPORT IOError : public Exception {
 public:
  explicit IOError(const std::string& text);
  VELMOR_EXCEPTION_OPERATIONS(IOError)
};

/// A file was replaced, but the permissions of the file before it could not be carried over.
class VELMOR_EXPORT FilePermissionError : public Exception {
 public:
  explicit FilePermissionError(const std::string& text);
  VELMOR_EXCEPTION_OPERATIONS(FilePermissionError)
};

/// A configuration has no such key.
class VELMOR_EXPORT InvalidKeyException : public Exception {
 public:
  explicit InvalidKeyException(const std::string& key);
  VELMOR_EXCEPTION_OPERATIONS(InvalidKeyException)
};

/// No store of that name is registered.
class VELMOR_EXPORT UnknownRemoteAuthenticationStoreException : public Exception {
 public:
  explicit UnknownRemoteAuthenticationStoreException(const std::string& name);
  VELMOR_EXCEPTION_OPERATIONS(UnknownRemoteAuthenticationStoreException)
};

/// The store of that name is not a remote authentication store.
class VELMOR_EXPORT InvalidRemoteAuthenticationStoreException : public Exception {
 public:
  explicit InvalidRemoteAuthenticationStoreException(const std::string& name);
  VELMOR_EXCEPTION_OPERATIONS(InvalidRemoteAuthenticationStoreException)
};

/// The Active Directory provider plug-in is missing or cannot be used.
class VELMOR_EXPORT InvalidActiveDirectoryProviderException : public Exception {
 public:
  explicit InvalidActiveDirectoryProviderException(const std::string& name);
  InvalidActiveDirectoryProviderException(const std::string& name, const std::string& reason);
  VELMOR_EXCEPTION_OPERATIONS(InvalidActiveDirectoryProviderException)
};

/// The CAM proxy plug-in is missing or cannot be used.
class VELMOR_EXPORT InvalidCAMProxyProviderException : public Exception {
 public:
  explicit InvalidCAMProxyProviderException(const std::string& name);
  InvalidCAMProxyProviderException(const std::string& name, const std::string& reason);
  VELMOR_EXCEPTION_OPERATIONS(InvalidCAMProxyProviderException)
};

/// The place where thumbprints are kept cannot be read.
class VELMOR_EXPORT InvalidThumbprintStoreException : public Exception {
 public:
  explicit InvalidThumbprintStoreException(const std::string& name);
  VELMOR_EXCEPTION_OPERATIONS(InvalidThumbprintStoreException)
};

/// The host's own name cannot be used as a computer name in the domain.
class VELMOR_EXPORT InvalidHostNameException : public Exception {
 public:
  explicit InvalidHostNameException(const std::string& detail);
  VELMOR_EXCEPTION_OPERATIONS(InvalidHostNameException)
};

/// The credentials of a join lack a user name or a password.
class VELMOR_EXPORT InvalidCredentialsException : public Exception {
 public:
  explicit InvalidCredentialsException(const std::string& detail);
  VELMOR_EXCEPTION_OPERATIONS(InvalidCredentialsException)
};

/// A text is not an IPv4 address.
class VELMOR_EXPORT InvalidIPAddressException : public Exception {
 public:
  explicit InvalidIPAddressException(const std::string& detail);
  VELMOR_EXCEPTION_OPERATIONS(InvalidIPAddressException)
};

/// The host's option that says whether to verify the CAM server's certificate is missing or has a value
/// that means nothing.
class VELMOR_EXPORT InvalidVerifyCAMCertificateOptionException : public Exception {
 public:
  explicit InvalidVerifyCAMCertificateOptionException(const std::string& detail);
  VELMOR_EXCEPTION_OPERATIONS(InvalidVerifyCAMCertificateOptionException)
};

/// A certificate is not in PEM form.
class VELMOR_EXPORT InvalidCertificateException : public Exception {
 public:
  InvalidCertificateException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidCertificateException)
};

/// The CAM server's certificate differs from the one that was imported.
class VELMOR_EXPORT InvalidCAMCertificateException : public Exception {
 public:
  InvalidCAMCertificateException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidCAMCertificateException)
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_LIBRARY_EXCEPTIONS_H
