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

void GiveBack(const std::string& copy, const std::string& to) {
  if (!CopyFile(copy, to)) RemoveFile(to);
}

}  // namespace

void PutAside() {
  DropCopies();
  MakeFolder(paths::kBeforeFolder, 0700);
  CopyFile(paths::kSmbConf, kSmbConfCopy);
  CopyFile(paths::kKeytab, kKeytabCopy);
  if (winbind_service::IsRunning()) ReplaceFile(kServiceMark, "", 0600);
}

void GiveBack() {
  if (!FileExists(paths::kBeforeFolder)) return;
  if (OwnerOfPresentSmbConf() != SmbConfOwner::kAdministrator) GiveBack(kSmbConfCopy, paths::kSmbConf);
  // The keys were written to the file behind a link; a file in the link's place would leave them there.
  GiveBack(kKeytabCopy, FileBehindLinks(paths::kKeytab));
}

bool ServiceWasRunning() {
  return FileExists(kServiceMark);
}

void DropCopies() {
  ForgetWrittenSmbConf();
  RemoveFolder(paths::kBeforeFolder);
}

}  // namespace sambaprovider::before_join
