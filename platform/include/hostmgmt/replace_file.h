#ifndef HOSTMGMT_REPLACE_FILE_H
#define HOSTMGMT_REPLACE_FILE_H

#include <sys/types.h>

#include <string>

#include "hostmgmt/export.h"

namespace HostMgmt {

/// What a file gets that is not there yet, whatever the process's umask. -1 stands for the process's own user
/// or group.
struct NewFileAttributes {
  mode_t mode = 0644;
  uid_t owner = static_cast<uid_t>(-1);
  gid_t group = static_cast<gid_t>(-1);
};

/// Makes `content` the content of the file at `path`, durably: when the call returns, a crash of the host
/// cannot bring the old content back. Readers see the old content or the new, never a part, and a file that
/// cannot be written stays as it was. Mode, owner, group and extended attributes of an existing file are
/// kept; a new one gets `modeWhenNew`, whatever the process's umask.
///
/// Where `path` is a symbolic link, the file that it leads to is replaced and the link stays. A file that is
/// a mount point of its own cannot be replaced by another one, so it is written in place: then a reader may
/// see a part for a moment.
///
/// May be called on any thread; two writers of one file do not mix their contents, and the last one wins.
/// Blocks as long as the disk takes. Throws Lib::HostMgmtException "Unable to write '<path>': <reason>".
HOSTMGMT_EXPORT void ReplaceFile(const std::string& path, const std::string& content,
                                 mode_t modeWhenNew = 0644);

/// The same for a file in the folder with the open descriptor `folder`, without a symbolic link being
/// followed: the file is what the last part of `path` names there, wherever the rest of `path`, which
/// messages show, leads by now. A link in its place is no regular file, and is refused as such. The
/// descriptor has to be open for reading, and stays the caller's.
HOSTMGMT_EXPORT void ReplaceFileIn(int folder, const std::string& path, const std::string& content,
                                   const NewFileAttributes& whenNew = {});

}  // namespace HostMgmt

#endif
