#ifndef PLATFORM_SYSTEM_RESOLVE_LINKS_H
#define PLATFORM_SYSTEM_RESOLVE_LINKS_H

#include <string>

namespace HostMgmt::System {

/// Follows symbolic links at the end of the path as far as they lead: the result is a path that is no link,
/// whether or not something is there. Directories on the way may still be links.
/// Throws Lib::HostMgmtException "Unable to follow '<path>': <reason>", for a circle of links too.
std::string ResolveLinks(const std::string& path);

/// Where a symbolic link points: its absolute target without "." and ".." in it. Empty when there is no link
/// at the path.
std::string LinkTarget(const std::string& path);

/// The directory part of a path; "." when it has none.
std::string DirectoryOf(const std::string& path);

}  // namespace HostMgmt::System

#endif
