#ifndef HOSTMGMT_HOST_H
#define HOSTMGMT_HOST_H

#include <cstdint>
#include <memory>
#include <string>

#include "hostmgmt/advanced_options.h"
#include "hostmgmt/export.h"

namespace HostMgmt {

/// The host that this process runs on. Keeps no state of its own: each operation works on the host's files
/// (the advanced options stand in /etc/quenix/options.conf), so any number of threads and processes may use
/// any number of these objects at once.
///
/// An option is named by its path, for example "UserVars.ActiveDirectoryVerifyCAMCertificate": branch names
/// and the option's own name, joined by dots. A name is made of letters, digits, "-" and "_".
class HOSTMGMT_EXPORT Host {
 public:
  Host();
  Host(const Host&) = delete;
  Host& operator=(const Host&) = delete;

  /// The tree of advanced options, read anew on each call; options that the file does not name have their
  /// defaults. Returns an empty reference when the host has no advanced option at all.
  /// Throws Lib::HostMgmtException, naming file, line and reason, when the file cannot be read or holds a
  /// line that is not an option.
  std::shared_ptr<const Adv::AdvancedOptionBranch> GetAdvancedOptions() const;

  /// Sets the option durably, as an integer option whatever it was before. Waits at most ten seconds for
  /// another process that is changing an option.
  /// Throws Lib::HostMgmtException when the path is not an option's path, or the file cannot be read or
  /// written; the file is then as it was.
  void SetIntegerOption(const std::string& path, std::int64_t value);

  /// As SetIntegerOption, for text. Text that holds control characters other than tab is refused.
  void SetStringOption(const std::string& path, const std::string& value);

  /// Forgets what was set: an option with a default has its default again, any other one is gone.
  /// Otherwise as SetIntegerOption.
  void ResetOption(const std::string& path);
};

/// Gives access to the host.
class HOSTMGMT_EXPORT HostFactory {
 public:
  /// The host that this process runs on; never an empty reference.
  static std::shared_ptr<Host> GetHost();
};

}  // namespace HostMgmt

#endif
