#include "pam_edit/jumps.h"

#include <algorithm>
#include <charconv>

namespace velmorctl::pam {

namespace {

constexpr char digits[] = "0123456789";
/// What may stand between words; a backslash at a line's end continues the line.
constexpr char gaps[] = " \t\n\\";

/// Where the bracketed control begins, which is the line's second word; its size when it has none.
std::size_t BeginOfControl(const std::string& line) {
  std::size_t word = line.find_first_not_of(gaps);
  std::size_t gap = std::min(line.find_first_of(gaps, word), line.size());
  std::size_t control = std::min(line.find_first_not_of(gaps, gap), line.size());
  return control < line.size() && line[control] == '[' ? control : line.size();
}

}  // namespace

std::string WithMovedJumps(const std::string& line, std::int32_t least, int difference) {
  std::size_t begin = BeginOfControl(line);
  std::size_t end = std::min(line.find(']', begin), line.size());
  std::string moved = line.substr(0, begin);
  std::size_t position = begin;
  while (position < end) {
    std::size_t number = line.find('=', position);
    number = number < end ? line.find_first_not_of(gaps, number + 1) : end;
    if (number >= end) {
      break;
    }
    moved += line.substr(position, number - position);
    position = std::min(line.find_first_not_of(digits, number), end);
    std::int32_t jump = 0;
    bool isNumber =
        std::from_chars(line.data() + number, line.data() + position, jump).ptr != line.data() + number;
    moved += isNumber && jump >= least ? std::to_string(jump + difference)
                                       : line.substr(number, position - number);
  }
  return moved + line.substr(position);
}

std::size_t Landing(const Stack& stack, std::size_t from, std::int32_t count) {
  std::size_t level = stack[from].level;
  std::size_t position = from;
  for (std::int32_t left = count; left > 0; --left) {
    if (position + 1 >= stack.size() || stack[position + 1].level < level) {
      return stack.size() + 1;
    }
    do {
      ++position;
    } while (position + 1 < stack.size() && stack[position + 1].level > level);
  }
  return position + 1;
}

}  // namespace velmorctl::pam
