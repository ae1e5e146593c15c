/// The account of a join or leave.
#ifndef VELMORCTL_ACCOUNT_H
#define VELMORCTL_ACCOUNT_H

#include <string>

#include "authentication/directory_records.h"
#include "secret.h"

namespace velmorctl {

/// Held by shared pointer by everything that may still use it when the command is cut short, so that the
/// password is wiped after its last use and never during it.
struct Account {
  std::string userName;
  Secret password;

  /// Valid as long as this object.
  ::Credentials AsCredentials() const { return {userName.c_str(), password.Text()}; }
};

}  // namespace velmorctl

#endif  // VELMORCTL_ACCOUNT_H
