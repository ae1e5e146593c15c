#include "systemconfiguration/reference/pam_reference.h"

#include <cctype>
#include <sstream>

namespace reference {
namespace {

// The message loses as many leading characters as the number says; past its end nothing is left.
std::string Shortened(const std::string& literal, unsigned number) {
  return number < literal.size() ? literal.substr(number) : std::string();
}

}  // namespace

unsigned ControlNumber(const std::string& text) {
  if (!text.empty() && text.front() == '[' && text.back() == ']') return 7;
  if (text == "required") return 1;
  if (text == "requisite") return 2;
  if (text == "sufficient") return 3;
  if (text == "optional") return 4;
  if (text == "include") return 5;
  if (text == "substack") return 6;
  throw InvalidControl("Invalid Control: " + text);
}

std::string ControlWord(const PamEntry& entry) {
  switch (entry.control) {
    case 1:
      return "required";
    case 2:
      return "requisite";
    case 3:
      return "sufficient";
    case 4:
      return "optional";
    case 5:
      return "include";
    case 6:
      return "substack";
    case 7:
      return entry.controlText;
    default:
      throw InvalidControl(Shortened("Invalid Control: ", entry.control));
  }
}

unsigned FacilityNumber(const std::string& word) {
  if (word == "auth") return 2;
  if (word == "account") return 1;
  if (word == "password") return 3;
  if (word == "session") return 4;
  throw InvalidFacility("Invalid Facility: " + word);
}

std::string FacilityWord(unsigned facility) {
  switch (facility) {
    case 1:
      return "account";
    case 2:
      return "auth";
    case 3:
      return "password";
    case 4:
      return "session";
    default:
      throw InvalidFacility(Shortened("Invalid Facility: ", facility));
  }
}

void ReadFacility(std::istream& stream, unsigned& facility) {
  std::string word;
  stream >> word;
  facility = FacilityNumber(word);
}

void ReadEntry(std::istream& stream, PamEntry& entry) {
  std::string accumulated;
  std::string first;
  stream >> first;
  accumulated += first;
  if (!first.empty() && first.front() == '[' && first.back() != ']') {
    while (true) {
      std::string next;
      stream >> next;
      if (stream.fail() || next.empty()) break;
      accumulated += ' ';
      accumulated += next;
      if (next.back() == ']') break;
    }
  }
  const unsigned control = ControlNumber(accumulated);
  entry.control = control;
  entry.controlText = control == 7 ? accumulated : std::string();

  stream >> entry.module;

  std::string rest;
  std::getline(stream, rest, '\n');
  std::istringstream words(rest);
  std::string word;
  while (words >> word) entry.parameters.push_back(word);
}

void ReadPolicy(std::istream& stream, PamPolicy& policy) {
  if (stream.fail()) return;
  while (true) {
    int next = stream.peek();
    while (std::isspace(next) != 0) {
      stream.get();
      next = stream.peek();
    }
    if (next == '#') {
      std::string comment;
      std::getline(stream, comment, '\n');
    } else if (next == std::istream::traits_type::eof()) {
      return;
    } else {
      unsigned facility = 0;
      ReadFacility(stream, facility);
      PamEntry entry;
      ReadEntry(stream, entry);
      policy.stacks[facility].push_back(entry);
    }
    if (stream.fail()) return;
  }
}

void WriteEntry(std::ostream& stream, const PamEntry& entry) {
  stream << ControlWord(entry);
  stream << "\t";
  stream << entry.module;
  stream << "\t";
  for (const std::string& parameter : entry.parameters) {
    stream << parameter;
    stream << " ";
  }
}

void WritePolicy(std::ostream& stream, const PamPolicy& policy) {
  stream << "#%PAM-1.0" << std::endl;
  stream << std::endl;
  for (const auto& [facility, entries] : policy.stacks) {
    for (const PamEntry& entry : entries) {
      stream << FacilityWord(facility);
      stream << "\t";
      WriteEntry(stream, entry);
      stream << std::endl;
    }
    stream << std::endl;
  }
}

}  // namespace reference
