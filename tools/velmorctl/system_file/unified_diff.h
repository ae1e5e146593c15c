/// The difference of two texts, as diff -u shows it.
#ifndef VELMORCTL_SYSTEM_FILE_UNIFIED_DIFF_H
#define VELMORCTL_SYSTEM_FILE_UNIFIED_DIFF_H

#include <optional>
#include <string>

namespace velmorctl {

/// What turns `before` into `after`, for patch(1): two lines with the names, and hunks with three lines of
/// context. Nothing stands for a file that does not exist, and is named /dev/null. Empty when both are equal.
/// The difference is the smallest one unless that is very great; then it replaces more lines than it must.
std::string UnifiedDiff(const std::string& name, const std::optional<std::string>& before,
                        const std::optional<std::string>& after);

/// A text of several lines for the terminal: a control character other than newline and tab is shown as "^"
/// and a letter, so that nothing in a file can steer the terminal.
std::string PrintableLines(const std::string& text);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_UNIFIED_DIFF_H
