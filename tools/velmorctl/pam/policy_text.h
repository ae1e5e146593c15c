/// A PAM policy file that keeps every byte, and its lines as libpam reads them.
#ifndef VELMORCTL_PAM_POLICY_TEXT_H
#define VELMORCTL_PAM_POLICY_TEXT_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace velmorctl::pam {

/// What libpam reads as one line: without its comment, continued lines joined by a blank, never blank itself.
struct LogicalLine {
  std::string text;
  std::size_t firstLine = 0;  /// of the file, counted from 1
  std::size_t lastLine = 0;
  /// It is part of a line of the file that libpam cuts, because it has more than 1023 bytes.
  bool cut = false;

  bool operator==(const LogicalLine&) const = default;
};

class PolicyText {
 public:
  /// How libpam 1.5.2 gets to the end of the file.
  enum class End {
    Complete,    /// it reads the whole file
    Unfinished,  /// the last line ends in a backslash: it refuses the file
    Endless      /// a backslash is the 1023rd byte of a line that goes on: it never returns
  };

  explicit PolicyText(std::string_view content);

  /// All bytes of the file.
  std::string Content() const;

  /// Reads all lines up to where End() says; they hold until the text is changed.
  const std::vector<LogicalLine>& Lines() const { return logicalLines_; }
  End HowItEnds() const { return end_; }

  /// Where the reading stopped when it is not complete: the line of the file, counted from 1.
  std::size_t EndLine() const { return endLine_; }

  /// The bytes of one line of the file, its line end included; counted from 1.
  const std::string& FileLine(std::size_t number) const { return fileLines_.at(number - 1); }
  std::size_t FileLineCount() const { return fileLines_.size(); }

  /// Changes of whole logical lines, by their index in Lines(). A new line is given without a line end and
  /// gets the one of the file's first line. All other bytes stay, but a last line without a line end gets one
  /// before something is put behind it. The line must not be cut (see LogicalLine), and throws
  /// std::invalid_argument otherwise, as it does for an index that is none.
  void InsertBefore(std::size_t index, std::string_view line);
  void InsertAfter(std::size_t index, std::string_view line);
  void Replace(std::size_t index, std::string_view line);
  void Remove(std::size_t index);

  /// Adds a line to the file's end.
  void Append(std::string_view line);

 private:
  const LogicalLine& WholeLine(std::size_t index) const;
  std::string WithLineEnd(std::string_view line) const;
  void InsertAt(std::size_t position, std::string_view line);
  void Erase(const LogicalLine& line);
  void Read();

  std::vector<std::string> fileLines_;
  std::vector<LogicalLine> logicalLines_;
  End end_ = End::Complete;
  std::size_t endLine_ = 0;
};

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_POLICY_TEXT_H
