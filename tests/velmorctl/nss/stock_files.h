/// Name-service switch files in the shapes that distributions ship.
#ifndef VELMORCTL_NSS_STOCK_FILES_H
#define VELMORCTL_NSS_STOCK_FILES_H

#include <string>
#include <vector>

namespace velmorctltest {

struct StockFile {
  const char* name;
  std::string text;
  int checkExitCode;  /// of "nss check" where no libraries are looked at
};

std::vector<StockFile> StockFiles();

}  // namespace velmorctltest

#endif  // VELMORCTL_NSS_STOCK_FILES_H
