#include "helper/machine_password.h"

#include <fcntl.h>
#include <sys/stat.h>
extern "C" {
#include <tdb.h>
}

#include <cstdlib>
#include <memory>

#include "common/names.h"
#include "common/paths.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

struct DatabaseRelease {
  void operator()(tdb_context* database) const { tdb_close(database); }
};

}  // namespace

std::optional<int64_t> MachinePasswordTime(const std::string& netbiosDomain) {
  const std::unique_ptr<tdb_context, DatabaseRelease> database(
      tdb_open(paths::kSecrets, 0, TDB_DEFAULT, O_RDONLY | O_CLOEXEC, 0600));
  if (database == nullptr) return std::nullopt;
  std::string key = "SECRETS/MACHINE_LAST_CHANGE_TIME/" + UpperCase(netbiosDomain);
  const TDB_DATA found =
      tdb_fetch(database.get(), TDB_DATA{reinterpret_cast<unsigned char*>(key.data()), key.size()});
  const std::unique_ptr<unsigned char, decltype(&free)> value(found.dptr, free);
  if (found.dsize != 4) return std::nullopt;
  int64_t seconds = 0;
  for (int byte = 3; byte >= 0; --byte) seconds = seconds * 256 + found.dptr[byte];
  return seconds;
}

}  // namespace sambaprovider
