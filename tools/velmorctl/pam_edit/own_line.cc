#include "pam_edit/own_line.h"

#include <algorithm>
#include <optional>
#include <stdexcept>
#include <string_view>

#include "pam/policy_line.h"
#include "pam/policy_text.h"
#include "pam_edit/jumps.h"

namespace velmorctl::pam {

namespace {

constexpr std::string_view mark = "# Added by \"velmorctl pam enable\": ";

/// The file as lines that can be changed, with what libpam reads in them.
class EditedFile {
 public:
  explicit EditedFile(const std::string& content) : text_(content) {
    for (std::size_t number = 1; number <= text_.FileLineCount(); ++number) {
      lines_.push_back(text_.FileLine(number));
    }
  }

  const PolicyText& Text() const { return text_; }
  std::vector<std::string>& Lines() { return lines_; }

  /// The logical line that begins at this line of the file.
  std::optional<std::size_t> BeginningAt(std::size_t fileLine) const {
    const std::vector<LogicalLine>& lines = text_.Lines();
    auto found = std::find_if(lines.begin(), lines.end(), [fileLine](const LogicalLine& line) {
      return line.firstLine == fileLine && !line.cut;
    });
    return found == lines.end() ? std::nullopt
                                : std::optional(static_cast<std::size_t>(found - lines.begin()));
  }

  /// Changes by `difference` the jumps of the facility's lines before `index` that lead past it, or to it
  /// when a line is there already that goes away.
  void MoveJumps(Facility facility, std::size_t index, int difference) {
    std::int32_t distance = 0;
    for (std::size_t other = index; other-- > 0;) {
      const LogicalLine& logical = text_.Lines()[other];
      PolicyLine line = ReadPolicyLine(logical.text);
      if (line.facility != facility && line.kind != PolicyLine::Kind::IncludeWhole) {
        continue;
      }
      ++distance;
      std::string raw;
      for (std::size_t number = logical.firstLine; number <= logical.lastLine; ++number) {
        raw += lines_[number - 1];
        lines_[number - 1].clear();
      }
      lines_[logical.firstLine - 1] = WithMovedJumps(raw, distance, difference);
    }
  }

  std::string Content() const {
    std::string content;
    for (const std::string& line : lines_) {
      content += line;
    }
    return content;
  }

 private:
  PolicyText text_;
  std::vector<std::string> lines_;
};

std::string_view WithoutLineEnd(std::string_view line) {
  return line.substr(0, line.size() - (line.ends_with('\n') ? 1 : 0));
}

/// The module of a line with its parameters.
std::string ModuleOf(const PolicyLine& line) {
  std::string text = line.target;
  for (const std::string& argument : line.arguments) {
    text += " " + QuotedArgument(argument);
  }
  return text;
}

/// The logical line below the comment at this line of the file, when it is what the comment says.
std::optional<std::size_t> OwnedBelow(const EditedFile& file, std::size_t fileLine) {
  std::string_view comment = WithoutLineEnd(file.Text().FileLine(fileLine));
  if (!comment.starts_with(mark)) {
    return std::nullopt;
  }
  std::optional<std::size_t> below = file.BeginningAt(fileLine + 1);
  if (!below || file.Text().Lines()[*below].lastLine != fileLine + 1) {
    return std::nullopt;
  }
  PolicyLine line = ReadPolicyLine(file.Text().Lines()[*below].text);
  bool owned =
      line.kind == PolicyLine::Kind::Module && line.facility && ModuleOf(line) == comment.substr(mark.size());
  return owned ? below : std::nullopt;
}

/// The content without its first own line, or nothing when there is none.
std::optional<std::string> WithoutFirstOwnLine(const std::string& content) {
  EditedFile file(content);
  for (std::size_t number = 1; number < file.Text().FileLineCount(); ++number) {
    std::optional<std::size_t> own = OwnedBelow(file, number);
    if (!own) {
      continue;
    }
    file.MoveJumps(*ReadPolicyLine(file.Text().Lines()[*own].text).facility, *own, -1);
    std::vector<std::string>& lines = file.Lines();
    bool endsOpen = !lines[number].ends_with('\n');
    lines[number - 1].clear();
    lines[number].clear();
    std::string rest = file.Content();
    // The last line had no line end before either.
    return endsOpen ? std::string(WithoutLineEnd(rest)) : rest;
  }
  return std::nullopt;
}

}  // namespace

std::string WithOwnLine(const std::string& content, std::size_t anchor, const OwnLine& line) {
  EditedFile file(content);
  std::optional<std::size_t> index = file.BeginningAt(anchor);
  if (!index) {
    throw std::invalid_argument("no policy line begins there");
  }
  bool before = line.side == OwnLine::Side::Before;
  const LogicalLine beside = file.Text().Lines()[*index];
  file.MoveJumps(line.facility, before ? *index : *index + 1, 1);
  std::string comment = std::string(mark) + line.module + "\n";
  std::string entry = std::string(NameOf(line.facility)) + "\t" + line.control + "\t" + line.module;
  std::vector<std::string>& lines = file.Lines();
  if (before) {
    std::size_t at = beside.firstLine;
    bool ownedAbove = at > 1 && OwnedBelow(file, at - 1);
    lines[ownedAbove ? at - 2 : at - 1].insert(0, comment + entry + "\n");
  } else if (file.Text().FileLine(beside.lastLine).ends_with('\n')) {
    lines[beside.lastLine - 1] += comment + entry + "\n";
  } else {
    lines[beside.lastLine - 1] += "\n" + comment + entry;
  }
  return file.Content();
}

std::string WithoutOwnLines(const std::string& content) {
  std::string result = content;
  while (std::optional<std::string> less = WithoutFirstOwnLine(result)) {
    result = std::move(*less);
  }
  return result;
}

std::vector<std::string> ModulesOfOwnLines(const std::string& content) {
  EditedFile file(content);
  std::vector<std::string> modules;
  for (std::size_t number = 1; number < file.Text().FileLineCount(); ++number) {
    if (std::optional<std::size_t> own = OwnedBelow(file, number)) {
      modules.push_back(ReadPolicyLine(file.Text().Lines()[*own].text).target);
    }
  }
  return modules;
}

}  // namespace velmorctl::pam
