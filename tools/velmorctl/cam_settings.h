/// The settings file of the CAM proxy plug-in, as the command reads and edits it.
#ifndef VELMORCTL_CAM_SETTINGS_H
#define VELMORCTL_CAM_SETTINGS_H

#include <cstdint>
#include <map>
#include <string>

namespace velmorctl {

inline constexpr char camSettingsFile[] = "/etc/quenix/velmor/cam.conf";

struct CamSettings {
  std::uint16_t port = 8443;
  bool hasToken = false;
  std::map<std::string, std::string> pins;  /// "sha256" or "sha256-ADDRESS" -> the digest as it is written

  /// The pin that counts for the server, or an empty text.
  std::string PinFor(const std::string& server) const;
};

/// Reads the file; the defaults when there is none. Throws Failure when it cannot be read, or has a line that
/// is not what the format asks for.
CamSettings ReadCamSettings();

/// Removes every pin from the file and, unless `sha256` is empty, adds that one for all servers. Everything
/// else stays as it is; a new file is readable by its owner only. Throws HostMgmt::Lib::HostMgmtException.
void ReplacePins(const std::string& sha256);

/// The file's whole content, to be put back; for one edit that may have to be undone.
class CamSettingsBackup {
 public:
  CamSettingsBackup();
  CamSettingsBackup(const CamSettingsBackup&) = delete;
  CamSettingsBackup& operator=(const CamSettingsBackup&) = delete;
  ~CamSettingsBackup();

  void Restore() const;

 private:
  bool existed_ = false;
  std::string content_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_CAM_SETTINGS_H
