#include "pam/facility.h"

#include <algorithm>

namespace velmorctl::pam {

namespace {

char Lower(char letter) {
  return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
}

}  // namespace

std::string_view NameOf(Facility facility) {
  constexpr std::array<std::string_view, facilities.size()> names = {"auth", "account", "password",
                                                                     "session"};
  return names[static_cast<std::size_t>(facility)];
}

std::optional<Facility> FacilityOf(std::string_view word) {
  for (Facility facility : facilities) {
    if (SameWord(NameOf(facility), word)) {
      return facility;
    }
  }
  return std::nullopt;
}

bool SameWord(std::string_view one, std::string_view other) {
  return std::equal(one.begin(), one.end(), other.begin(), other.end(),
                    [](char left, char right) { return Lower(left) == Lower(right); });
}

}  // namespace velmorctl::pam
