#ifndef PLATFORM_KERNCTL_HOSTS_LINES_H
#define PLATFORM_KERNCTL_HOSTS_LINES_H

#include <string>
#include <vector>

#include "system/text_lines.h"

namespace KernCtl::Network {

/// An entry of a hosts file.
struct HostsEntry {
  std::string address;
  /// The canonical name, then the aliases.
  std::vector<std::string> names;
};

/// Makes the lines hold exactly one entry for the entry's address, with its names, where the resolver finds
/// it first for each of them. Returns whether anything had to be changed.
bool PutEntry(HostMgmt::System::TextLines* lines, const HostsEntry& entry);

}  // namespace KernCtl::Network

#endif
