#include "system_file/root_folder.h"

#include <CLI/App.hpp>
#include <cerrno>
#include <deque>
#include <filesystem>
#include <string_view>
#include <system_error>
#include <vector>

#include "failure.h"
#include "system_file/file_calls.h"
#include "text.h"

namespace velmorctl {

namespace {

// As many as the kernel follows in one path.
constexpr int mostLinks = 40;

/// Puts the parts of a path in front of those that are still to be walked.
void PutInFront(const std::string& path, std::deque<std::string>& parts) {
  std::deque<std::string> own;
  for (const auto& part : std::filesystem::path(path).relative_path()) {
    if (!part.empty() && part != ".") {
      own.push_back(part);
    }
  }
  parts.insert(parts.begin(), own.begin(), own.end());
}

std::string LinkTarget(const std::string& path) {
  std::error_code error;
  const std::filesystem::path target = std::filesystem::read_symlink(path, error);
  return error ? std::string() : target.string();
}

/// The text as one word of a shell's command line.
std::string ShellWord(const std::string& text) {
  constexpr std::string_view plain =
      "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789/._-+,:@%=";
  if (text.find_first_not_of(plain) == std::string::npos) {
    return text;
  }
  std::string word = "'";
  for (const char character : text) {
    word += character == '\'' ? std::string("'\\''") : std::string(1, character);
  }
  return word + "'";
}

}  // namespace

void AddRootOption(CLI::App& command, std::string& root) {
  command.add_option("--root", root, "The folder that stands for /, for example a mounted image")
      ->type_name("DIR");
}

RootFolder::RootFolder(const std::string& folder) {
  std::error_code error;
  folder_ = std::filesystem::canonical(folder, error).string();
  if (!error && !std::filesystem::is_directory(folder_, error)) {
    error = std::make_error_code(std::errc::not_a_directory);
  }
  if (error) {
    throw Failure(ExitCode::Usage, "'" + folder + "' cannot stand for /: " + error.message())
        .Try("give --root a folder that holds the folders etc, usr and var of a system");
  }
}

std::string RootFolder::Shown(const std::string& name) const {
  return IsHost() ? name : folder_ + name;
}

std::string RootFolder::Option() const {
  return IsHost() ? "" : " --root " + ShellWord(folder_);
}

std::string RootFolder::Resolve(const std::string& name) const {
  std::optional<std::string> path = Find(name);
  if (!path) {
    throw Failure(ExitCode::Configuration, "cannot find '" + Shown(name) + "': " + SystemErrorText(ELOOP))
        .Detail("file", Shown(name))
        .Try(circleRemedy);
  }
  return *std::move(path);
}

std::optional<std::string> RootFolder::Find(const std::string& name) const {
  std::deque<std::string> parts;
  PutInFront(name, parts);
  std::vector<std::string> walked;
  const auto pathSoFar = [&] {
    std::string path = IsHost() ? "" : folder_;
    for (const std::string& part : walked) {
      path.append("/").append(part);
    }
    return path;
  };
  int links = 0;
  while (!parts.empty()) {
    const std::string part = parts.front();
    parts.pop_front();
    if (part == "..") {
      if (!walked.empty()) {
        walked.pop_back();
      }
      continue;
    }
    walked.push_back(part);
    const std::string target = LinkTarget(pathSoFar());
    if (target.empty()) {
      continue;
    }
    if (++links > mostLinks) {
      return std::nullopt;
    }
    walked.pop_back();
    if (target.front() == '/') {
      walked.clear();
    }
    PutInFront(target, parts);
  }
  const std::string path = pathSoFar();
  return path.empty() ? "/" : path;
}

bool RootFolder::IsLink(const std::string& name) const {
  const std::filesystem::path path(name);
  const std::optional<std::string> folder = Find(path.parent_path());
  std::error_code error;
  return folder && std::filesystem::is_symlink(std::filesystem::path(*folder) / path.filename(), error);
}

std::string RootFolder::MakeFolder(const std::string& name, mode_t mode) const {
  const std::string path = Resolve(name);
  if (std::filesystem::path(name).has_relative_path() && !IsFolder(path)) {
    MakeFolder(std::filesystem::path(name).parent_path(), mode);
    MakeDurableFolder(path, mode);
  }
  return path;
}

}  // namespace velmorctl
