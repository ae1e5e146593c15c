/// The files in which policies are written, whatever libpam makes of them.
#ifndef VELMORCTL_PAM_EDIT_WRITTEN_POLICIES_H
#define VELMORCTL_PAM_EDIT_WRITTEN_POLICIES_H

#include <map>
#include <string>
#include <vector>

#include "pam/policy_files.h"

namespace velmorctl::pam {

/// By the names of files.
struct WrittenPolicies {
  std::map<std::string, std::string> contents;
  std::map<std::string, std::string> unreadable;  /// and why
};

/// Reads the files, and those that their lines name to be included, directly or by others. libpam may come to
/// less: it refuses a policy as a whole, and passes over a file that another one hides.
WrittenPolicies ReadWrittenPolicies(std::vector<std::string> files, const FileReader& read);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_WRITTEN_POLICIES_H
