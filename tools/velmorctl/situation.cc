#include "situation.h"

#include <filesystem>
#include <fstream>
#include <iterator>

namespace velmorctl {

namespace {

constexpr std::uintmax_t greatestWatchedSize = 1 << 20;

std::optional<std::string> ContentOf(const std::string& file) {
  std::error_code error;
  if (!std::filesystem::is_regular_file(file, error) ||
      std::filesystem::file_size(file, error) > greatestWatchedSize) {
    return std::nullopt;
  }
  std::ifstream stream(file, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(stream), {});
}

}  // namespace

void Situation::Watch(const std::string& file) {
  files_.push_back({file, ContentOf(file)});
}

void Situation::AddChange(const std::string& change) {
  changes_.push_back(change);
}

void Situation::ForgetChanges() {
  changes_.clear();
}

std::vector<std::string> Situation::Changes() const {
  std::vector<std::string> changes = changes_;
  for (const WatchedFile& watched : files_) {
    if (ContentOf(watched.file) != watched.content) {
      changes.push_back(watched.file);
    }
  }
  return changes;
}

}  // namespace velmorctl
