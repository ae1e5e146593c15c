#include "system_file/unified_diff.h"

#include <algorithm>
#include <vector>

#include "system_file/line_difference.h"
#include "text.h"

namespace velmorctl {

namespace {

using Lines = std::vector<std::string_view>;

constexpr std::size_t contextLines = 3;

/// Changes whose contexts touch.
using Hunk = std::vector<LineChange>;

std::vector<Hunk> Hunks(const std::vector<LineChange>& changes) {
  std::vector<Hunk> hunks;
  for (const LineChange& change : changes) {
    const bool touches =
        !hunks.empty() &&
        change.oldStart - hunks.back().back().oldStart - hunks.back().back().oldCount <= 2 * contextLines;
    if (!touches) {
      hunks.emplace_back();
    }
    hunks.back().push_back(change);
  }
  return hunks;
}

/// A range of lines as a hunk's head names it: an empty one by the line in front of it.
std::string Range(std::size_t start, std::size_t count) {
  std::string text = std::to_string(count == 0 ? start : start + 1);
  return count == 1 ? text : text + "," + std::to_string(count);
}

void AppendLines(const Lines& lines, std::size_t start, std::size_t count, char mark, std::string& text) {
  for (std::size_t line = start; line < start + count; ++line) {
    text += mark;
    text += lines[line];
    if (!lines[line].ends_with('\n')) {
      text += "\n\\ No newline at end of file\n";
    }
  }
}

void AppendHunk(const Hunk& hunk, const Lines& before, const Lines& after, std::string& text) {
  const LineChange& first = hunk.front();
  const LineChange& last = hunk.back();
  const std::size_t leading = std::min(contextLines, first.oldStart);
  const std::size_t trailing = std::min(contextLines, before.size() - last.oldStart - last.oldCount);
  const std::size_t oldStart = first.oldStart - leading;
  const std::size_t newStart = first.newStart - leading;
  text += "@@ -" + Range(oldStart, last.oldStart + last.oldCount + trailing - oldStart) + " +" +
          Range(newStart, last.newStart + last.newCount + trailing - newStart) + " @@\n";
  std::size_t line = oldStart;
  for (const LineChange& change : hunk) {
    AppendLines(before, line, change.oldStart - line, ' ', text);
    AppendLines(before, change.oldStart, change.oldCount, '-', text);
    AppendLines(after, change.newStart, change.newCount, '+', text);
    line = change.oldStart + change.oldCount;
  }
  AppendLines(before, line, trailing, ' ', text);
}

}  // namespace

std::string UnifiedDiff(const std::string& name, const std::optional<std::string>& before,
                        const std::optional<std::string>& after) {
  const std::string oldText = before.value_or("");
  const std::string newText = after.value_or("");
  const Lines oldLines = SplitLines(oldText);
  const Lines newLines = SplitLines(newText);
  if (before == after) {
    return {};
  }
  // A newline in the name would forge lines.
  const std::string shown = Printable(name);
  std::string text =
      "--- " + (before ? "a" + shown : "/dev/null") + "\n+++ " + (after ? "b" + shown : "/dev/null") + "\n";
  for (const Hunk& hunk : Hunks(LineDifference(oldLines, newLines))) {
    AppendHunk(hunk, oldLines, newLines, text);
  }
  return text;
}

std::string PrintableLines(const std::string& text) {
  std::string printable;
  for (std::size_t index = 0; index < text.size();) {
    const std::size_t size = ControlCharacterAt(text, index);
    const char character = text[index];
    if (size == 2) {
      printable += "^?";
    } else if (size == 1 && character != '\n' && character != '\t') {
      printable += '^';
      printable += static_cast<char>(static_cast<unsigned char>(character) ^ 0x40U);
    } else {
      printable += character;
    }
    index += size > 0 ? size : 1;
  }
  return printable;
}

}  // namespace velmorctl
