#ifndef KERNCTL_HOSTS_FILE_H
#define KERNCTL_HOSTS_FILE_H

#include <string>
#include <vector>

#include "hostmgmt/export.h"

namespace KernCtl::Network {

/// The host's hosts file, /etc/hosts, for editing. Any number of threads and processes may each use an
/// object of their own; their edits are done one after the other.
class HOSTMGMT_EXPORT HostsFile {
 public:
  /// Reads the file, so that one that cannot be read is known before anything is changed; a missing file
  /// counts as an empty one. Throws HostMgmt::Lib::HostMgmtException when it cannot be read.
  HostsFile();
  HostsFile(const HostsFile&) = delete;
  HostsFile& operator=(const HostsFile&) = delete;

  /// Makes the file hold exactly one entry for the address (IPv4 or IPv6), with that canonical name and
  /// those aliases, and stores it durably. Comments, other entries, their order, and the file's mode, owner
  /// and extended attributes stay. The entry takes the place of the first one of that address; when a line
  /// before that place gives one of the names to another address, the entry moves before that line, because
  /// the resolver takes the first. Works on the file as it is at the time of the call, and does not write
  /// it when there is nothing to change. Waits at most ten seconds for another process's edit.
  ///
  /// Throws HostMgmt::Lib::HostMgmtException when the address or a name is not one (a name is refused when
  /// it would be read as something else: blanks, "#", control characters, nothing at all), or when the file
  /// cannot be read or written; the file is then as it was.
  void AddOrReplaceEntry(const std::string& address, const std::string& canonicalName,
                         const std::vector<std::string>& aliases);
};

}  // namespace KernCtl::Network

#endif
