/// What the C library does with a service's answer: the brackets behind the service.
#ifndef VELMORCTL_NSS_CRITERION_H
#define VELMORCTL_NSS_CRITERION_H

#include <array>
#include <cstddef>
#include <optional>
#include <string_view>

namespace velmorctl {

enum class LookupStatus : std::size_t { Success, NotFound, Unavailable, TryAgain };
enum class LookupAction { Return, Continue, Merge };

/// The action for each status; as made, what holds without brackets.
class Actions {
 public:
  LookupAction For(LookupStatus status) const { return actions_[static_cast<std::size_t>(status)]; }
  void Set(LookupStatus status, LookupAction action) { actions_[static_cast<std::size_t>(status)] = action; }

  /// Whether the search ends at this service whatever its answer is.
  bool AlwaysReturn() const;

  bool operator==(const Actions&) const = default;

 private:
  std::array<LookupAction, 4> actions_ = {LookupAction::Return, LookupAction::Continue,
                                          LookupAction::Continue, LookupAction::Continue};
};

/// Reads the text between two brackets as the C library does. Nothing when it has no meaning: the C library
/// then uses no line of the file.
std::optional<Actions> ParseCriterion(std::string_view text);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_CRITERION_H
