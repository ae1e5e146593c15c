/// Code, class and text of every failure that a provider's status stands for.
#ifndef ERRORS_PROVIDER_EXCEPTION_ROWS_H
#define ERRORS_PROVIDER_EXCEPTION_ROWS_H

// clang-format off
#define VELMOR_PROVIDER_EXCEPTION_ROWS(X) \
  X(2, FileNotFoundException, "The system cannot find the file specified.") \
  X(5, AccessDeniedException, "Access is denied.") \
  X(8, NotEnoughMemoryException, "Not enough memory") \
  X(86, InvalidPasswordException, "The specified network password is not correct.") \
  X(87, InvalidParameterException, "The parameter is incorrect.") \
  X(120, CallNotImplementedException, "This function is not supported on this system.") \
  X(267, DirectoryException, "The directory name is invalid.") \
  X(609, BadDLLEntryPointException, "Bad DLL entry point.") \
  X(1002, InvalidMessageException, "The window cannot act on the sent message.") \
  X(1060, ServiceDoesNotExistException, "The specified service does not exist as an installed service.") \
  X(1061, ServiceCannotAcceptControlException, "The service cannot accept control messages at this time.") \
  X(1062, ServiceNotActiveException, "The service has not been started.") \
  X(1064, ExceptionInServiceException, "An exception occurred in the service when handling the control request.") \
  X(1067, ProcessAbortedException, "The process terminated unexpectedly.") \
  X(1201, ConnectionUnavailableException, "The device is not currently connected but it is a remembered connection.") \
  X(1209, InvalidGroupNameException, "The format of the specified group name is invalid.") \
  X(1210, InvalidComputerNameException, "The format of the specified computer name is invalid.") \
  X(1212, InvalidDomainNameException, "The format of the specified domain name is invalid.") \
  X(1213, InvalidServiceNameException, "The format of the specified service name is invalid.") \
  X(1214, InvalidNetNameException, "The format of the specified network name is invalid.") \
  X(1215, InvalidShareNameException, "The format of the specified share name is invalid.") \
  X(1216, InvalidPasswordNameException, "The format of the specified password is invalid.") \
  X(1222, NoNetworkException, "The network is not present or not started.") \
  X(1225, ConnectionRefusedException, "The remote computer refused the network connection.") \
  X(1229, ConnectionInvalidException, "An operation was attempted on a nonexistent network connection.") \
  X(1311, NoLogonServersException, "There are currently no logon servers available to service the logon request.") \
  X(1315, InvalidAccountNameException, "The name provided is not a properly formed account name.") \
  X(1317, NoSuchUserException, "The specified account does not exist.") \
  X(1324, IllFormedPasswordException, "The value provided for the new password contains values that are not allowed in passwords.") \
  X(1325, PasswordRestrictionException, "The value provided for the new password does not meet the length, complexity, or history requirements of the domain.") \
  X(1326, LogonFailureException, "The attempted logon is invalid. This is due to either a bad user name or authentication information.") \
  X(1330, PasswordExpiredException, "Logon failure: the specified account password has expired.") \
  X(1331, AccountDisabledException, "Logon failure: account currently disabled.") \
  X(1355, NoSuchDomainException, "The specified domain either does not exist or could not be contacted.") \
  X(1359, InternalErrorException, "An internal error occurred.") \
  X(1398, TimeSkewException, "There is a time and/or date difference between the client and server.") \
  X(1575, NoSuchGroupException, "The specified group does not exist.") \
  X(1703, RPCSProtocolSequenceNotSupportedException, "The RPC protocol sequence is not supported.") \
  X(1786, NoTrustLSASecretException, "The workstation does not have a trust secret.") \
  X(1787, NoTrustSAMAccountException, "The domain controller does not have an account for this workstation.") \
  X(1791, RPCSCallInProgressException, "A remote procedure call is already in progress for this thread.") \
  X(1810, DomainTrustInconsistentException, "The name or security ID (SID) of the domain specified is inconsistent with the trust information for that domain.") \
  X(2138, WkstaNotStartedException, "The Workstation service has not been started.") \
  X(2691, SetupAlreadyJoinedException, "This machine is already joined to a domain.") \
  X(2695, InvalidWorkgroupNameException, "The specified workgroup name is invalid.") \
  X(10060, WSATimedOutException, "A connection attempt failed because the connected party did not properly respond after a period of time, or established connection failed because connected host has failed to respond.")
// clang-format on

#endif  // ERRORS_PROVIDER_EXCEPTION_ROWS_H
