// The status numbers of the protocol, and the exception that carries one.
#ifndef CAMD_COMMON_STATUS_H
#define CAMD_COMMON_STATUS_H

#include <cstdint>
#include <string>

#include "velmor/failure.h"

namespace camd {

// Windows system error numbers; docs/cam-protocol.md says when each is given.
enum Status : uint32_t {
  kSuccess = 0,
  kAccessDenied = 5,
  kNotEnoughMemory = 8,
  kNotSupported = 50,
  kInvalidParameter = 87,
  kBusy = 170,
  kInvalidContainer = 267,
  kAlreadyUnderWay = 1061,
  kHelperDied = 1067,
  kNotFound = 1168,
  kInvalidComputerName = 1210,
  kNoLogonServers = 1311,
  kLogonFailure = 1326,
  kInternalError = 1359,
  kTimeSkew = 1398,
  kTimeout = 1460,
  kServiceLogonFailed = 1069,
  kQuotaExceeded = 1816,
  kAccountExists = 2224,
  kAccountInUse = 2404,
};

using velmor::Failure;

// The system's text for an error number. Safe on any thread.
std::string ErrorText(int errorNumber);

}  // namespace camd

#endif  // CAMD_COMMON_STATUS_H
