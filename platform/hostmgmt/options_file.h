#ifndef PLATFORM_HOSTMGMT_OPTIONS_FILE_H
#define PLATFORM_HOSTMGMT_OPTIONS_FILE_H

#include <map>
#include <string>

#include "hostmgmt/option_line.h"
#include "system/text_lines.h"

namespace HostMgmt {

/// The file of advanced options, one `path = value` to a line. A value is a decimal integer, text in double
/// quotes (with \" and \\ for these two characters), or `none`. Empty lines, and what follows a "#", are
/// comments. Setting an option changes its line only.
class OptionsFile {
 public:
  static constexpr char kPath[] = "/etc/quenix/options.conf";

  /// Reads the file; a missing one holds no option. Throws Lib::HostMgmtException, naming file, line and
  /// reason, for a line that is none of the above and for a second value of one option.
  OptionsFile();

  const std::map<std::string, OptionValue>& GetValues() const;

  /// Throws Lib::HostMgmtException when the path or the value cannot stand in the file.
  void Set(const std::string& path, const OptionValue& value);

  /// Removes the option's line, if there is one.
  void Remove(const std::string& path);

  /// Writes the file durably, and makes its directory when missing.
  void Save() const;

 private:
  void Parse();

  System::TextLines lines_;
  std::map<std::string, OptionValue> values_;
};

}  // namespace HostMgmt

#endif
