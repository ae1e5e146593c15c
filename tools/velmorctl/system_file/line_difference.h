/// Which lines of two texts differ.
#ifndef VELMORCTL_SYSTEM_FILE_LINE_DIFFERENCE_H
#define VELMORCTL_SYSTEM_FILE_LINE_DIFFERENCE_H

#include <cstddef>
#include <string_view>
#include <vector>

namespace velmorctl {

/// Lines of the old text, and those of the new one that stand in their place; one of the counts may be 0.
struct LineChange {
  std::size_t oldStart = 0;  /// counted from 0
  std::size_t oldCount = 0;
  std::size_t newStart = 0;
  std::size_t newCount = 0;
};

/// The lines of a text, each with the newline that ends it; the last one may lack it.
std::vector<std::string_view> SplitLines(std::string_view text);

/// The changes in ascending order, with equal lines between them. As few lines as possible are changed,
/// unless the texts differ over more than about a thousand lines: then all from the first change to the last
/// are one.
std::vector<LineChange> LineDifference(const std::vector<std::string_view>& before,
                                       const std::vector<std::string_view>& after);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_LINE_DIFFERENCE_H
