#include "pam/person.h"

#include <algorithm>
#include <charconv>
#include <sstream>
#include <vector>

namespace velmorctl::pam {

namespace {

constexpr std::uint32_t assumedDirectoryNumber = 100000;
constexpr std::uint32_t firstOrdinaryNumber = 1000;

std::vector<std::string> Split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::istringstream stream(text);
  for (std::string part; std::getline(stream, part, separator);) {
    parts.push_back(part);
  }
  return parts;
}

/// The records of a file of the form of passwd, those with too few fields left out.
std::vector<std::vector<std::string>> Records(const std::string& content, std::size_t fields) {
  std::vector<std::vector<std::string>> records;
  for (const std::string& line : Split(content, '\n')) {
    std::vector<std::string> record = Split(line, ':');
    if (record.size() >= fields) {
      records.push_back(std::move(record));
    }
  }
  return records;
}

std::optional<std::vector<std::string>> RecordOf(const std::string& name, const std::string& content,
                                                 std::size_t fields) {
  for (std::vector<std::string>& record : Records(content, fields)) {
    if (record[0] == name) {
      return std::move(record);
    }
  }
  return std::nullopt;
}

std::uint32_t NumberOf(const std::string& text) {
  std::uint32_t number = 0;
  std::from_chars(text.data(), text.data() + text.size(), number);
  return number;
}

/// Groups that list the name, and the one with the number.
std::set<std::string> GroupsOf(const std::string& name, std::uint32_t gid, const std::string& content) {
  std::set<std::string> groups;
  for (const std::vector<std::string>& record : Records(content, 3)) {
    std::vector<std::string> members = record.size() > 3 ? Split(record[3], ',') : std::vector<std::string>();
    if (NumberOf(record[2]) == gid || std::find(members.begin(), members.end(), name) != members.end()) {
      groups.insert(record[0]);
    }
  }
  return groups;
}

bool IsLocked(const std::string& name, const std::optional<std::string>& shadow) {
  std::optional<std::vector<std::string>> record = shadow ? RecordOf(name, *shadow, 2) : std::nullopt;
  return record && ((*record)[1].starts_with('!') || (*record)[1].starts_with('*'));
}

Person FromRecord(const std::vector<std::string>& record, const UserFiles& files) {
  Person person;
  person.name = record[0];
  person.local = true;
  person.uid = NumberOf(record[2]);
  person.gid = NumberOf(record[3]);
  person.home = record[5];
  person.shell = record.size() > 6 ? record[6] : "";
  person.groups = GroupsOf(person.name, person.gid, files.group);
  person.locked = IsLocked(person.name, files.shadow);
  return person;
}

}  // namespace

Person FindPerson(const std::string& name, const UserFiles& files) {
  if (std::optional<std::vector<std::string>> record = RecordOf(name, files.passwd, 6)) {
    return FromRecord(*record, files);
  }
  Person person;
  person.name = name;
  person.uid = assumedDirectoryNumber;
  person.gid = assumedDirectoryNumber;
  person.home = "/home/" + name;
  person.shell = "/bin/bash";
  person.assumed = true;
  return person;
}

Person LocalAdministrator() {
  Person person;
  person.name = "administrator";
  person.local = true;
  person.uid = firstOrdinaryNumber;
  person.gid = firstOrdinaryNumber;
  person.home = "/home/administrator";
  person.shell = "/bin/bash";
  person.assumed = true;
  return person;
}

Person Root() {
  Person person;
  person.name = "root";
  person.local = true;
  person.home = "/root";
  person.shell = "/bin/bash";
  person.groups = {"root"};
  return person;
}

}  // namespace velmorctl::pam
