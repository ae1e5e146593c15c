/// The user of a login, as far as PAM modules ask.
#ifndef VELMORCTL_PAM_PERSON_H
#define VELMORCTL_PAM_PERSON_H

#include <cstdint>
#include <optional>
#include <set>
#include <string>

namespace velmorctl::pam {

struct Person {
  std::string name;
  bool local = false;  /// passwd has a line for the name; otherwise it is a user of the directory
  std::uint32_t uid = 0;
  std::uint32_t gid = 0;
  std::string home;
  std::string shell;
  std::optional<std::set<std::string>> groups;  /// by name; nothing when they are not known
  bool locked = false;                          /// shadow has a password for the user that nobody can type
  bool assumed = false;                         /// numbers, home and shell are only likely ones
};

/// The contents of passwd, group and shadow; shadow is nothing when it cannot be read.
struct UserFiles {
  std::string passwd;
  std::string group;
  std::optional<std::string> shadow;
};

/// The user of the name. One whom passwd does not have is taken for a user of the directory: number 100000,
/// the shell /bin/bash, and groups that are not known.
Person FindPerson(const std::string& name, const UserFiles& files);

/// A local user with the number 1000 whose groups are not known.
Person LocalAdministrator();

/// root, with its group.
Person Root();

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_PERSON_H
