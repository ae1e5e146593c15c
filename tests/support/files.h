/// Files of the sandbox: read, write, look at.
#ifndef SUPPORT_FILES_H
#define SUPPORT_FILES_H

#include <string>
#include <vector>

namespace testsupport {

/// Where the library looks for its settings and plug-ins.
inline const std::string CONFIGURATION_FOLDER = "/etc/quenix/velmor/";
inline const std::string AUTHENTICATION_CONF = CONFIGURATION_FOLDER + "authentication.conf";
inline const std::string PROVIDER_CONF = CONFIGURATION_FOLDER + "provider.conf";
inline const std::string CAMPROVIDER_CONF = CONFIGURATION_FOLDER + "camprovider.conf";
inline const std::string PLUGIN_FOLDER = "/usr/libexec/velmor/";

/// Replaces the file's content. Throws std::system_error like all operations here.
void WriteFile(const std::string& path, const std::string& content);
std::string ReadFile(const std::string& path);
void CopyFile(const std::string& from, const std::string& to);
void RemoveFile(const std::string& path);

/// Makes the folder and those above it.
void MakeFolders(const std::string& path);

bool Exists(const std::string& path);

/// The permission bits.
unsigned int ModeOf(const std::string& path);
void SetMode(const std::string& path, unsigned int mode);

/// The names in a folder, in ascending order.
std::vector<std::string> NamesIn(const std::string& folder);

/// A new empty folder that ends with the scope; Path() has a slash at its end.
class ScratchFolder {
 public:
  ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;
  ~ScratchFolder();

  const std::string& Path() const { return path_; }

 private:
  std::string path_;
};

/// A file system of its own with room for `bytes` (rounded up to pages), mounted on `folder` while the scope
/// lasts.
class SmallFileSystem {
 public:
  SmallFileSystem(std::string folder, std::size_t bytes);
  SmallFileSystem(const SmallFileSystem&) = delete;
  SmallFileSystem& operator=(const SmallFileSystem&) = delete;
  ~SmallFileSystem();

 private:
  std::string folder_;
};

}  // namespace testsupport

#endif  // SUPPORT_FILES_H
