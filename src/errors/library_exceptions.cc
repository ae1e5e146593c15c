#include "authentication/library_exceptions.h"

#include "errors/exception_operations.h"

namespace quenix::authentication {

ProviderCallTimedOutException::ProviderCallTimedOutException() : Exception("Provider call timed out.") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(ProviderCallTimedOutException)

ThreadErrorException::ThreadErrorException(const std::string& detail)
    : Exception("Thread Error: " + detail) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(ThreadErrorException)

ConfigurationError::ConfigurationError(const std::string& text) : Exception(text) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(ConfigurationError)

IOError::IOError(const std::string& text) : Exception(text) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(IOError)

FilePermissionError::FilePermissionError(const std::string& text) : Exception(text) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(FilePermissionError)

InvalidKeyException::InvalidKeyException(const std::string& key)
    : Exception("The specified key '" + key + "' was not found in this configuration") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidKeyException)

UnknownRemoteAuthenticationStoreException::UnknownRemoteAuthenticationStoreException(const std::string& name)
    : Exception("The specified store '" + name + "' is unknown") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(UnknownRemoteAuthenticationStoreException)

InvalidRemoteAuthenticationStoreException::InvalidRemoteAuthenticationStoreException(const std::string& name)
    : Exception("The specified store '" + name + "' is invalid") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidRemoteAuthenticationStoreException)

InvalidActiveDirectoryProviderException::InvalidActiveDirectoryProviderException(const std::string& name)
    : Exception("The specified Active Directory provider '" + name + "' is invalid") {}
InvalidActiveDirectoryProviderException::InvalidActiveDirectoryProviderException(const std::string& name,
                                                                                 const std::string& reason)
    : Exception("The specified Active Directory provider '" + name + "' is invalid: " + reason) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidActiveDirectoryProviderException)

InvalidCAMProxyProviderException::InvalidCAMProxyProviderException(const std::string& name)
    : Exception("The specified CAMProxy provider '" + name + "' is invalid") {}
InvalidCAMProxyProviderException::InvalidCAMProxyProviderException(const std::string& name,
                                                                   const std::string& reason)
    : Exception("The specified CAMProxy provider '" + name + "' is invalid: " + reason) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidCAMProxyProviderException)

InvalidThumbprintStoreException::InvalidThumbprintStoreException(const std::string& name)
    : Exception("The specified thumbprint store '" + name + "' is invalid") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidThumbprintStoreException)

InvalidHostNameException::InvalidHostNameException(const std::string& detail)
    : Exception("The current hostname is invalid: " + detail) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidHostNameException)

InvalidCredentialsException::InvalidCredentialsException(const std::string& detail)
    : Exception("The credentials that were provided were invalid: " + detail) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidCredentialsException)

InvalidIPAddressException::InvalidIPAddressException(const std::string& detail)
    : Exception("The IP Address is invalid: " + detail) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidIPAddressException)

InvalidVerifyCAMCertificateOptionException::InvalidVerifyCAMCertificateOptionException(
    const std::string& detail)
    : Exception("The VerifyCAMCertificate option is invalid: " + detail) {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidVerifyCAMCertificateOptionException)

InvalidCertificateException::InvalidCertificateException()
    : Exception("The certificate format is invalid; only PEM format is supported.") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidCertificateException)

InvalidCAMCertificateException::InvalidCAMCertificateException()
    : Exception("The CAM server's certificate cannot be verified.") {}
VELMOR_DEFINE_EXCEPTION_OPERATIONS(InvalidCAMCertificateException)

}  // namespace quenix::authentication
