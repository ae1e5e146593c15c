// A policy that is read has the bytes it had, a line that is put in and taken out again leaves none behind,
// and no text whatever is too much for the reader of lines and stacks.
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "pam/policy_line.h"
#include "pam/policy_text.h"
#include "pam/resolver.h"
#include "pam_edit/own_line.h"
#include "require.h"

namespace {

using velmorctl::pam::FileReading;
using velmorctl::pam::LogicalLine;
using velmorctl::pam::Policy;
using velmorctl::pam::PolicyLine;
using velmorctl::pam::PolicyText;
using velmorctl::pam::QuotedArgument;
using velmorctl::pam::ReadPolicyLine;

constexpr char NEW_LINE[] = "auth\toptional\tpam_new.so";

void CheckChanges(const PolicyText& text, std::size_t index) {
  const LogicalLine& line = text.Lines()[index];
  PolicyText changed = text;
  try {
    changed.InsertBefore(index, NEW_LINE);
  } catch (const std::invalid_argument&) {
    Require(line.cut, "only a line that is cut is refused");
    return;
  }
  Require(!line.cut, "a line that is cut is refused");
  Require(changed.Lines().size() > index && changed.Lines()[index].text.starts_with(NEW_LINE),
          "the new line stands before the old one");
  changed.Remove(index);
  Require(changed.Content() == text.Content(), "nothing is left of a line that was taken out again");
}

/// A word that cannot be written as it was read: it is in brackets that the end of the line closes.
bool CannotBeWritten(const std::string& argument) {
  return argument.ends_with('\\');
}

/// What "pam show" shows can be read as what it stands for.
void CheckWrittenLine(const PolicyLine& line) {
  if (!line.problem.empty() || line.kind == PolicyLine::Kind::IncludeWhole ||
      std::any_of(line.arguments.begin(), line.arguments.end(), CannotBeWritten)) {
    return;
  }
  std::string text = line.facilityWord + " " + line.Control() + " " + QuotedArgument(line.target);
  for (const std::string& argument : line.arguments) {
    text += " " + QuotedArgument(argument);
  }
  const PolicyLine again = ReadPolicyLine(text);
  Require(again.actions == line.actions && again.target == line.target && again.arguments == line.arguments,
          "a line that was read can be written");
}

void CheckText(const std::string& content) {
  const PolicyText text(content);
  Require(text.Content() == content, "the text has the bytes it was made of");
  std::size_t last = 0;
  for (std::size_t index = 0; index < text.Lines().size(); ++index) {
    const LogicalLine& line = text.Lines()[index];
    Require(last <= line.firstLine && 1 <= line.firstLine && line.firstLine <= line.lastLine &&
                line.lastLine <= text.FileLineCount(),
            "the lines stand in their order");
    last = line.lastLine;
    CheckWrittenLine(ReadPolicyLine(line.text));
  }
  // A change reads the whole text again, so that not every line of a long one can have its turn.
  for (std::size_t index = 0; index < text.Lines().size(); index += text.Lines().size() / 8 + 1) {
    CheckChanges(text, index);
  }
}

/// The files of a system, as parts of the input that this byte separates.
std::vector<std::string> Parts(const std::string& input) {
  std::vector<std::string> parts;
  std::istringstream stream(input);
  for (std::string part; std::getline(stream, part, '\x1f');) {
    parts.push_back(part);
  }
  parts.resize(3);
  return parts;
}

void CheckStacks(const std::string& input) {
  const std::vector<std::string> parts = Parts(input);
  const Policy policy =
      velmorctl::pam::ResolvePolicy("svc", [&parts](const std::string& path) -> FileReading {
        if (path == "/etc/pam.d/svc") {
          return {parts[0], std::nullopt};
        }
        if (path == "/etc/pam.d/part") {
          return {parts[1], std::nullopt};
        }
        return path == "/etc/pam.d/other" ? FileReading{parts[2], std::nullopt} : FileReading();
      });
  Require(policy.state == Policy::State::Usable || !policy.findings.empty(),
          "a service that is refused has a finding");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string input(reinterpret_cast<const char*>(data), size);
  CheckText(input);
  CheckStacks(input);
  velmorctl::pam::WithoutOwnLines(input);
  velmorctl::pam::ModulesOfOwnLines(input);
  return 0;
}
