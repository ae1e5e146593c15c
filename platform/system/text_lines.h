#ifndef PLATFORM_SYSTEM_TEXT_LINES_H
#define PLATFORM_SYSTEM_TEXT_LINES_H

#include <string>
#include <string_view>
#include <vector>

namespace HostMgmt::System {

/// One line of a text file: what it says, and how it ends ("\n", "\r\n", or "" at the end of a file whose
/// last line is not ended).
struct TextLine {
  std::string text;
  std::string ending;
};

/// The lines of a text file that is edited line by line: what is not touched stays byte for byte.
using TextLines = std::vector<TextLine>;

TextLines SplitLines(const std::string& content);
std::string JoinLines(const TextLines& lines);

/// Puts a line before the line at `position`, or at the end when that is the number of lines. The line gets
/// the ending that the file's first line has; a last line that was not ended is ended first.
void InsertLine(TextLines* lines, std::size_t position, const std::string& text);

/// The words of the text, separated by blanks, tabs and other white space.
std::vector<std::string> SplitWords(std::string_view text);

/// The words joined by single blanks.
std::string JoinWords(const std::vector<std::string>& words);

/// Compares without regard to the case of ASCII letters, whatever the locale.
bool EqualIgnoringCase(std::string_view left, std::string_view right);

}  // namespace HostMgmt::System

#endif
