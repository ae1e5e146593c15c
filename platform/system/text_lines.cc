#include "system/text_lines.h"

#include <algorithm>
#include <cstddef>

namespace HostMgmt::System {
namespace {

constexpr std::string_view kWhiteSpace = " \t\r\v\f\n";

TextLine MakeLine(std::string_view line, bool ended) {
  if (!ended) return {std::string(line), ""};
  if (!line.empty() && line.back() == '\r') return {std::string(line.substr(0, line.size() - 1)), "\r\n"};
  return {std::string(line), "\n"};
}

char ToLower(char character) {
  return character >= 'A' && character <= 'Z' ? static_cast<char>(character - 'A' + 'a') : character;
}

}  // namespace

TextLines SplitLines(const std::string& content) {
  TextLines lines;
  std::string_view rest = content;
  while (!rest.empty()) {
    const std::size_t end = rest.find('\n');
    const bool ended = end != std::string_view::npos;
    lines.push_back(MakeLine(rest.substr(0, end), ended));
    rest.remove_prefix(ended ? end + 1 : rest.size());
  }
  return lines;
}

std::string JoinLines(const TextLines& lines) {
  std::string content;
  for (const TextLine& line : lines) content += line.text + line.ending;
  return content;
}

void InsertLine(TextLines* lines, std::size_t position, const std::string& text) {
  const bool first = lines->empty() || lines->front().ending.empty();
  const std::string ending = first ? "\n" : lines->front().ending;
  if (position == lines->size() && !lines->empty() && lines->back().ending.empty()) {
    lines->back().ending = ending;
  }
  lines->insert(lines->begin() + static_cast<std::ptrdiff_t>(position), TextLine{text, ending});
}

std::vector<std::string> SplitWords(std::string_view text) {
  std::vector<std::string> words;
  std::size_t start = text.find_first_not_of(kWhiteSpace);
  while (start != std::string_view::npos) {
    const std::size_t end = text.find_first_of(kWhiteSpace, start);
    words.emplace_back(text.substr(start, end - start));
    start = end == std::string_view::npos ? end : text.find_first_not_of(kWhiteSpace, end);
  }
  return words;
}

std::string JoinWords(const std::vector<std::string>& words) {
  std::string text;
  for (const std::string& word : words) text += (text.empty() ? "" : " ") + word;
  return text;
}

bool EqualIgnoringCase(std::string_view left, std::string_view right) {
  return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                    [](char one, char other) { return ToLower(one) == ToLower(other); });
}

}  // namespace HostMgmt::System
