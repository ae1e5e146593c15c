/// The failures that a provider plug-in reports as status codes. The codes are those of the Windows system,
/// network-management and socket errors, in whose numbering plug-ins report; the texts are this library's.
#ifndef AUTHENTICATION_PROVIDER_EXCEPTIONS_H
#define AUTHENTICATION_PROVIDER_EXCEPTIONS_H

#include "authentication/exception.h"

namespace quenix::authentication {

/// 2: The system cannot find the file specified.
class VELMOR_EXPORT FileNotFoundException : public Exception {
 public:
  FileNotFoundException();
  VELMOR_EXCEPTION_OPERATIONS(FileNotFoundException)
};

/// 5: Access is denied.
class VELMOR_EXPORT AccessDeniedException : public Exception {
 public:
  AccessDeniedException();
  VELMOR_EXCEPTION_OPERATIONS(AccessDeniedException)
};

/// 8: Not enough memory.
class VELMOR_EXPORT NotEnoughMemoryException : public Exception {
 public:
  NotEnoughMemoryException();
  VELMOR_EXCEPTION_OPERATIONS(NotEnoughMemoryException)
};

/// 86: The specified network password is not correct.
class VELMOR_EXPORT InvalidPasswordException : public Exception {
 public:
  InvalidPasswordException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidPasswordException)
};

/// 87: The parameter is incorrect.
class VELMOR_EXPORT InvalidParameterException : public Exception {
 public:
  InvalidParameterException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidParameterException)
};

/// 120: This function is not supported on this system.
class VELMOR_EXPORT CallNotImplementedException : public Exception {
 public:
  CallNotImplementedException();
  VELMOR_EXCEPTION_OPERATIONS(CallNotImplementedException)
};

/// 267: The directory name is invalid.
class VELMOR_EXPORT DirectoryException : public Exception {
 public:
  DirectoryException();
  VELMOR_EXCEPTION_OPERATIONS(DirectoryException)
};

/// 609: Bad DLL entry point.
class VELMOR_EXPORT BadDLLEntryPointException : public Exception {
 public:
  BadDLLEntryPointException();
  VELMOR_EXCEPTION_OPERATIONS(BadDLLEntryPointException)
};

/// 1002: The window cannot act on the sent message.
class VELMOR_EXPORT InvalidMessageException : public Exception {
 public:
  InvalidMessageException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidMessageException)
};

/// 1060: The specified service does not exist as an installed service.
class VELMOR_EXPORT ServiceDoesNotExistException : public Exception {
 public:
  ServiceDoesNotExistException();
  VELMOR_EXCEPTION_OPERATIONS(ServiceDoesNotExistException)
};

/// 1061: The service cannot accept control messages at this time.
class VELMOR_EXPORT ServiceCannotAcceptControlException : public Exception {
 public:
  ServiceCannotAcceptControlException();
  VELMOR_EXCEPTION_OPERATIONS(ServiceCannotAcceptControlException)
};

/// 1062: The service has not been started.
class VELMOR_EXPORT ServiceNotActiveException : public Exception {
 public:
  ServiceNotActiveException();
  VELMOR_EXCEPTION_OPERATIONS(ServiceNotActiveException)
};

/// 1064: An exception occurred in the service when handling the control request.
class VELMOR_EXPORT ExceptionInServiceException : public Exception {
 public:
  ExceptionInServiceException();
  VELMOR_EXCEPTION_OPERATIONS(ExceptionInServiceException)
};

/// 1067: The process terminated unexpectedly.
class VELMOR_EXPORT ProcessAbortedException : public Exception {
 public:
  ProcessAbortedException();
  VELMOR_EXCEPTION_OPERATIONS(ProcessAbortedException)
};

/// 1201: The device is not currently connected but it is a remembered connection.
class VELMOR_EXPORT ConnectionUnavailableException : public Exception {
 public:
  ConnectionUnavailableException();
  VELMOR_EXCEPTION_OPERATIONS(ConnectionUnavailableException)
};

