/// The four stacks of a PAM policy.
#ifndef VELMORCTL_PAM_FACILITY_H
#define VELMORCTL_PAM_FACILITY_H

#include <array>
#include <cstddef>
#include <optional>
#include <string_view>

namespace velmorctl::pam {

enum class Facility : std::size_t { Auth, Account, Password, Session };

inline constexpr std::array facilities = {Facility::Auth, Facility::Account, Facility::Password,
                                          Facility::Session};

/// The word of a policy line.
std::string_view NameOf(Facility facility);

/// The facility of the word, whatever its case; none for any other word.
std::optional<Facility> FacilityOf(std::string_view word);

/// Whether the words are the same but for the case of their ASCII letters.
bool SameWord(std::string_view one, std::string_view other);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_FACILITY_H
