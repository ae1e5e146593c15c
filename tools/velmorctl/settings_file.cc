#include "settings_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <string_view>
#include <system_error>
#include <vector>

#include "authentication/authentication_store_factory.h"
#include "hostmgmt/host_management_exception.h"
#include "hostmgmt/replace_file.h"
#include "text.h"

namespace velmorctl {

namespace {

using quenix::authentication::AuthenticationStoreFactory;
using quenix::authentication::Singleton;

bool IsQuote(char character) {
  return character == '"' || character == '\'';
}

std::string_view Unquoted(std::string_view part) {
  if (part.size() >= 2 && IsQuote(part.front()) && part.front() == part.back()) {
    part = part.substr(1, part.size() - 2);
  }
  return part;
}

using Kind = FileProblem::Kind;

/// Looks through the lines of one file.
class Inspection {
 public:
  Inspection(std::string path, std::string key, std::string example)
      : path_(std::move(path)), key_(std::move(key)), example_(std::move(example)) {}

  std::optional<FileProblem> Run() {
    int descriptor = open(path_.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (descriptor < 0) {
      return CannotOpen(errno);
    }
    close(descriptor);
    if (!std::filesystem::is_regular_file(path_)) {
      return Problem(Kind::Unreadable, 0, "", "it is not a file",
                     "put a file there with the line: " + example_);
    }
    std::ifstream stream(path_);
    int number = 0;
    for (std::string line; std::getline(stream, line);) {
      ++number;
      if (std::optional<FileProblem> problem = InspectLine(line, number)) {
        return problem;
      }
    }
    if (!found_) {
      return Problem(Kind::NoValue, 0, "", "it has no line for the key \"" + key_ + "\"",
                     "add the line: " + example_);
    }
    return std::nullopt;
  }

  /// Where the key stands, and its value; set when Run() found the key.
  int LineOfKey() const { return lineOfKey_; }
  const std::string& Value() const { return value_; }

 private:
  FileProblem Problem(FileProblem::Kind kind, int line, std::string value, std::string reason,
                      std::string remedy) const {
    return {kind, path_, line, std::move(value), std::move(reason), std::move(remedy), false};
  }

  FileProblem CannotOpen(int errorNumber) const {
    if (errorNumber == ENOENT) {
      return Problem(Kind::Missing, 0, "", "it does not exist", "make it with the line: " + example_);
    }
    FileProblem problem =
        Problem(Kind::Unreadable, 0, "", SystemErrorText(errorNumber), "make the file readable");
    if (errorNumber == EACCES && geteuid() != 0) {
      problem.needsRoot = true;
      problem.remedy = "run the command as root";
    }
    return problem;
  }

  std::optional<FileProblem> InspectLine(const std::string& line, int number) {
    if (Trimmed(line).empty()) {
      return std::nullopt;
    }
    std::size_t delimiter = line.find('=');
    if (delimiter == std::string::npos) {
      return Problem(Kind::Malformed, number, line,
                     "the line has no \"=\" (there are no comments in this format)",
                     "write the line as: key = \"value\", or remove it");
    }
    std::string_view keyPart = Trimmed(std::string_view(line).substr(0, delimiter));
    std::string_view valuePart = Trimmed(std::string_view(line).substr(delimiter + 1));
    for (std::string_view part : {valuePart, keyPart}) {
      if (part.size() == 1 && IsQuote(part.front())) {
        return Problem(Kind::Malformed, number, line, "a quote stands alone",
                       "write the line as: key = \"value\"");
      }
    }
    if (Unquoted(keyPart) != key_ || found_) {
      return std::nullopt;
    }
    found_ = true;
    lineOfKey_ = number;
    value_ = Unquoted(valuePart);
    return InspectValue(valuePart, number);
  }

  std::optional<FileProblem> InspectValue(std::string_view part, int number) const {
    std::string remedy = "write the line as: " + example_;
    if (!part.empty() && part.back() == '\r') {
      return Problem(Kind::WrongValue, number, std::string(part),
                     "the line ends in a carriage return, which counts as text",
                     "save the file with line ends of one newline");
    }
    if (Unquoted(part).empty()) {
      return Problem(Kind::NoValue, number, "", "the key \"" + key_ + "\" has no value", remedy);
    }
    if (Unquoted(part).size() == part.size() && (IsQuote(part.front()) || IsQuote(part.back()))) {
      return Problem(Kind::WrongValue, number, std::string(part), "the quotes around the value do not match",
                     remedy);
    }
    return std::nullopt;
  }

  std::string path_;
  std::string key_;
  std::string example_;
  bool found_ = false;
  int lineOfKey_ = 0;
  std::string value_;
};

}  // namespace

SettingsInspection InspectSettingsFile(const std::string& path, const std::string& key,
                                       const std::string& example) {
  Inspection inspection(path, key, example);
  std::optional<FileProblem> problem = inspection.Run();
  return {inspection.Value(), std::move(problem)};
}

SettingsInspection InspectAuthenticationFile() {
  Inspection inspection(authenticationFile, storeKey, std::string(storeKey) + " = \"None\"");
  if (std::optional<FileProblem> problem = inspection.Run()) {
    return {inspection.Value(), std::move(problem)};
  }
  std::vector<std::string> stores = Singleton<AuthenticationStoreFactory>::_instance->GetRegisteredStores();
  if (std::find(stores.begin(), stores.end(), inspection.Value()) != stores.end()) {
    return {inspection.Value(), std::nullopt};
  }
  FileProblem unknownStore = {};
  unknownStore.kind = FileProblem::Kind::WrongValue;
  unknownStore.file = authenticationFile;
  unknownStore.line = inspection.LineOfKey();
  unknownStore.value = inspection.Value();
  unknownStore.reason = "there is no store of this name; there are \"" + Join(stores, "\" and \"") + "\"";
  unknownStore.remedy = "velmorctl store use None";
  return {inspection.Value(), std::move(unknownStore)};
}

SettingsInspection InspectProviderFile() {
  SettingsInspection inspection =
      InspectSettingsFile(providerFile, providerKey, std::string(providerKey) + " = \"samba\"");
  if (inspection.problem &&
      (inspection.problem->kind == Kind::Missing || inspection.problem->kind == Kind::NoValue)) {
    inspection.problem->remedy =
        "velmorctl provider use samba (\"velmorctl provider list\" shows the providers)";
  }
  return inspection;
}

void ReplaceSettingsFile(const std::string& path, const std::map<std::string, std::string>& entries) {
  std::error_code error;
  std::filesystem::create_directories(std::filesystem::path(path).parent_path(), error);
  std::string content;
  for (const auto& [key, value] : entries) {
    content += key + " = \"" + value + "\"\n";
  }
  try {
    HostMgmt::ReplaceFile(path, content);
  } catch (const HostMgmt::Lib::HostMgmtException& exception) {
    throw Failure(ExitCode::Configuration, exception.what())
        .Try("make the directory writable, with free space");
  }
}

}  // namespace velmorctl
