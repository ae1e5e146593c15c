#ifndef PLATFORM_HOSTMGMT_OPTION_LINE_H
#define PLATFORM_HOSTMGMT_OPTION_LINE_H

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <variant>

namespace HostMgmt {

/// What stands in the options file as `none`: the host does not have the option, default or not.
struct NoOption {};

using OptionValue = std::variant<NoOption, std::int64_t, std::string>;

/// A line of the options file that sets an option.
struct OptionLine {
  std::string path;
  OptionValue value;
  /// From its "#" to the end of the line; empty when there is none.
  std::string comment;
};

/// The reason why a line is not an option. Stays within this layer, which adds file and line.
class OptionLineError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// Reads a line without its ending. Returns nothing for an empty line and a comment; throws OptionLineError
/// for what is neither that nor an option.
std::optional<OptionLine> ParseOptionLine(const std::string& text);

/// The line that ParseOptionLine reads back as the same. Throws OptionLineError for a path or a text that
/// cannot stand in a line.
std::string FormatOptionLine(const OptionLine& line);

}  // namespace HostMgmt

#endif
