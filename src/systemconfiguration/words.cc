#include "words.h"

#include <algorithm>

namespace SystemConfiguration {

WhiteSpace::WhiteSpace() : classification_(std::use_facet<std::ctype<char>>(locale_)) {}

std::size_t WhiteSpace::FindWord(std::string_view text, std::size_t from) const {
  const char* const end = text.data() + text.size();
  const char* const found = classification_.scan_not(std::ctype_base::space, text.data() + from, end);
  return static_cast<std::size_t>(found - text.data());
}

std::size_t WhiteSpace::FindWordEnd(std::string_view text, std::size_t from) const {
  const char* const end = text.data() + text.size();
  const char* const found = classification_.scan_is(std::ctype_base::space, text.data() + from, end);
  return static_cast<std::size_t>(found - text.data());
}

WordReader::WordReader(std::string_view text, const WhiteSpace& whiteSpace)
    : text_(text), whiteSpace_(whiteSpace) {}

std::string_view WordReader::Next() {
  const std::size_t begin = whiteSpace_.FindWord(text_, position_);
  position_ = whiteSpace_.FindWordEnd(text_, begin);
  return text_.substr(begin, position_ - begin);
}

void WordReader::MoveTo(std::size_t position) {
  position_ = std::min(position, text_.size());
}

void AppendWords(std::string_view text, const WhiteSpace& whiteSpace, std::list<std::string>& words) {
  WordReader reader(text, whiteSpace);
  for (std::string_view word = reader.Next(); !word.empty(); word = reader.Next()) {
    words.emplace_back(word);
  }
}

}  // namespace SystemConfiguration
