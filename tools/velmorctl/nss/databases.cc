#include "nss/databases.h"

#include <algorithm>
#include <iterator>

namespace velmorctl {

namespace {

constexpr std::string_view libraryDatabases[] = {
    "aliases",    "ethers",   "group",    "group_compat", "gshadow",       "hosts",
    "initgroups", "netgroup", "networks", "passwd",       "passwd_compat", "protocols",
    "publickey",  "rpc",      "services", "shadow",       "shadow_compat"};

/// Read by the automounter, by boot servers, by network tools, by the tools of subordinate IDs, by sudo.
constexpr std::string_view otherDatabases[] = {"automount", "bootparams", "netmasks", "subid", "sudoers"};

constexpr std::string_view filesByDefault[] = {"aliases",   "ethers", "group",    "gshadow", "passwd",
                                               "protocols", "rpc",    "services", "shadow"};

constexpr std::string_view accountDatabases[] = {"passwd", "group", "shadow"};

template <class Names>
bool Contains(const Names& names, std::string_view name) {
  return std::find(std::begin(names), std::end(names), name) != std::end(names);
}

}  // namespace

bool IsLibraryDatabase(std::string_view name) {
  return Contains(libraryDatabases, name);
}

bool IsKnownDatabase(std::string_view name) {
  return IsLibraryDatabase(name) || Contains(otherDatabases, name);
}

bool DefaultsToFiles(std::string_view name) {
  return Contains(filesByDefault, name);
}

bool HoldsLocalAccounts(std::string_view name) {
  return Contains(accountDatabases, name);
}

bool IsLocalService(std::string_view name) {
  return name == "files" || name == "compat";
}

}  // namespace velmorctl
