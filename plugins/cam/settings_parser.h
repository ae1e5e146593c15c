/// The text of the settings file.
#ifndef CAM_SETTINGS_PARSER_H
#define CAM_SETTINGS_PARSER_H

#include <string_view>

#include "settings.h"

namespace camproxy {

/// Reads lines `key = "value"`, quotes optional, blank lines allowed. Throws Failure for SETTINGS_FAULT, with
/// the line's number and without its value, for a line without "=", an unknown or repeated key, or an
/// impossible value.
Settings ParseSettings(std::string_view text);

}  // namespace camproxy

#endif  // CAM_SETTINGS_PARSER_H
