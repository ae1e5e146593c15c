/// Adding a service to a database of the name-service switch, and taking one out.
#ifndef VELMORCTL_NSS_SWITCH_EDIT_H
#define VELMORCTL_NSS_SWITCH_EDIT_H

#include <string>
#include <string_view>
#include <vector>

#include "nss/switch_file.h"

namespace velmorctl {

inline constexpr char switchFileName[] = "/etc/nsswitch.conf";

struct SwitchEdit {
  std::string content;                /// the whole text afterwards; the same when nothing is to be done
  std::vector<std::string> warnings;  /// for the administrator
};

/// Both change one line and no other byte, and prove it: the new text is read again, and its meaning is the
/// old one but for the change that was asked for; SystemConfiguration::NSSConfiguration must agree wherever
/// it reads the line without loss. `shown` names the file in messages.
///
/// They throw Failure: Usage for a name that cannot be one, a service to stand behind that is not there,
/// what would leave local accounts without their files or have another service asked before them, and what
/// would leave a database of the C library without services; Configuration when the file has a fault that
/// makes the change uncertain, when the service is there with brackets that mean something else than those it
/// is to have, or when the proof fails.

/// Puts the service behind the one called `after` and what stands in brackets behind that or, when `after` is
/// empty, at the end. "files" and "compat" come first where local accounts depend on them. A database without
/// a line gets one with "files" before the service, since that is what the C library consults without a line.
/// Nothing changes where the database has the service already.
SwitchEdit AddService(const SwitchFile& file, const std::string& shown, const std::string& database,
                      const ServiceMeaning& service, const std::string& after);

/// Takes the service out, with its brackets. Nothing changes where the database does not have it.
SwitchEdit RemoveService(const SwitchFile& file, const std::string& shown, const std::string& database,
                         const std::string& service);

/// Whether the text can name a service: it becomes a part of the name of a shared object.
bool IsServiceName(std::string_view text);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_SWITCH_EDIT_H
