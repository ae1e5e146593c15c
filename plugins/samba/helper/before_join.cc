#include "helper/before_join.h"

#include <string>

#include "common/files.h"
#include "common/paths.h"
#include "common/smb_conf.h"
#include "helper/winbind_service.h"

namespace sambaprovider::before_join {
namespace {

std::string CopyOf(const char* name) {
  return std::string(paths::kBeforeFolder) + "/" + name;
}

const std::string kSmbConfCopy = CopyOf("smb.conf");
const std::string kKeytabCopy = CopyOf("krb5.keytab");
const std::string kServiceMark = CopyOf("winbindd-was-running");

void Copy(const std::string& from, const std::string& to) {
  if (const auto content = ReadFile(from)) ReplaceFile(to, *content, 0600);
}

void GiveBack(const std::string& copy, const std::string& to, mode_t mode) {
  if (const auto content = ReadFile(copy)) {
    ReplaceFile(to, *content, mode);
  } else {
    RemoveFile(to);
  }
}

bool SmbConfIsAdministrators() {
  return OwnerOfSmbConf(ReadFile(paths::kSmbConf), ReadFile(paths::kWrittenSmbConf),
                        ReadFile(paths::kDistributionSmbConf)) == SmbConfOwner::kAdministrator;
}

}  // namespace

void PutAside() {
  DropCopies();
  MakeFolder(paths::kBeforeFolder, 0700);
  Copy(paths::kSmbConf, kSmbConfCopy);
  Copy(paths::kKeytab, kKeytabCopy);
  if (winbind_service::IsRunning()) ReplaceFile(kServiceMark, "", 0600);
}

void GiveBack() {
  if (!FileExists(paths::kBeforeFolder)) return;
  if (!SmbConfIsAdministrators()) GiveBack(kSmbConfCopy, paths::kSmbConf, 0644);
  GiveBack(kKeytabCopy, paths::kKeytab, 0600);
}

bool ServiceWasRunning() {
  return FileExists(kServiceMark);
}

void DropCopies() {
  RemoveFile(paths::kWrittenSmbConf);
  RemoveFolder(paths::kBeforeFolder);
}

}  // namespace sambaprovider::before_join
