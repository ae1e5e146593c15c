/// The library's own settings: text files of lines that each hold a key, "=" and a quoted value.
#ifndef AUTHENTICATION_CONFIGURATION_H
#define AUTHENTICATION_CONFIGURATION_H

#include <map>
#include <string>

#include "authentication/export.h"

namespace quenix::authentication {

/// A key-value file, held in memory as an ordered map.
///
/// A snapshot: it does not notice later changes of the file, and is for one thread at a time. Several
/// processes may read and write the same file: it is replaced by rename, so a reader sees a whole file and
/// the last writer wins.
///
/// A line is `key = "value"`; blanks and tabs around both parts, and one pair of equal quotes, do not count.
/// There are no comments and no escapes. Of two lines with the same key the first one counts.
class VELMOR_EXPORT Configuration : public std::map<std::string, std::string> {
 public:
  /// Reads the file at `path`.
  /// Throws IOError when it cannot be opened or read, and ConfigurationError, which names the line, when a
  /// line has no "=" or a part of it is one quote alone.
  explicit Configuration(const std::string& path);
  Configuration(const Configuration& other);
  Configuration& operator=(const Configuration& other);
  virtual ~Configuration();

  /// Replaces the file by this map's entries, one line each, in the order of the keys. The permission bits of
  /// an existing file stay; a new file is readable by its owner only. Returns when the data is on the disk.
  /// Throws IOError when the file cannot be created, written or renamed: the old file is then as it was, and
  /// what was written lies beside it. Throws FilePermissionError when the file was replaced but has other
  /// permissions.
  virtual void Write() const;

  /// The value of `key`, which must exist. Throws InvalidKeyException.
  const std::string& operator[](const std::string& key) const;

  /// As above; the value can be changed in place. *Deliberate:* unlike a plain map's, it never inserts, so
  /// that a misspelt key cannot become a new setting. A new key is added with insert().
  std::string& operator[](const std::string& key);

  /// The file that this was read from and is written to.
  const std::string& Path() const noexcept { return path_; }

 private:
  std::string path_;
};

/// Which store is active: "/etc/quenix/velmor/authentication.conf", key "remote-authentication-store".
class VELMOR_EXPORT AuthenticationConfiguration : public Configuration {
 public:
  /// Reads the file; throws as Configuration does, also when the file does not exist.
  AuthenticationConfiguration();
  ~AuthenticationConfiguration() override;
};

/// Which Active Directory provider plug-in to load: "/etc/quenix/velmor/provider.conf", key "provider".
class VELMOR_EXPORT ProviderConfiguration : public Configuration {
 public:
  /// Reads the file; throws as Configuration does, also when the file does not exist.
  ProviderConfiguration();
  ~ProviderConfiguration() override;
};

/// Which CAM proxy plug-in to load: "/etc/quenix/velmor/camprovider.conf", key "provider".
class VELMOR_EXPORT CAMProviderConfiguration : public Configuration {
 public:
  /// Reads the file; throws as Configuration does, also when the file does not exist.
  CAMProviderConfiguration();
  ~CAMProviderConfiguration() override;
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_CONFIGURATION_H
