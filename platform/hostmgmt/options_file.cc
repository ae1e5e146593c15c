#include "hostmgmt/options_file.h"

#include <algorithm>
#include <cerrno>
#include <optional>
#include <string_view>

#include "hostmgmt/replace_file.h"
#include "system/make_directory.h"
#include "system/read_file.h"
#include "system/resolve_links.h"
#include "system/system_error.h"

namespace HostMgmt {
namespace {

constexpr std::string_view kFirstLine = "# Advanced options of this host, one 'path = value' to a line.";

bool SetsOption(const System::TextLine& line, const std::string& path) {
  const std::optional<OptionLine> option = ParseOptionLine(line.text);
  return option && option->path == path;
}

}  // namespace

OptionsFile::OptionsFile() : lines_(System::SplitLines(System::ReadFile(kPath).value_or(""))) {
  Parse();
}

void OptionsFile::Parse() {
  for (std::size_t index = 0; index < lines_.size(); ++index) {
    try {
      const std::optional<OptionLine> line = ParseOptionLine(lines_[index].text);
      if (line && !values_.emplace(line->path, line->value).second) {
        throw OptionLineError("'" + line->path + "' is set a second time");
      }
    } catch (const OptionLineError& error) {
      System::ThrowFileError("read", kPath, "line " + std::to_string(index + 1) + ": " + error.what());
    }
  }
}

const std::map<std::string, OptionValue>& OptionsFile::GetValues() const {
  return values_;
}

void OptionsFile::Set(const std::string& path, const OptionValue& value) {
  try {
    const auto found = std::find_if(lines_.begin(), lines_.end(),
                                    [&path](const System::TextLine& line) { return SetsOption(line, path); });
    if (found == lines_.end()) {
      if (lines_.empty()) System::InsertLine(&lines_, 0, std::string(kFirstLine));
      System::InsertLine(&lines_, lines_.size(), FormatOptionLine({path, value, ""}));
    } else {
      found->text = FormatOptionLine({path, value, ParseOptionLine(found->text)->comment});
    }
  } catch (const OptionLineError& error) {
    System::ThrowFileError("change", kPath, error.what());
  }
  values_.insert_or_assign(path, value);
}

void OptionsFile::Remove(const std::string& path) {
  std::erase_if(lines_, [&path](const System::TextLine& line) { return SetsOption(line, path); });
  values_.erase(path);
}

void OptionsFile::Save() const {
  const std::string directory = System::DirectoryOf(kPath);
  if (!System::MakeDirectory(directory)) System::ThrowFileError("create", directory, errno);
  ReplaceFile(kPath, System::JoinLines(lines_));
}

}  // namespace HostMgmt
