/// The provider's own settings file.
#ifndef SAMBA_COMMON_SETTINGS_H
#define SAMBA_COMMON_SETTINGS_H

#include <chrono>
#include <string>
#include <string_view>

namespace sambaprovider {

struct Settings {
  /// Take over a computer account of this host's name although it belongs to another host.
  bool reuseAccount = false;
  /// When winbindd gives a question up.
  std::chrono::seconds winbindRequestTimeout{15};
  /// When a join, a leave or a change of preferred controllers is ended from outside.
  std::chrono::seconds operationTimeout{120};
};

/// Reads lines `key = "value"`, quotes optional, blank lines allowed. Throws Failure
/// (kHostConfigurationInTheWay) with the line's number for a line without "=", an unknown or repeated key, or
/// an impossible value.
Settings ParseSettings(std::string_view text);

/// Parses the settings file; the defaults when there is none.
Settings LoadSettings();

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_SETTINGS_H
