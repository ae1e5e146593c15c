/// What is wrong with a file that the command needs, found by looking at the file itself.
#ifndef VELMORCTL_FILE_PROBLEM_H
#define VELMORCTL_FILE_PROBLEM_H

#include <string>

#include "failure.h"

namespace velmorctl {

struct FileProblem {
  enum class Kind {
    Missing,     /// there is no such file
    Unreadable,  /// it cannot be read
    Malformed,   /// a line of it is not what the format asks for
    NoValue,     /// it does not set the key, or sets it to nothing
    WrongValue,  /// what it sets cannot be meant
    Unusable     /// it is no plug-in that the library can use
  };

  Kind kind;
  std::string file;
  int line = 0;       /// counted from 1; 0 when no line is to blame
  std::string value;  /// the text that is wrong, as it stands in the file; may be empty
  std::string reason;
  std::string remedy;
  bool needsRoot = false;  /// the file cannot be read by this user only
};

/// The problem as a failure: `happened`, with file, line, value and reason as details and the remedy as
/// advice. The code is NeedsRoot instead of `code` when only root may read the file.
Failure AsFailure(const FileProblem& problem, ExitCode code, const std::string& happened);

}  // namespace velmorctl

#endif  // VELMORCTL_FILE_PROBLEM_H
