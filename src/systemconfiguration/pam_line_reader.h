#ifndef SYSTEMCONFIGURATION_PAM_LINE_READER_H
#define SYSTEMCONFIGURATION_PAM_LINE_READER_H

#include <array>
#include <string>
#include <string_view>

#include "systemconfiguration/pam_policy.h"

namespace SystemConfiguration {

/// Appends entries to a policy from lines that lie whole in memory.
class PAMLineReader {
 public:
  explicit PAMLineReader(PAMPolicy& policy) : policy_(policy) {}

  /// Takes a line with its line end. Returns false, having done nothing, for every line that is no entry by
  /// itself: comments, blank lines, lines whose control or module is on a later one, and lines to be refused.
  bool Append(std::string_view line);

 private:
  class Words;

  PAMControl::Control TakeControl(Words& words);
  bool TakeToClosingBracket(Words& words);
  PAMStack& StackOf(PAMFacility::Facility facility);

  PAMPolicy& policy_;
  std::array<PAMStack*, PAMFacility::Session + 1> stacks_ = {};  // those looked up before
  std::string bracketed_;                                        // of the last line that had such a control
};

}  // namespace SystemConfiguration

#endif
