#include "pam_edit/scratch_folder.h"

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <system_error>

#include "failure.h"
#include "text.h"

namespace velmorctl::pam {

namespace {

constexpr std::uintmax_t longestFile = 1 << 20;

[[noreturn]] void ThrowUnusable(const std::string& path, const std::string& reason) {
  throw Failure(ExitCode::HostNotReady, "cannot work in a temporary folder")
      .Detail("file", path)
      .Detail("reason", reason)
      .Try("make room in /tmp, and see that it can be written to");
}

}  // namespace

ScratchFolder::ScratchFolder() {
  char path[] = "/tmp/velmorctl-XXXXXX";
  if (mkdtemp(path) == nullptr) {
    ThrowUnusable(path, SystemErrorText(errno));
  }
  path_ = path;
}

ScratchFolder::~ScratchFolder() {
  std::error_code ignored;  // What cannot be removed is in nobody's way.
  std::filesystem::remove_all(path_, ignored);
}

void ScratchFolder::Write(const std::string& path, const std::string& content) const {
  std::filesystem::path file = path_ + path;
  std::error_code error;
  std::filesystem::create_directories(file.parent_path(), error);
  std::ofstream stream(file, std::ios::binary | std::ios::trunc);
  if (!(stream << content).flush()) {
    ThrowUnusable(file, SystemErrorText(errno));
  }
}

std::string ScratchFolder::Read(const std::string& path) const {
  std::string file = path_ + path;
  std::error_code error;
  std::uintmax_t size = std::filesystem::file_size(file, error);
  if (error) {
    ThrowUnusable(file, error.message());
  }
  if (size > longestFile) {
    ThrowUnusable(file, "it has become larger than a mebibyte");
  }
  std::ifstream stream(file, std::ios::binary);
  std::string content(std::istreambuf_iterator<char>(stream), {});
  if (!stream) {
    ThrowUnusable(file, SystemErrorText(errno));
  }
  return content;
}

}  // namespace velmorctl::pam