/// 1209: The format of the specified group name is invalid.
class VELMOR_EXPORT InvalidGroupNameException : public Exception {
 public:
  InvalidGroupNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidGroupNameException)
};

/// 1210: The format of the specified computer name is invalid.
class VELMOR_EXPORT InvalidComputerNameException : public Exception {
 public:
  InvalidComputerNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidComputerNameException)
};

/// 1212: The format of the specified domain name is invalid.
class VELMOR_EXPORT InvalidDomainNameException : public Exception {
 public:
  InvalidDomainNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidDomainNameException)
};

/// 1213: The format of the specified service name is invalid.
class VELMOR_EXPORT InvalidServiceNameException : public Exception {
 public:
  InvalidServiceNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidServiceNameException)
};

/// 1214: The format of the specified network name is invalid.
class VELMOR_EXPORT InvalidNetNameException : public Exception {
 public:
  InvalidNetNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidNetNameException)
};

/// 1215: The format of the specified share name is invalid.
class VELMOR_EXPORT InvalidShareNameException : public Exception {
 public:
  InvalidShareNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidShareNameException)
};

/// 1216: The format of the specified password is invalid.
class VELMOR_EXPORT InvalidPasswordNameException : public Exception {
 public:
  InvalidPasswordNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidPasswordNameException)
};

/// 1222: The network is not present or not started.
class VELMOR_EXPORT NoNetworkException : public Exception {
 public:
  NoNetworkException();
  VELMOR_EXCEPTION_OPERATIONS(NoNetworkException)
};

/// 1225: The remote computer refused the network connection.
class VELMOR_EXPORT ConnectionRefusedException : public Exception {
 public:
  ConnectionRefusedException();
  VELMOR_EXCEPTION_OPERATIONS(ConnectionRefusedException)
};

/// 1229: An operation was attempted on a nonexistent network connection.
class VELMOR_EXPORT ConnectionInvalidException : public Exception {
 public:
  ConnectionInvalidException();
  VELMOR_EXCEPTION_OPERATIONS(ConnectionInvalidException)
};

/// 1311: There are currently no logon servers available to service the logon request.
class VELMOR_EXPORT NoLogonServersException : public Exception {
 public:
  NoLogonServersException();
  VELMOR_EXCEPTION_OPERATIONS(NoLogonServersException)
};

/// 1315: The name provided is not a properly formed account name.
class VELMOR_EXPORT InvalidAccountNameException : public Exception {
 public:
  InvalidAccountNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidAccountNameException)
};

/// 1317: The specified account does not exist.
class VELMOR_EXPORT NoSuchUserException : public Exception {
 public:
  NoSuchUserException();
  VELMOR_EXCEPTION_OPERATIONS(NoSuchUserException)
};

/// 1324: The value provided for the new password contains values that are not allowed in passwords.
class VELMOR_EXPORT IllFormedPasswordException : public Exception {
 public:
  IllFormedPasswordException();
  VELMOR_EXCEPTION_OPERATIONS(IllFormedPasswordException)
};

/// 1325: The value provided for the new password does not meet the length, complexity, or history
/// requirements of the domain.
class VELMOR_EXPORT PasswordRestrictionException : public Exception {
 public:
  PasswordRestrictionException();
  VELMOR_EXCEPTION_OPERATIONS(PasswordRestrictionException)
};

/// 1326: The attempted logon is invalid. This is due to either a bad user name or authentication
/// information.
class VELMOR_EXPORT LogonFailureException : public Exception {
 public:
  LogonFailureException();
  VELMOR_EXCEPTION_OPERATIONS(LogonFailureException)
};

/// 1330: Logon failure: the specified account password has expired.
class VELMOR_EXPORT PasswordExpiredException : public Exception {
 public:
  PasswordExpiredException();
  VELMOR_EXCEPTION_OPERATIONS(PasswordExpiredException)
};

/// 1331: Logon failure: account currently disabled.
class VELMOR_EXPORT AccountDisabledException : public Exception {
 public:
  AccountDisabledException();
  VELMOR_EXCEPTION_OPERATIONS(AccountDisabledException)
};

