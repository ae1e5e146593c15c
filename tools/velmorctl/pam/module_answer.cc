#include "pam/module_answer.h"

#include <algorithm>
#include <array>
#include <optional>

#include "pam/succeed_if.h"

namespace velmorctl::pam {

namespace {

using Code = ReturnCode;

bool HasArgument(const StackEntry& entry, std::string_view argument) {
  return std::find(entry.arguments.begin(), entry.arguments.end(), argument) != entry.arguments.end();
}

/// The value of the argument NAME=VALUE.
std::string ArgumentValue(const StackEntry& entry, std::string_view name) {
  for (const std::string& argument : entry.arguments) {
    if (argument.starts_with(name) && argument.substr(name.size()).starts_with('=')) {
      return argument.substr(name.size() + 1);
    }
  }
  return "";
}

bool AuthenticatesUser(Operation operation) {
  return operation == Operation::Authenticate;
}

bool ChangesToken(Operation operation) {
  return FacilityFor(operation) == Facility::Password;
}

/// Whether the user can be looked up: a user of the directory cannot when it is down.
bool IsKnown(const Circumstances& circumstances) {
  return circumstances.user.local || circumstances.directoryUp;
}

ModuleAnswer Unix(const StackEntry&, Operation operation, const Circumstances& circumstances) {
  const Person& user = circumstances.user;
  if (!AuthenticatesUser(operation) && operation != Operation::ManageAccount && !ChangesToken(operation)) {
    return {};
  }
  if (!user.local) {
    bool account = operation == Operation::ManageAccount && circumstances.directoryUp;
    return {account ? Code::Success : Code::UserUnknown, "no local user"};
  }
  if (operation == Operation::ManageAccount) {
    return {};
  }
  if (AuthenticatesUser(operation) && user.locked) {
    return {Code::AuthenticationError, "the password is locked"};
  }
  bool refused = AuthenticatesUser(operation) && !circumstances.rightPassword;
  return {refused ? Code::AuthenticationError : Code::Success, "local user"};
}

ModuleAnswer Directory(const StackEntry& entry, Operation operation, const Circumstances& circumstances) {
  if (!circumstances.directoryUp) {
    bool ignored = HasArgument(entry, "ignore_authinfo_unavail");
    return {ignored ? Code::Ignore : Code::AuthenticationInformationUnavailable, "the directory is away"};
  }
  if (circumstances.user.local) {
    bool ignored = HasArgument(entry, "ignore_unknown_user");
    return {ignored ? Code::Ignore : Code::UserUnknown, "no user of the directory"};
  }
  bool refused = AuthenticatesUser(operation) && !circumstances.rightPassword;
  return {refused ? Code::AuthenticationError : Code::Success, "user of the directory"};
}

ModuleAnswer Deny(const StackEntry&, Operation operation, const Circumstances&) {
  constexpr std::array<Code, 7> answers = {
      Code::AuthenticationError, Code::CredentialsError, Code::AuthenticationError, Code::SessionError,
      Code::SessionError,        Code::TokenError,       Code::TokenError};
  return {answers[static_cast<std::size_t>(operation)], ""};
}

ModuleAnswer Permit(const StackEntry&, Operation, const Circumstances&) {
  return {};
}

ModuleAnswer RootOk(const StackEntry&, Operation operation, const Circumstances&) {
  if (operation == Operation::SetCredentials) {
    return {};
  }
  return {Code::AuthenticationError, "assumed: the program is not run by root"};
}

ModuleAnswer LocalUser(const StackEntry&, Operation operation, const Circumstances& circumstances) {
  if (operation == Operation::SetCredentials) {
    return {};
  }
  return {circumstances.user.local ? Code::Success : Code::PermissionDenied, ""};
}

ModuleAnswer SucceedIfTests(const StackEntry& entry, Operation operation,
                            const Circumstances& circumstances) {
  if (operation == Operation::SetCredentials) {
    return {Code::Ignore, ""};
  }
  return SucceedIf(entry.arguments, circumstances.user, circumstances.service, IsKnown(circumstances),
                   circumstances.rightPassword);
}

ModuleAnswer NoLogin(const StackEntry& entry, Operation operation, const Circumstances& circumstances) {
  Code free = HasArgument(entry, "successok") ? Code::Success : Code::Ignore;
  std::string named = ArgumentValue(entry, "file");
  std::vector<std::string> files = {"/var/run/nologin", "/etc/nologin"};
  if (!named.empty()) {
    files = {named};
  }
  auto found = std::find_if(files.begin(), files.end(), circumstances.fileExists);
  if (found == files.end() || operation == Operation::SetCredentials) {
    return {free, ""};
  }
  if (!IsKnown(circumstances)) {
    return {Code::UserUnknown, ""};
  }
  return {circumstances.user.uid == 0 ? Code::Success : Code::AuthenticationError, "there is " + *found};
}

/// Without a lock on the account, which only its own records tell.
ModuleAnswer FailLock(const StackEntry& entry, Operation operation, const Circumstances&) {
  bool countsFailure = HasArgument(entry, "authfail") && AuthenticatesUser(operation);
  return {countsFailure ? Code::AuthenticationError : Code::Success, "assumed: the account is not locked"};
}

ModuleAnswer NeverJudges(const StackEntry&, Operation, const Circumstances&) {
  return {Code::Ignore, ""};
}

ModuleAnswer Unknown(const StackEntry&, Operation operation, const Circumstances& circumstances) {
  bool refused = AuthenticatesUser(operation) && !circumstances.rightPassword;
  return refused ? ModuleAnswer{Code::AuthenticationError, "assumed: it refuses"}
                 : ModuleAnswer{Code::Success, "assumed: it succeeds"};
}

struct KnownModule {
  std::string_view name;
  ModuleAnswer (*answer)(const StackEntry&, Operation, const Circumstances&);
};

/// The modules with Permit set something up and judge nobody.
constexpr KnownModule knownModules[] = {{"pam_cap", Permit},
                                        {"pam_deny", Deny},
                                        {"pam_env", Permit},
                                        {"pam_faildelay", NeverJudges},
                                        {"pam_faillock", FailLock},
                                        {"pam_issue", Permit},
                                        {"pam_keyinit", Permit},
                                        {"pam_lastlog", Permit},
                                        {"pam_limits", Permit},
                                        {"pam_localuser", LocalUser},
                                        {"pam_loginuid", Permit},
                                        {"pam_mail", Permit},
                                        {"pam_mkhomedir", Permit},
                                        {"pam_motd", Permit},
                                        {"pam_nologin", NoLogin},
                                        {"pam_permit", Permit},
                                        {"pam_rootok", RootOk},
                                        {"pam_selinux", Permit},
                                        {"pam_succeed_if", SucceedIfTests},
                                        {"pam_systemd", Permit},
                                        {"pam_umask", Permit},
                                        {"pam_unix", Unix},
                                        {"pam_warn", NeverJudges}};

}  // namespace

std::set<std::string> CommonDirectoryModules() {
  return {"pam_krb5", "pam_ldap", "pam_sss", "pam_winbind"};
}

bool AsksForPassword(const std::string& module, const std::set<std::string>& directoryModules) {
  std::string name = ModuleName(module);
  return name == "pam_unix" || directoryModules.contains(name);
}

ModuleAnswer AnswerOf(const StackEntry& entry, Operation operation, const Circumstances& circumstances) {
  if (!circumstances.moduleExists(entry.module)) {
    return {Code::ModuleUnknown, "the module does not exist"};
  }
  std::string name = ModuleName(entry.module);
  if (circumstances.directoryModules.contains(name)) {
    return Directory(entry, operation, circumstances);
  }
  for (const KnownModule& known : knownModules) {
    if (known.name == name) {
      return known.answer(entry, operation, circumstances);
    }
  }
  return Unknown(entry, operation, circumstances);
}

}  // namespace velmorctl::pam
