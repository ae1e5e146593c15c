#include "system_file/backup_store.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <functional>
#include <regex>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "failure.h"
#include "system_file/backup_manifest.h"
#include "system_file/file_calls.h"
#include "text.h"

namespace velmorctl {

namespace {

constexpr char stateFolder[] = "/var/lib/quenix";
constexpr char manifestName[] = "manifest.json";
constexpr int mostBackupsOfOneSecond = 9999;

bool IsId(const std::string& text) {
  static const std::regex form("[0-9]{8}T[0-9]{6}Z(-[0-9]{4})?");
  return std::regex_match(text, form);
}

std::string TimeStamp() {
  const std::time_t now = std::time(nullptr);
  std::tm fields = {};
  gmtime_r(&now, &fields);
  std::array<char, sizeof("20261121T191500Z")> text = {};
  std::strftime(text.data(), text.size(), "%Y%m%dT%H%M%SZ", &fields);
  return text.data();
}

/// An ID that is greater than the newest one, even when the clock was set back since: the order of the IDs is
/// what tells which backup is the newest.
std::string NextId(const std::string& newest) {
  const std::string stamp = TimeStamp();
  if (stamp > newest) {
    return stamp;
  }
  const std::size_t dash = newest.find('-');
  const int last = dash == std::string::npos ? 1 : std::stoi(newest.substr(dash + 1));
  if (last >= mostBackupsOfOneSecond) {
    throw Failure(ExitCode::Configuration, "no name is left for a backup after " + newest)
        .Try("set the clock, or remove backups that are dated in the future");
  }
  std::array<char, 16> suffix = {};
  std::snprintf(suffix.data(), suffix.size(), "-%04d", last + 1);
  return newest.substr(0, dash) + suffix.data();
}

/// A folder that takes its final name when it is complete; removed again unless that has happened.
class UnfinishedFolder {
 public:
  explicit UnfinishedFolder(const std::string& parent) : path_(parent + "/.unfinished.XXXXXX") {
    if (mkdtemp(path_.data()) == nullptr) {
      ThrowFileFailure("make a folder in", parent, errno);
    }
  }
  UnfinishedFolder(const UnfinishedFolder&) = delete;
  UnfinishedFolder& operator=(const UnfinishedFolder&) = delete;
  ~UnfinishedFolder() {
    if (!finished_) {
      std::error_code ignored;
      std::filesystem::remove_all(path_, ignored);
    }
  }

  std::string PathOf(const std::string& name) const { return path_ + "/" + name; }

  void Finish(const std::string& path) {
    SyncFolder(path_);
    if (std::rename(path_.c_str(), path.c_str()) != 0) {
      ThrowFileFailure("make the folder", path, errno);
    }
    finished_ = true;
    SyncFolder(FolderOf(path));
  }

 private:
  std::string path_;
  bool finished_ = false;
};

BackedUpFile Describe(const Snapshot& snapshot) {
  BackedUpFile file;
  file.name = snapshot.name;
  if (snapshot.identity) {
    file.existed = true;
    file.mode = snapshot.identity->mode & 07777;
    file.owner = snapshot.identity->owner;
    file.group = snapshot.identity->group;
  }
  return file;
}

[[noreturn]] void ThrowDamaged(const std::string& id, const std::string& path, const std::string& reason) {
  throw Failure(ExitCode::Configuration, "the backup " + id + " cannot be used")
      .Detail("file", path)
      .Detail("reason", Printable(reason))
      .Try("restore another backup");
}

std::string ContentOf(const ListedFile& listed, const std::string& id, const Snapshot& copy) {
  if (Sha256(copy.content) != listed.sha256) {
    ThrowDamaged(id, copy.shown, "its bytes are not those that were written when the backup was made");
  }
  return copy.content;
}

}  // namespace

std::string MakeBackupFolder(const RootFolder& root) {
  root.MakeFolder(stateFolder, 0755);
  return root.MakeFolder(backupFolder, 0700);
}

BackupStore::BackupStore(RootFolder root, std::string kind)
    : root_(std::move(root)), kind_(std::move(kind)) {}

std::string BackupStore::Write(const std::string& command, const std::vector<Snapshot>& files) const {
  MakeBackupFolder(root_);
  const std::string folder = root_.MakeFolder(Folder(), 0700);
  const std::vector<std::string> ids = Ids();
  const std::string id = NextId(ids.empty() ? "" : ids.front());
  UnfinishedFolder unfinished(folder);
  BackupManifest manifest = {command, {}};
  for (const Snapshot& snapshot : files) {
    ListedFile listed = {Describe(snapshot), "", ""};
    if (snapshot.Exists()) {
      listed.copy = std::to_string(manifest.files.size());
      listed.sha256 = Sha256(snapshot.content);
      WriteNewFile(unfinished.PathOf(listed.copy), snapshot.content);
    }
    manifest.files.push_back(std::move(listed));
  }
  WriteNewFile(unfinished.PathOf(manifestName), ManifestText(manifest));
  unfinished.Finish(folder + "/" + id);
  return id;
}

std::vector<std::string> BackupStore::Ids() const {
  std::vector<std::string> ids;
  const std::string folder = root_.Resolve(Folder());
  std::error_code error;
  for (std::filesystem::directory_iterator entry(folder, error), end; !error && entry != end;
       entry.increment(error)) {
    if (IsId(entry->path().filename())) {
      ids.push_back(entry->path().filename());
    }
  }
  if (error && error != std::errc::no_such_file_or_directory) {
    ThrowFileFailure("read the folder", folder, error.value());
  }
  std::sort(ids.begin(), ids.end(), std::greater<>());
  return ids;
}

Backup BackupStore::Read(const std::string& id) const {
  const std::vector<std::string> ids = Ids();
  if (std::find(ids.begin(), ids.end(), id) == ids.end()) {
    throw Failure(ExitCode::Usage, "there is no backup '" + id + "'")
        .Try(ids.empty() ? "there are no backups yet" : "there are: " + Join(ids, ", "));
  }
  const std::string folder = Folder() + "/" + id + "/";
  const Snapshot list = ReadSystemFile(root_, folder + manifestName);
  Backup backup = {id, "", {}};
  try {
    const BackupManifest manifest = ParseManifest(list.content);
    backup.command = manifest.command;
    for (const ListedFile& listed : manifest.files) {
      backup.files.push_back(listed.file);
      if (listed.file.existed) {
        backup.files.back().content = ContentOf(listed, id, ReadSystemFile(root_, folder + listed.copy));
      }
    }
  } catch (const std::invalid_argument& exception) {
    ThrowDamaged(id, list.shown, exception.what());
  }
  return backup;
}

void BackupStore::Remove(const std::string& id) const {
  const std::string folder = root_.Resolve(Folder());
  std::error_code error;
  std::filesystem::remove_all(folder + "/" + id, error);
  if (error) {
    ThrowFileFailure("remove", folder + "/" + id, error.value());
  }
  SyncFolder(folder);
}

}  // namespace velmorctl
