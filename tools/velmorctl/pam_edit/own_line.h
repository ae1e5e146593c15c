/// The lines that velmorctl puts into policy files that are kept by hand, and takes out again.
#ifndef VELMORCTL_PAM_EDIT_OWN_LINE_H
#define VELMORCTL_PAM_EDIT_OWN_LINE_H

#include <cstddef>
#include <string>
#include <vector>

#include "pam/facility.h"

namespace velmorctl::pam {

/// A line to put in, and the line of the file beside which it goes.
struct OwnLine {
  enum class Side { Before, After };

  Facility facility = Facility::Auth;
  Side side = Side::Before;
  std::string control;
  std::string module;  /// with its parameters
};

/// Puts the line in beside the policy line that begins at line `anchor` of the file, with a comment above it
/// that tells whose it is. Jumps of the same facility that lead past the new line are made one longer; one
/// that leads to its place now leads to it. All other bytes stay. Before another own line it goes above that
/// one's comment. Throws std::invalid_argument when no policy line begins there.
std::string WithOwnLine(const std::string& content, std::size_t anchor, const OwnLine& line);

/// The content as it was before the own lines were put in: with their comments, and with the jumps made
/// shorter. A line that is no longer what its comment says has been changed by the administrator and stays.
std::string WithoutOwnLines(const std::string& content);

/// The modules of the own lines, without their parameters.
std::vector<std::string> ModulesOfOwnLines(const std::string& content);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_OWN_LINE_H
