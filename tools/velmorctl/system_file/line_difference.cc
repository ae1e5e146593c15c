#include "system_file/line_difference.h"

#include <algorithm>
#include <cstdint>

namespace velmorctl {

namespace {

using Lines = std::vector<std::string_view>;

// Bounds the table below to four mebibytes.
constexpr std::size_t mostCells = 1 << 20;

/// The lengths of the longest common subsequences of what remains of both texts from a line of each on.
class CommonLengths {
 public:
  CommonLengths(const Lines& before, const Lines& after, const LineChange& range)
      : width_(range.newCount + 1), lengths_((range.oldCount + 1) * width_, 0) {
    for (std::size_t oldLine = range.oldCount; oldLine-- > 0;) {
      for (std::size_t newLine = range.newCount; newLine-- > 0;) {
        const bool equal = before[range.oldStart + oldLine] == after[range.newStart + newLine];
        Cell(oldLine, newLine) = equal ? At(oldLine + 1, newLine + 1) + 1
                                       : std::max(At(oldLine + 1, newLine), At(oldLine, newLine + 1));
      }
    }
  }

  std::uint32_t At(std::size_t oldLine, std::size_t newLine) const {
    return lengths_[oldLine * width_ + newLine];
  }

 private:
  std::uint32_t& Cell(std::size_t oldLine, std::size_t newLine) {
    return lengths_[oldLine * width_ + newLine];
  }

  std::size_t width_;
  std::vector<std::uint32_t> lengths_;
};

/// Everything but the equal lines at both ends.
LineChange DifferentRange(const Lines& before, const Lines& after) {
  const auto [oldFirst, newFirst] = std::mismatch(before.begin(), before.end(), after.begin(), after.end());
  const auto [oldLast, newLast] = std::mismatch(before.rbegin(), std::make_reverse_iterator(oldFirst),
                                                after.rbegin(), std::make_reverse_iterator(newFirst));
  return {static_cast<std::size_t>(oldFirst - before.begin()),
          static_cast<std::size_t>(oldLast.base() - oldFirst),
          static_cast<std::size_t>(newFirst - after.begin()),
          static_cast<std::size_t>(newLast.base() - newFirst)};
}

std::vector<LineChange> SmallestChanges(const Lines& before, const Lines& after, const LineChange& range) {
  const CommonLengths lengths(before, after, range);
  std::vector<LineChange> changes;
  std::size_t oldLine = 0;
  std::size_t newLine = 0;
  bool inChange = false;
  while (oldLine < range.oldCount || newLine < range.newCount) {
    const bool bothRemain = oldLine < range.oldCount && newLine < range.newCount;
    if (bothRemain && before[range.oldStart + oldLine] == after[range.newStart + newLine]) {
      ++oldLine;
      ++newLine;
      inChange = false;
      continue;
    }
    if (!inChange) {
      changes.push_back({range.oldStart + oldLine, 0, range.newStart + newLine, 0});
      inChange = true;
    }
    const bool removes = newLine == range.newCount ||
                         (bothRemain && lengths.At(oldLine + 1, newLine) >= lengths.At(oldLine, newLine + 1));
    if (removes) {
      ++changes.back().oldCount;
      ++oldLine;
    } else {
      ++changes.back().newCount;
      ++newLine;
    }
  }
  return changes;
}

}  // namespace

std::vector<std::string_view> SplitLines(std::string_view text) {
  Lines lines;
  while (!text.empty()) {
    const std::size_t end = text.find('\n');
    const std::size_t size = end == std::string_view::npos ? text.size() : end + 1;
    lines.push_back(text.substr(0, size));
    text.remove_prefix(size);
  }
  return lines;
}

std::vector<LineChange> LineDifference(const Lines& before, const Lines& after) {
  const LineChange range = DifferentRange(before, after);
  if (range.oldCount == 0 && range.newCount == 0) {
    return {};
  }
  if ((range.oldCount + 1) > mostCells / (range.newCount + 1)) {
    return {range};
  }
  return SmallestChanges(before, after, range);
}

}  // namespace velmorctl
