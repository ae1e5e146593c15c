#include "systemconfiguration/differential/pam_comparison.h"

#include <sstream>

#include "systemconfiguration/differential/comparison.h"
#include "systemconfiguration/reference/pam_reference.h"
#include "systemconfiguration/systemconfiguration.h"

namespace differential {
namespace {

using SystemConfiguration::PAMEntry;
using SystemConfiguration::PAMFacility;
using SystemConfiguration::PAMPolicy;
using SystemConfiguration::PAMStack;

std::string Sized(const std::string& text) {
  return std::to_string(text.size()) + "'" + text + "' ";
}

// An entry's control shows in what the entry writes.
template <class Write>
std::string Written(const Write& write) {
  std::ostringstream stream;
  const std::string ending = Ending([&] { write(stream); });
  return ending + Sized(stream.str());
}

std::string Describe(const PAMEntry& entry) {
  std::string text = Written([&](std::ostream& stream) { stream << entry; }) + Sized(entry.module());
  for (const std::string& parameter : entry.parameters()) text += Sized(parameter);
  return text + "\n";
}

std::string Describe(const reference::PamEntry& entry) {
  std::string text =
      Written([&](std::ostream& stream) { reference::WriteEntry(stream, entry); }) + Sized(entry.module);
  for (const std::string& parameter : entry.parameters) text += Sized(parameter);
  return text + "\n";
}

std::string Describe(PAMPolicy policy) {
  std::string text;
  for (const auto facility : {PAMFacility::Unset, PAMFacility::Account, PAMFacility::Auth,
                              PAMFacility::Password, PAMFacility::Session}) {
    const PAMStack& stack = policy[facility];
    text += std::to_string(stack.Facility()) + ":\n";
    for (const PAMEntry& entry : stack) text += Describe(entry);
  }
  return text;
}

std::string Describe(reference::PamPolicy policy) {
  std::string text;
  for (unsigned facility = 0; facility <= 4; ++facility) {
    text += std::to_string(facility) + ":\n";
    for (const reference::PamEntry& entry : policy.stacks[facility]) text += Describe(entry);
  }
  return text;
}

}  // namespace

std::string CompareFacility(const InputCase& input) {
  PAMFacility facility;
  std::string library = ObserveReading(input, [&](std::istream& stream) { stream >> facility; });
  library += ObserveWriting(input, [&](std::ostream& stream) { stream << facility; });

  unsigned number = 0;
  std::string expected =
      ObserveReading(input, [&](std::istream& stream) { reference::ReadFacility(stream, number); });
  expected += ObserveWriting(input, [&](std::ostream& stream) { stream << reference::FacilityWord(number); });
  return Difference(library, expected);
}

std::string CompareEntry(const InputCase& input) {
  PAMEntry entry(SystemConfiguration::PAMControl("[old=text]"), "old.so");
  entry.parameters() = {"old"};
  std::string library = ObserveReading(input, [&](std::istream& stream) { stream >> entry; });
  library += Describe(entry);
  library += ObserveWriting(input, [&](std::ostream& stream) { stream << entry; });

  reference::PamEntry plain{7, "[old=text]", "old.so", {"old"}};
  std::string expected =
      ObserveReading(input, [&](std::istream& stream) { reference::ReadEntry(stream, plain); });
  expected += Describe(plain);
  expected += ObserveWriting(input, [&](std::ostream& stream) { reference::WriteEntry(stream, plain); });
  return Difference(library, expected);
}

std::string ComparePolicy(const InputCase& input) {
  PAMPolicy policy("compared");
  policy[PAMFacility::Session].emplace_back(SystemConfiguration::PAMControl::Include, "old");
  std::string library = ObserveReading(input, [&](std::istream& stream) { stream >> policy; });
  library += Describe(policy);
  library += ObserveWriting(input, [&](std::ostream& stream) { stream << policy; });

  reference::PamPolicy plain;
  plain.stacks[4].push_back({5, "", "old", {}});
  std::string expected =
      ObserveReading(input, [&](std::istream& stream) { reference::ReadPolicy(stream, plain); });
  expected += Describe(plain);
  expected += ObserveWriting(input, [&](std::ostream& stream) { reference::WritePolicy(stream, plain); });
  return Difference(library, expected);
}

std::string ComparePolicyWithItsRoundTrip(const InputCase& input) {
  PAMPolicy policy("first");
  std::istringstream text(input.text);
  Ending([&] { text >> policy; });
  for (const auto facility :
       {PAMFacility::Account, PAMFacility::Auth, PAMFacility::Password, PAMFacility::Session}) {
    // Without a module, which happens at the end of an input, an entry swallows the next line when read
    // again.
    const PAMStack& stack = policy[facility];
    if (stack.find("") != stack.end()) return "";
  }
  std::stringstream once;
  once << policy;
  PAMPolicy again("second");
  once >> again;
  std::ostringstream twice;
  for (const auto facility :
       {PAMFacility::Account, PAMFacility::Auth, PAMFacility::Password, PAMFacility::Session}) {
    again[facility];
  }
  twice << again;
  return Difference(twice.str(), once.str());
}

}  // namespace differential
