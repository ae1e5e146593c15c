#include "nss/edit_proof.h"

#include <algorithm>

#include "failure.h"
#include "nss/second_opinion.h"
#include "system_file/line_difference.h"

namespace velmorctl {

namespace {

/// Whether the texts differ in this line and nowhere else; it may be a new one.
bool DifferInOneLine(const std::string& before, const std::string& after, int number) {
  const std::vector<LineChange> changes = LineDifference(SplitLines(before), SplitLines(after));
  return changes.size() == 1 && changes.front().newStart + 1 == static_cast<std::size_t>(number) &&
         changes.front().newCount == 1 && changes.front().oldCount <= 1;
}

bool Means(const SwitchFile& file, const WantedLine& wanted) {
  const std::vector<const SwitchLine*> lines = file.LinesOf(wanted.database);
  return lines.size() == 1 && lines.front()->number == wanted.number && file.Counts(*lines.front()) &&
         lines.front()->Meaning() == wanted.services;
}

[[noreturn]] void Refuse(const std::string& shown, const std::string& reason) {
  throw Failure(ExitCode::Other, "the planned change does not mean what was asked for")
      .Detail("file", shown)
      .Detail("reason", reason)
      .Try("change the file by hand, and report this with the file");
}

}  // namespace

void ProveEdit(const SwitchFile& before, const SwitchFile& after, const std::string& shown,
               const WantedLine& wanted) {
  if (!DifferInOneLine(before.Text(), after.Text(), wanted.number)) {
    Refuse(shown, "more than one line would change");
  }
  if (!Means(after, wanted)) {
    Refuse(shown, "the line would be read otherwise");
  }
  if (!ModelAgrees(before, after, wanted)) {
    Refuse(shown, "the model of the name-service switch reads it otherwise");
  }
}

}  // namespace velmorctl
