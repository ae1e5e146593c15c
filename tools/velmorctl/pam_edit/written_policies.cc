#include "pam_edit/written_policies.h"

#include "pam/policy_line.h"
#include "pam/policy_text.h"

namespace velmorctl::pam {

namespace {

/// The files that the lines name to be included.
std::vector<std::string> IncludesIn(const std::string& content) {
  std::vector<std::string> files;
  PolicyText text(content);
  for (const LogicalLine& logical : text.Lines()) {
    PolicyLine line = ReadPolicyLine(logical.text);
    if (line.kind != PolicyLine::Kind::Module && !line.target.empty()) {
      files.push_back(IncludedPath(line.target));
    }
  }
  return files;
}

}  // namespace

WrittenPolicies ReadWrittenPolicies(std::vector<std::string> files, const FileReader& read) {
  WrittenPolicies written;
  while (!files.empty()) {
    std::string file = std::move(files.back());
    files.pop_back();
    if (written.contents.contains(file) || written.unreadable.contains(file)) {
      continue;
    }
    FileReading reading = read(file);
    if (reading.content) {
      std::vector<std::string> includes = IncludesIn(*reading.content);
      files.insert(files.end(), includes.begin(), includes.end());
      written.contents.emplace(std::move(file), std::move(*reading.content));
    } else if (reading.problem) {
      written.unreadable.emplace(std::move(file), reading.problem->reason);
    }
  }
  return written;
}

}  // namespace velmorctl::pam
