#include "pam_edit/stack_difference.h"

#include <algorithm>
#include <vector>

#include "pam_edit/jumps.h"
#include "pam_edit/local_guard.h"
#include "text.h"

namespace velmorctl::pam {

namespace {

constexpr std::size_t added = static_cast<std::size_t>(-1);

std::string Describe(const StackEntry& entry) {
  return entry.origin.file + ", line " + std::to_string(entry.origin.line) + ": " + Printable(entry.module);
}

/// Equal but for the lengths of jumps and the number of the line.
bool AreSame(const StackEntry& one, const StackEntry& other) {
  return one.kind == other.kind && one.level == other.level && one.module == other.module &&
         one.arguments == other.arguments && one.quiet == other.quiet &&
         one.origin.file == other.origin.file &&
         std::equal(one.actions.begin(), one.actions.end(), other.actions.begin(),
                    [](Action left, Action right) { return left.kind == right.kind; });
}

/// For each entry of a stack the one of the other stack that it is, or `added`.
using Counterparts = std::vector<std::size_t>;

/// The entry of the stack before that a jump to `landing` leads to in effect.
std::size_t EffectiveLanding(const Counterparts& counterparts, std::size_t landing, std::size_t sizeBefore) {
  while (landing < counterparts.size() && counterparts[landing] == added) {
    ++landing;
  }
  return landing < counterparts.size() ? counterparts[landing] : sizeBefore + (landing - counterparts.size());
}

bool JumpsAgree(const Stack& without, const Stack& with, const Counterparts& counterparts,
                std::size_t index) {
  const Actions& before = without[counterparts[index]].actions;
  const Actions& after = with[index].actions;
  for (std::size_t answer = 0; answer < before.size(); ++answer) {
    if (before[answer].kind == Action::Kind::Jump &&
        Landing(without, counterparts[index], before[answer].jump) !=
            EffectiveLanding(counterparts, Landing(with, index, after[answer].jump), without.size())) {
      return false;
    }
  }
  return true;
}

}  // namespace

bool IsOwnEntry(const StackEntry& entry, const OwnModules& own) {
  if (entry.kind != StackEntry::Kind::Module) {
    return false;
  }
  bool primer = entry.module == "pam_permit.so" && entry.control == "required" && entry.arguments.empty();
  bool guard = entry.module == guardModule && entry.control == guardControl && entry.arguments.empty();
  return primer || guard || own.contains(entry.module);
}

std::string UnexpectedDifference(const Stack& without, const Stack& with, const OwnModules& own) {
  Counterparts counterparts;
  std::size_t next = 0;
  for (const StackEntry& entry : with) {
    if (next < without.size() && AreSame(without[next], entry)) {
      counterparts.push_back(next++);
    } else if (IsOwnEntry(entry, own)) {
      counterparts.push_back(added);
    } else {
      return "this entry would be another one: " + Describe(entry);
    }
  }
  if (next < without.size()) {
    return "this entry would be lost: " + Describe(without[next]);
  }
  for (std::size_t index = 0; index < with.size(); ++index) {
    if (counterparts[index] != added && !JumpsAgree(without, with, counterparts, index)) {
      return "a jump of this entry would lead to another one: " + Describe(with[index]);
    }
  }
  return {};
}

}  // namespace velmorctl::pam
