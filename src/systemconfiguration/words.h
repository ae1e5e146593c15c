#ifndef SYSTEMCONFIGURATION_WORDS_H
#define SYSTEMCONFIGURATION_WORDS_H

#include <cstddef>
#include <list>
#include <locale>
#include <string>
#include <string_view>

namespace SystemConfiguration {

/// What counts as white space inside a line that was read already: the global locale's, as for a string
/// stream made at that moment. Made once for each reading, because looking up a facet costs more than
/// splitting a line.
class WhiteSpace {
 public:
  WhiteSpace();

  std::size_t FindWord(std::string_view text, std::size_t from) const;
  std::size_t FindWordEnd(std::string_view text, std::size_t from) const;

 private:
  std::locale locale_;
  const std::ctype<char>& classification_;
};

/// Walks the words of a text that outlives it. The position counts from the text's beginning.
class WordReader {
 public:
  WordReader(std::string_view text, const WhiteSpace& whiteSpace);

  /// The next word, empty when none is left.
  std::string_view Next();

  /// Just behind the last word read.
  std::size_t Position() const { return position_; }

  /// A position behind the end leaves no word.
  void MoveTo(std::size_t position);

 private:
  std::string_view text_;
  const WhiteSpace& whiteSpace_;
  std::size_t position_ = 0;
};

void AppendWords(std::string_view text, const WhiteSpace& whiteSpace, std::list<std::string>& words);

}  // namespace SystemConfiguration

#endif
