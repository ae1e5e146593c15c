#include "file_problem.h"

#include "text.h"

namespace velmorctl {

Failure AsFailure(const FileProblem& problem, ExitCode code, const std::string& happened) {
  Failure failure(problem.needsRoot ? ExitCode::NeedsRoot : code, happened);
  failure.Detail("file", problem.file);
  if (problem.line > 0) {
    failure.Detail("line", std::to_string(problem.line));
  }
  if (!problem.value.empty()) {
    failure.Detail("value", Printable(problem.value));
  }
  return failure.Detail("reason", Printable(problem.reason)).Try(problem.remedy);
}

}  // namespace velmorctl
