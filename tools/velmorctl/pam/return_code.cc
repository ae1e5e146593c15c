#include "pam/return_code.h"

#include <array>

#include "pam/facility.h"

namespace velmorctl::pam {

namespace {

constexpr std::array<std::string_view, returnCodeCount> names = {"success",
                                                                 "open_err",
                                                                 "symbol_err",
                                                                 "service_err",
                                                                 "system_err",
                                                                 "buf_err",
                                                                 "perm_denied",
                                                                 "auth_err",
                                                                 "cred_insufficient",
                                                                 "authinfo_unavail",
                                                                 "user_unknown",
                                                                 "maxtries",
                                                                 "new_authtok_reqd",
                                                                 "acct_expired",
                                                                 "session_err",
                                                                 "cred_unavail",
                                                                 "cred_expired",
                                                                 "cred_err",
                                                                 "no_module_data",
                                                                 "conv_err",
                                                                 "authtok_err",
                                                                 "authtok_recover_err",
                                                                 "authtok_lock_busy",
                                                                 "authtok_disable_aging",
                                                                 "try_again",
                                                                 "ignore",
                                                                 "abort",
                                                                 "authtok_expired",
                                                                 "module_unknown",
                                                                 "bad_item",
                                                                 "conv_again",
                                                                 "incomplete"};

}  // namespace

bool IsKnown(ReturnCode code) {
  auto number = static_cast<std::int32_t>(code);
  return number >= 0 && number < static_cast<std::int32_t>(returnCodeCount);
}

std::string NameOf(ReturnCode code) {
  return IsKnown(code) ? std::string(names[static_cast<std::size_t>(code)])
                       : std::to_string(static_cast<std::int32_t>(code));
}

std::optional<ReturnCode> ReturnCodeOf(std::string_view name) {
  constexpr std::string_view prefix = "pam_";
  if (name.size() > prefix.size() && SameWord(name.substr(0, prefix.size()), prefix)) {
    name.remove_prefix(prefix.size());
  }
  for (std::size_t number = 0; number < names.size(); ++number) {
    if (SameWord(names[number], name)) {
      return static_cast<ReturnCode>(number);
    }
  }
  return std::nullopt;
}

}  // namespace velmorctl::pam
