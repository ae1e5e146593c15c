/// A Debian system as far as its PAM policies go, in a folder of its own.
#ifndef PAM_EDIT_DEBIAN_ROOT_H
#define PAM_EDIT_DEBIAN_ROOT_H

#include <map>
#include <string>
#include <vector>

#include "support/files.h"
#include "velmorctl/program.h"

namespace velmorctltest {

/// The module that the scripted provider names, and its parameters.
inline const std::string DIRECTORY_MODULE = "pam_ctlscript";

/// The bytes, kind, mode and owner of every file below a folder, but for backups.
using Tree = std::map<std::string, std::string>;

/// A root with the provider's settings, the user "local", and a service "other" that refuses everybody.
class HostRoot {
 public:
  HostRoot();

  /// Without a slash at its end.
  const std::string& Path() const { return path_; }

  void Write(const std::string& name, const std::string& content) const;
  std::string Read(const std::string& name) const;
  Tree Files() const;

  /// Runs "velmorctl pam ARGUMENT... --root ROOT".
  Outcome Pam(std::vector<std::string> arguments) const;

  /// Whether "pam simulate" lets the user in.
  bool LetsIn(const std::string& service, const std::string& user, const std::string& directory,
              const std::vector<std::string>& answers = {}) const;

 private:
  testsupport::ScratchFolder scratch_;
  std::string path_;
};

/// The root with all policies of Debian's packages, the common-* files made by pam-auth-update.
class DebianRoot : public HostRoot {
 public:
  DebianRoot();

  /// Installs and enables the profiles of other directories and of pam_pwquality too.
  void AddOtherProfiles() const;

  /// Runs the real pam-auth-update on the root.
  void UpdateProfiles(const std::vector<std::string>& arguments) const;

  /// The services by the names of their files.
  std::vector<std::string> Services() const;
};

/// Everybody's answer of the directory's module in a simulation, for the option --answer.
std::string DirectoryAnswers(const std::string& facility, const std::string& answer);

/// While it lives, pam-auth-update is this script of the shell, which may call the real one as "$REAL".
class StandInForProfileTool {
 public:
  explicit StandInForProfileTool(const std::string& script);
  StandInForProfileTool(const StandInForProfileTool&) = delete;
  StandInForProfileTool& operator=(const StandInForProfileTool&) = delete;
  ~StandInForProfileTool();
};

}  // namespace velmorctltest

#endif  // PAM_EDIT_DEBIAN_ROOT_H
