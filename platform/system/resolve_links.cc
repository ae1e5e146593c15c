#include "system/resolve_links.h"

#include <cerrno>
#include <filesystem>
#include <system_error>

#include "system/system_error.h"

namespace HostMgmt::System {
namespace {

// As many as the kernel follows in one path.
constexpr int kMaximumLinks = 40;

}  // namespace

std::string ResolveLinks(const std::string& path) {
  std::filesystem::path current(path);
  for (int followed = 0; followed <= kMaximumLinks; ++followed) {
    std::error_code error;
    const std::filesystem::path target = std::filesystem::read_symlink(current, error);
    // EINVAL: there is something, which is no link. ENOENT: there is nothing.
    if (error.value() == EINVAL || error.value() == ENOENT) return current.string();
    if (error) ThrowFileError("follow", path, error.value());
    // Joining an absolute target gives that target. The path is not normalised: ".." after a directory that
    // is itself a link does not lead back to where the link stands.
    current = current.parent_path() / target;
  }
  ThrowFileError("follow", path, ELOOP);
}

std::string LinkTarget(const std::string& path) {
  const std::string target = ResolveLinks(path);
  if (target == path) return {};
  std::error_code error;
  const std::filesystem::path canonical = std::filesystem::weakly_canonical(target, error);
  return error ? std::filesystem::path(target).lexically_normal().string() : canonical.string();
}

std::string DirectoryOf(const std::string& path) {
  const std::string directory = std::filesystem::path(path).parent_path().string();
  return directory.empty() ? "." : directory;
}

}  // namespace HostMgmt::System
