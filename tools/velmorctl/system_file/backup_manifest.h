/// The list of files in a backup, as the JSON document that lies beside them.
#ifndef VELMORCTL_SYSTEM_FILE_BACKUP_MANIFEST_H
#define VELMORCTL_SYSTEM_FILE_BACKUP_MANIFEST_H

#include <string>
#include <string_view>
#include <vector>

#include "system_file/backup_store.h"

namespace velmorctl {

/// SHA-256 in lower-case hexadecimal digits.
std::string Sha256(std::string_view bytes);

/// A listed file: its content lies beside the list in a file called by `copy`; empty when there was none.
struct ListedFile {
  BackedUpFile file;  /// without its content
  std::string copy;
  std::string sha256;
};

struct BackupManifest {
  std::string command;
  std::vector<ListedFile> files;
};

/// Throws Failure (Configuration) for a file whose name is not UTF-8.
std::string ManifestText(const BackupManifest& manifest);

/// Throws std::invalid_argument with the reason when the text is no such list.
BackupManifest ParseManifest(const std::string& text);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_BACKUP_MANIFEST_H
