#include "nss/words.h"

#include <algorithm>

namespace velmorctl {

std::vector<std::string> SplitWords(std::string_view text) {
  std::vector<std::string> words;
  auto position = text.begin();
  while (position != text.end()) {
    const auto start = std::find_if_not(position, text.end(), IsSpace);
    position = std::find_if(start, text.end(), IsSpace);
    if (start != position) {
      words.emplace_back(start, position);
    }
  }
  return words;
}

}  // namespace velmorctl
