/// The PAM policies and modules of a system, below its root folder.
#ifndef VELMORCTL_PAM_POLICY_ROOT_H
#define VELMORCTL_PAM_POLICY_ROOT_H

#include <set>
#include <string>
#include <vector>

#include "file_problem.h"
#include "pam/check.h"
#include "pam/person.h"
#include "pam/policy_files.h"
#include "pam/stack.h"
#include "system_file/root_folder.h"
#include "system_file/snapshot.h"

namespace velmorctl::pam {

/// What the inspection of a file says to the reader of a policy.
FileReading ReadingOf(const SnapshotInspection& inspection);

/// For one thread; what it hands out refers to it.
class PolicyRoot {
 public:
  explicit PolicyRoot(RootFolder root);

  /// The names of the services, in ascending order, without what packages and editors leave beside them
  /// (names with ".dpkg-" or ".ucf-", or that begin with "." or end in "~") and without those of
  /// FilesWithCapitals(). Throws Failure (Configuration) when there is no folder of policies, or it cannot be
  /// read.
  std::vector<std::string> Services() const;

  /// The files that look like those of services and have capitals in their names, by their paths in ascending
  /// order. libpam takes the name of a service in lower case, so only an include opens them. Throws what
  /// Services() throws.
  std::vector<std::string> FilesWithCapitals() const;

  /// Reads a policy file.
  FileReading Read(const std::string& path) const;

  /// Whether the module, as a policy names it, is there. A root without any folder of modules is taken to
  /// have them all.
  bool HasModule(const std::string& module) const;

  bool HasFile(const std::string& path) const;

  /// The system as CheckService() takes it. The provider's module counts as one of the directory, if there
  /// is a provider that can be used.
  CheckedSystem System() const;

  /// The stacks of the service. Throws Failure: Usage when the name can be no service's, Configuration when
  /// there is no such service, and Configuration or NeedsRoot when its file cannot be read.
  Policy Resolve(const std::string& service) const;

  /// The stacks of one of Services(); a file that cannot be read is a finding.
  Policy ResolveListed(const std::string& service) const;

  Person FindUser(const std::string& name) const;

  /// The finding with its file as messages show it.
  FileProblem Shown(const Finding& finding) const;
  std::string Shown(const std::string& file) const { return root_.Shown(file); }

 private:
  std::set<std::string> Files() const;
  std::set<std::string> DirectoryModules() const;

  RootFolder root_;
  std::vector<std::string> moduleFolders_;
};

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_POLICY_ROOT_H
