#include "system_file/findings.h"

#include <iostream>

#include "output.h"
#include "text.h"

namespace velmorctl {

namespace {

Json AsJson(const FileProblem& finding) {
  return {{"file", finding.file},
          {"line", finding.line > 0 ? Json(finding.line) : Json()},
          {"value", finding.value},
          {"reason", finding.reason},
          {"remedy", finding.remedy}};
}

void PrintFinding(const FileProblem& finding) {
  std::cout << Printable(finding.file);
  if (finding.line > 0) {
    std::cout << ":" << finding.line;
  }
  std::cout << ": " << Printable(finding.reason) << "\n";
  if (!finding.value.empty()) {
    std::cout << "  value:    " << Printable(finding.value) << "\n";
  }
  std::cout << "  try:      " << Printable(finding.remedy) << "\n";
}

}  // namespace

ExitCode PrintFindings(const std::vector<FileProblem>& findings, const std::string& schema, bool json) {
  if (json) {
    Json entries = Json::array();
    for (const FileProblem& finding : findings) {
      entries.push_back(AsJson(finding));
    }
    PrintJson({{"schema", schema}, {"findings", entries}});
  } else if (findings.empty()) {
    std::cout << "Everything is fine.\n";
  } else {
    for (const FileProblem& finding : findings) {
      PrintFinding(finding);
    }
  }
  return findings.empty() ? ExitCode::Fine : ExitCode::Difference;
}

}  // namespace velmorctl
