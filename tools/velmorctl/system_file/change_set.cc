#include "system_file/change_set.h"

#include <unistd.h>

#include <cerrno>
#include <utility>

#include "failure.h"
#include "hostmgmt/replace_file.h"
#include "system_file/edit_lock.h"
#include "system_file/file_calls.h"
#include "system_file/signal_hold.h"
#include "system_file/unified_diff.h"
#include "text.h"

namespace velmorctl {

namespace {

void WriteFile(const std::string& path, const std::string& content, const NewFileAttributes& whenNew) {
  const velmor::UniqueFd folder = OpenFolder(FolderOf(path));
  HostMgmt::ReplaceFileIn(folder.Get(), path, content, whenNew);
}

void RemoveFile(const std::string& path) {
  const velmor::UniqueFd folder = OpenFolder(FolderOf(path));
  const std::string name = path.substr(path.rfind('/') + 1);
  if (unlinkat(folder.Get(), name.c_str(), 0) != 0 || fsync(folder.Get()) != 0) {
    ThrowFileFailure("remove", path, errno);
  }
}

std::optional<std::string> ContentBefore(const Snapshot& snapshot) {
  return snapshot.Exists() ? std::optional(snapshot.content) : std::nullopt;
}

/// What the failure that ended the work says; `cause` may come from the platform's writer.
Failure AsFailure(const std::exception& cause) {
  if (const auto* failure = dynamic_cast<const Failure*>(&cause)) {
    return *failure;
  }
  return Failure(ExitCode::Configuration, cause.what())
      .Try("see that the file system is writable and has free space");
}

/// The backup of a change that was undone; the failure that undid it is what counts.
void RemoveNeedless(const BackupStore& store, const std::string& backup, Failure& failure) {
  try {
    store.Remove(backup);
  } catch (const Failure& another) {
    failure.Detail("backup", backup + " stays: " + another.what());
  }
}

}  // namespace

ChangeSet::ChangeSet(RootFolder root, std::string kind, std::string command)
    : root_(std::move(root)), kind_(std::move(kind)), command_(std::move(command)) {}

void ChangeSet::Write(Snapshot before, std::string content, const NewFileAttributes& whenNew) {
  if (!before.Exists() || before.content != content) {
    edits_.push_back({std::move(before), std::move(content), whenNew});
  }
}

void ChangeSet::Remove(Snapshot before) {
  if (before.Exists()) {
    edits_.push_back({std::move(before), std::nullopt, {}});
  }
}

std::string ChangeSet::Diff() const {
  std::string diff;
  for (const Edit& edit : edits_) {
    diff += UnifiedDiff(edit.before.name, ContentBefore(edit.before), edit.after);
  }
  return diff;
}

void ChangeSet::Watch(Situation& situation) const {
  for (const Edit& edit : edits_) {
    situation.Watch(edit.before.path);
  }
}

std::string ChangeSet::Apply() const {
  const SignalHold hold;
  const EditLock lock(root_);
  std::vector<Snapshot> files;
  for (const Edit& edit : edits_) {
    RequireUnchanged(edit);
    files.push_back(edit.before);
  }
  const BackupStore store(root_, kind_);
  const std::string backup = store.Write(command_, files);
  std::size_t performed = 0;
  try {
    for (const Edit& edit : edits_) {
      // The backup has waited for the disk, long enough for others to change the file.
      RequireUnchanged(edit);
      ++performed;
      Perform(edit);
      Prove(edit);
    }
  } catch (const std::exception& cause) {
    UndoAndThrow(performed, store, backup, cause);
  }
  return backup;
}

void ChangeSet::RequireUnchanged(const Edit& edit) const {
  if (!IsStillAsRead(root_, edit.before)) {
    throw Failure(ExitCode::Conflict, "'" + edit.before.shown + "' was changed by somebody else meanwhile")
        .Detail("file", edit.before.shown)
        .Try("run the command again, which then starts from the file as it is now");
  }
}

void ChangeSet::Perform(const Edit& edit) const {
  const std::string& path = edit.before.path;
  if (!edit.after) {
    RemoveFile(path);
  } else {
    WriteFile(path, *edit.after, edit.whenNew);
  }
}

void ChangeSet::Prove(const Edit& edit) const {
  const Snapshot now = ReadSystemFileIfThere(root_, edit.before.name);
  const mode_t mode = edit.before.Exists() ? edit.before.identity->mode & 07777 : edit.whenNew.mode;
  if (now.path != edit.before.path || ContentBefore(now) != edit.after ||
      (now.Exists() && (now.identity->mode & 07777) != mode)) {
    throw Failure(ExitCode::Configuration, "'" + edit.before.shown + "' is not what was written to it")
        .Detail("file", edit.before.shown)
        .Try("see whether another program writes the file, and whether the disk is sound");
  }
}

/// Whether the file is as before. One that holds neither what was there nor what was written belongs to
/// somebody else, and stays; so does one that the name does not lead to any more.
bool ChangeSet::PutBack(const Edit& edit) const {
  try {
    const Snapshot snapshot = ReadSystemFileIfThere(root_, edit.before.name);
    if (snapshot.path != edit.before.path) {
      return false;
    }
    const std::optional<std::string> now = ContentBefore(snapshot);
    const std::optional<std::string> before = ContentBefore(edit.before);
    if (now == before) {
      return true;
    }
    if (now != edit.after) {
      return false;
    }
    if (!before) {
      RemoveFile(edit.before.path);
    } else {
      const FileIdentity& identity = *edit.before.identity;
      WriteFile(edit.before.path, *before, {identity.mode & 07777, identity.owner, identity.group});
    }
    return true;
  } catch (const std::exception&) {
    return false;  // The report names the file, and why the change itself failed.
  }
}

void ChangeSet::UndoAndThrow(std::size_t performed, const BackupStore& store, const std::string& backup,
                             const std::exception& cause) const {
  Failure failure = AsFailure(cause);
  std::vector<std::string> left;
  while (performed-- > 0) {
    if (!PutBack(edits_[performed])) {
      left.push_back(edits_[performed].before.shown);
    }
  }
  if (left.empty()) {
    RemoveNeedless(store, backup, failure);
    throw failure;
  }
  throw failure.Detail("left", Join(left, ", ") + ": not put back")
      .Try("velmorctl " + kind_ + " restore " + backup + root_.Option());
}

}  // namespace velmorctl
