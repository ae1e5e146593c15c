/// What PAM modules and libpam answer.
#ifndef VELMORCTL_PAM_RETURN_CODE_H
#define VELMORCTL_PAM_RETURN_CODE_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace velmorctl::pam {

/// The numbers of Linux-PAM. A module may answer any other number too; IsKnown() tells.
enum class ReturnCode : std::int32_t {
  Success = 0,
  OpenError,
  SymbolError,
  ServiceError,
  SystemError,
  BufferError,
  PermissionDenied,
  AuthenticationError,
  CredentialsInsufficient,
  AuthenticationInformationUnavailable,
  UserUnknown,
  MaximumTries,
  NewTokenRequired,
  AccountExpired,
  SessionError,
  CredentialsUnavailable,
  CredentialsExpired,
  CredentialsError,
  NoModuleData,
  ConversationError,
  TokenError,
  TokenRecoveryError,
  TokenLockBusy,
  TokenAgingDisabled,
  TryAgain,
  Ignore,
  Abort,
  TokenExpired,
  ModuleUnknown,
  BadItem,
  ConversationAgain,
  Incomplete
};

inline constexpr std::size_t returnCodeCount = 32;

/// Whether the number has a name.
bool IsKnown(ReturnCode code);

/// The name as bracketed controls use it, such as "auth_err"; the number when it has none.
std::string NameOf(ReturnCode code);

/// The code of the name, with or without "pam_" before it, whatever its case.
std::optional<ReturnCode> ReturnCodeOf(std::string_view name);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_RETURN_CODE_H
