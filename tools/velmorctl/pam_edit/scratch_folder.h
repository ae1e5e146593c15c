/// A private folder for work that must not be seen or kept.
#ifndef VELMORCTL_PAM_EDIT_SCRATCH_FOLDER_H
#define VELMORCTL_PAM_EDIT_SCRATCH_FOLDER_H

#include <string>

#include "system_file/signal_hold.h"

namespace velmorctl::pam {

/// A new empty folder that only this user can enter; removed with all that is in it when the object goes.
/// Signals that would end the command wait until then, so that the folder does not stay behind. For the only
/// thread. Throws Failure when no folder can be made.
class ScratchFolder {
 public:
  ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;
  ~ScratchFolder();

  /// Without a slash at its end.
  const std::string& Path() const noexcept { return path_; }

  /// Writes a file in it, whose path begins with a slash, and the folders above it.
  void Write(const std::string& path, const std::string& content) const;

  /// The content of a file in it. Throws Failure when it cannot be read, or is larger than a mebibyte.
  std::string Read(const std::string& path) const;

 private:
  SignalHold hold_;
  std::string path_;
};

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_SCRATCH_FOLDER_H