/// 1355: The specified domain either does not exist or could not be contacted.
class VELMOR_EXPORT NoSuchDomainException : public Exception {
 public:
  NoSuchDomainException();
  VELMOR_EXCEPTION_OPERATIONS(NoSuchDomainException)
};

/// 1359: An internal error occurred.
class VELMOR_EXPORT InternalErrorException : public Exception {
 public:
  InternalErrorException();
  VELMOR_EXCEPTION_OPERATIONS(InternalErrorException)
};

/// 1398: There is a time and/or date difference between the client and server.
class VELMOR_EXPORT TimeSkewException : public Exception {
 public:
  TimeSkewException();
  VELMOR_EXCEPTION_OPERATIONS(TimeSkewException)
};

/// 1575: The specified group does not exist.
class VELMOR_EXPORT NoSuchGroupException : public Exception {
 public:
  NoSuchGroupException();
  VELMOR_EXCEPTION_OPERATIONS(NoSuchGroupException)
};

/// 1703: The RPC protocol sequence is not supported.
class VELMOR_EXPORT RPCSProtocolSequenceNotSupportedException : public Exception {
 public:
  RPCSProtocolSequenceNotSupportedException();
  VELMOR_EXCEPTION_OPERATIONS(RPCSProtocolSequenceNotSupportedException)
};

/// 1786: The workstation does not have a trust secret.
class VELMOR_EXPORT NoTrustLSASecretException : public Exception {
 public:
  NoTrustLSASecretException();
  VELMOR_EXCEPTION_OPERATIONS(NoTrustLSASecretException)
};

/// 1787: The domain controller does not have an account for this workstation.
class VELMOR_EXPORT NoTrustSAMAccountException : public Exception {
 public:
  NoTrustSAMAccountException();
  VELMOR_EXCEPTION_OPERATIONS(NoTrustSAMAccountException)
};

/// 1791: A remote procedure call is already in progress for this thread.
class VELMOR_EXPORT RPCSCallInProgressException : public Exception {
 public:
  RPCSCallInProgressException();
  VELMOR_EXCEPTION_OPERATIONS(RPCSCallInProgressException)
};

/// 1810: The name or security ID (SID) of the domain specified is inconsistent with the trust information
/// for that domain.
class VELMOR_EXPORT DomainTrustInconsistentException : public Exception {
 public:
  DomainTrustInconsistentException();
  VELMOR_EXCEPTION_OPERATIONS(DomainTrustInconsistentException)
};

/// 2138: The Workstation service has not been started.
class VELMOR_EXPORT WkstaNotStartedException : public Exception {
 public:
  WkstaNotStartedException();
  VELMOR_EXCEPTION_OPERATIONS(WkstaNotStartedException)
};

/// 2691: This machine is already joined to a domain.
class VELMOR_EXPORT SetupAlreadyJoinedException : public Exception {
 public:
  SetupAlreadyJoinedException();
  VELMOR_EXCEPTION_OPERATIONS(SetupAlreadyJoinedException)
};

/// 2695: The specified workgroup name is invalid.
class VELMOR_EXPORT InvalidWorkgroupNameException : public Exception {
 public:
  InvalidWorkgroupNameException();
  VELMOR_EXCEPTION_OPERATIONS(InvalidWorkgroupNameException)
};

/// 10060: A connection attempt failed because the connected party did not properly respond after a period
/// of time, or established connection failed because connected host has failed to respond.
class VELMOR_EXPORT WSATimedOutException : public Exception {
 public:
  WSATimedOutException();
  VELMOR_EXCEPTION_OPERATIONS(WSATimedOutException)
};

/// A code that has no class of its own; Code() gives it.
class VELMOR_EXPORT UnknownException : public Exception {
 public:
  explicit UnknownException(unsigned long code);
  VELMOR_EXCEPTION_OPERATIONS(UnknownException)
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_PROVIDER_EXCEPTIONS_H
