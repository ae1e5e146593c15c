/// What PAM modules answer in given circumstances.
#ifndef VELMORCTL_PAM_MODULE_ANSWER_H
#define VELMORCTL_PAM_MODULE_ANSWER_H

#include <functional>
#include <set>
#include <string>

#include "pam/person.h"
#include "pam/simulator.h"

namespace velmorctl::pam {

struct ModuleAnswer {
  ReturnCode code = ReturnCode::Success;
  std::string note;  /// what the answer rests on, where that is no matter of course
};

struct Circumstances {
  Person user;
  std::string service;
  bool directoryUp = true;
  bool rightPassword = true;
  std::set<std::string> directoryModules;                       /// by ModuleName()
  std::function<bool(const std::string& module)> moduleExists;  /// as a policy names it
  std::function<bool(const std::string& path)> fileExists;      /// below the root
};

/// Modules by which hosts commonly ask a directory.
std::set<std::string> CommonDirectoryModules();

/// Whether the module compares a password with one that it knows, or lets a directory do that.
bool AsksForPassword(const std::string& module, const std::set<std::string>& directoryModules);

/// What the module of the entry answers. The program is taken to be run by an ordinary user, and local
/// passwords to be neither expired nor empty. A module about which nothing is known succeeds, but refuses a
/// wrong password, and so does a test of pam_succeed_if that cannot be decided; the note says so.
ModuleAnswer AnswerOf(const StackEntry& entry, Operation operation, const Circumstances& circumstances);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_MODULE_ANSWER_H
