#include "pam/policy_text.h"

#include <algorithm>
#include <optional>
#include <stdexcept>

namespace velmorctl::pam {

namespace {

constexpr std::string_view blanks = " \n\t";

/// libpam's buffer, of which the last byte ends the text.
constexpr std::size_t bufferSize = 1024;

std::vector<std::string> SplitLines(std::string_view content) {
  std::vector<std::string> lines;
  while (!content.empty()) {
    std::size_t end = content.find('\n');
    std::size_t size = end == std::string_view::npos ? content.size() : end + 1;
    lines.emplace_back(content.substr(0, size));
    content.remove_prefix(size);
  }
  return lines;
}

/// Hands out the file in pieces of one line, or less where the room is too small.
class Pieces {
 public:
  explicit Pieces(const std::vector<std::string>& lines) : lines_(lines) {}

  struct Piece {
    std::string_view text;
    std::size_t line;
    bool cut;
  };

  bool AtEnd() const { return line_ >= lines_.size(); }
  std::size_t Line() const { return std::min(line_ + 1, lines_.size()); }

  Piece Take(std::size_t room) {
    std::string_view line = lines_[line_];
    Piece piece = {line.substr(offset_, room), line_ + 1, offset_ > 0};
    offset_ += piece.text.size();
    if (offset_ == line.size()) {
      ++line_;
      offset_ = 0;
    } else {
      // A line end alone in the next piece is blank, and nobody notices the cut.
      piece.cut = piece.cut || line.substr(offset_) != "\n";
    }
    return piece;
  }

 private:
  const std::vector<std::string>& lines_;
  std::size_t line_ = 0;
  std::size_t offset_ = 0;
};

/// A C string ends at its first null byte, and so does what libpam sees of a piece.
std::string_view Visible(std::string_view piece) {
  return piece.substr(0, piece.find('\0'));
}

/// The position of the backslash that continues the line.
std::optional<std::size_t> Continuation(std::string_view visible) {
  std::size_t last = visible.find_last_not_of(blanks);
  return visible[last] == '\\' ? std::optional(last) : std::nullopt;
}

}  // namespace

PolicyText::PolicyText(std::string_view content) : fileLines_(SplitLines(content)) {
  Read();
}

std::string PolicyText::Content() const {
  std::string content;
  for (const std::string& line : fileLines_) {
    content += line;
  }
  return content;
}

void PolicyText::Read() {
  logicalLines_.clear();
  end_ = End::Complete;
  Pieces pieces(fileLines_);
  LogicalLine line;
  std::size_t room = bufferSize - 1;
  while (room > 0 && !pieces.AtEnd()) {
    Pieces::Piece piece = pieces.Take(room);
    std::string_view visible = Visible(piece.text);
    std::size_t begin = visible.find_first_not_of(blanks);
    if (begin == std::string_view::npos || visible[begin] == '#') {
      continue;
    }
    line.firstLine = line.firstLine == 0 ? piece.line : line.firstLine;
    line.lastLine = piece.line;
    line.cut = line.cut || piece.cut;
    std::size_t comment = visible.find('#');
    std::optional<std::size_t> continuation =
        comment == std::string_view::npos ? Continuation(visible) : std::nullopt;
    if (continuation) {
      line.text.append(visible.substr(0, *continuation)).append(" ");
      room -= *continuation + 1;
      continue;
    }
    line.text.append(visible.substr(0, comment));
    logicalLines_.push_back(std::move(line));
    line = LogicalLine();
    room = bufferSize - 1;
  }
  if (line.firstLine != 0) {
    end_ = room == 0 ? End::Endless : End::Unfinished;
  }
  endLine_ = line.firstLine != 0 ? line.lastLine : pieces.Line();
}

const LogicalLine& PolicyText::WholeLine(std::size_t index) const {
  if (index >= logicalLines_.size() || logicalLines_[index].cut) {
    throw std::invalid_argument("no whole line of the policy has this index");
  }
  return logicalLines_[index];
}

std::string PolicyText::WithLineEnd(std::string_view line) const {
  bool carriageReturn = !fileLines_.empty() && fileLines_.front().ends_with("\r\n");
  return std::string(line) + (carriageReturn ? "\r\n" : "\n");
}

void PolicyText::InsertAt(std::size_t position, std::string_view line) {
  std::string whole = WithLineEnd(line);
  if (position == fileLines_.size() && position > 0 && !fileLines_.back().ends_with('\n')) {
    fileLines_.back() = WithLineEnd(fileLines_.back());
  }
  fileLines_.insert(fileLines_.begin() + static_cast<std::ptrdiff_t>(position), std::move(whole));
  Read();
}

void PolicyText::Erase(const LogicalLine& line) {
  fileLines_.erase(fileLines_.begin() + static_cast<std::ptrdiff_t>(line.firstLine - 1),
                   fileLines_.begin() + static_cast<std::ptrdiff_t>(line.lastLine));
}

void PolicyText::InsertBefore(std::size_t index, std::string_view line) {
  InsertAt(WholeLine(index).firstLine - 1, line);
}

void PolicyText::InsertAfter(std::size_t index, std::string_view line) {
  InsertAt(WholeLine(index).lastLine, line);
}

void PolicyText::Replace(std::size_t index, std::string_view line) {
  LogicalLine old = WholeLine(index);
  std::string whole = WithLineEnd(line);
  if (!fileLines_[old.lastLine - 1].ends_with('\n')) {
    whole.assign(line);
  }
  Erase(old);
  fileLines_.insert(fileLines_.begin() + static_cast<std::ptrdiff_t>(old.firstLine - 1), std::move(whole));
  Read();
}

void PolicyText::Remove(std::size_t index) {
  Erase(WholeLine(index));
  Read();
}

void PolicyText::Append(std::string_view line) {
  InsertAt(fileLines_.size(), line);
}

}  // namespace velmorctl::pam
