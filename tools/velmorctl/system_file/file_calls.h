/// System calls on files that several parts of the editing need.
#ifndef VELMORCTL_SYSTEM_FILE_FILE_CALLS_H
#define VELMORCTL_SYSTEM_FILE_FILE_CALLS_H

#include <sys/types.h>

#include <string>
#include <string_view>

#include "velmor/unique_fd.h"

namespace velmorctl {

/// A failure (Configuration) of a call on a file: "cannot DOING 'PATH': " and the system's text. Only root
/// may do it when the system refuses it to another user.
[[noreturn]] void ThrowFileFailure(const std::string& doing, const std::string& path, int errorNumber);

/// Opens the folder for reading. Throws Failure: Conflict when a symbolic link is at the path or on the way
/// there, which a path that RootFolder::Resolve() gave only has when somebody has put one there since.
velmor::UniqueFd OpenFolder(const std::string& path);

bool IsFolder(const std::string& path);

/// Makes the folder with this mode, whatever the umask. No failure when there is one. Throws Failure.
void MakeDurableFolder(const std::string& path, mode_t mode);

/// Makes a file that does not exist yet, readable by its owner only, and its content durable; the folder's
/// entry is not. Throws Failure.
void WriteNewFile(const std::string& path, std::string_view content);

/// Makes the entries of the folder durable. Throws Failure.
void SyncFolder(const std::string& path);

/// The folder that a file lies in.
std::string FolderOf(const std::string& path);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_FILE_CALLS_H
