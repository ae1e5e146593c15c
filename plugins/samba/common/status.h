/// The status codes that this provider gives out, and what an operation came to.
#ifndef SAMBA_COMMON_STATUS_H
#define SAMBA_COMMON_STATUS_H

#include <cstdint>
#include <string>

#include "velmor/failure.h"

namespace sambaprovider {

/// Codes of the Windows system and network-management errors; docs/samba-provider.md says when each is given.
enum Status : uint32_t {
  kSuccess = 0,
  kAccessDenied = 5,
  kNotEnoughMemory = 8,
  kInvalidPassword = 86,
  kInvalidParameter = 87,
  kInvalidOrganizationalUnit = 267,
  kBlobForAnotherHost = 1003,
  kServiceNotInstalled = 1060,
  kBusy = 1061,
  kServiceNotActive = 1062,
  kHostConfigurationInTheWay = 1064,
  kHelperDied = 1067,
  kInvalidComputerName = 1210,
  kInvalidDomainName = 1212,
  kCancelled = 1223,
  kNoLogonServers = 1311,
  kInvalidAccountName = 1315,
  kNoSuchUser = 1317,
  kLogonFailure = 1326,
  kPasswordExpired = 1330,
  kAccountDisabled = 1331,
  kNoSuchDomain = 1355,
  kInternalError = 1359,
  kTimeSkew = 1398,
  kAccountExists = 2224,
  kAlreadyJoined = 2691,
  kNotJoined = 2692,
  kTimedOut = 10060,
};

using velmor::Failure;

/// What an operation came to.
struct Outcome {
  uint32_t status = kSuccess;
  std::string text;
};

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_STATUS_H
