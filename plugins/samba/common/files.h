/// Whole files: read, replaced and removed so that a crash or a power loss leaves the old or the new one.
///
/// Every operation throws Failure (kInternalError, with path and reason) unless it says otherwise.
#ifndef SAMBA_COMMON_FILES_H
#define SAMBA_COMMON_FILES_H

#include <sys/types.h>

#include <optional>
#include <string>
#include <string_view>

namespace sambaprovider {

/// The text of an errno value; safe in a program with threads.
std::string ErrorText(int error);

/// The content of a file; nothing when it does not exist.
std::optional<std::string> ReadFile(const std::string& path);

/// Replaces a file through a temporary one beside it and a rename; data and folder are flushed to disk.
void ReplaceFile(const std::string& path, std::string_view content, mode_t mode);

/// Replaces `to` by a copy of `from`, durably, with its owner, group and mode. Returns false, and does
/// nothing, when there is no file to copy.
bool CopyFile(const std::string& from, const std::string& to);

/// The file that a path leads to when links stand in it; the path itself when there is none.
std::string FileBehindLinks(const std::string& path);

/// Removes a file and flushes its folder; one that does not exist is no failure.
void RemoveFile(const std::string& path);

/// Makes a folder; its parents must be there. The mode of one that exists is left alone.
void MakeFolder(const std::string& path, mode_t mode);

/// Removes a folder and the plain files in it; one that does not exist is no failure.
void RemoveFolder(const std::string& path);

bool FileExists(const std::string& path);

bool IsLink(const std::string& path);

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_FILES_H
