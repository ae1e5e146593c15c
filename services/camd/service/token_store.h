// One-use tokens, with which an administrator allows one creation.
#ifndef CAMD_SERVICE_TOKEN_STORE_H
#define CAMD_SERVICE_TOKEN_STORE_H

#include <cstdint>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "common/secret.h"
#include "service/database.h"

namespace camd {

struct Token {
  std::string id;
  std::string hostName;  // a pattern; empty for any allowed name
  int64_t made = 0;
  int64_t expires = 0;
  int64_t used = 0;    // 0 while it is unused
  std::string usedBy;  // the host name that it was used for
};

// Keeps tokens in the ledger's file, each as a digest of its text only. Times are seconds since 1970. All
// operations may be called by any thread, and throw DatabaseError.
class TokenStore {
 public:
  explicit TokenStore(const std::string& ledgerFile);

  // Makes a token; its text, "IDENTIFIER.SECRET", is not to be had again.
  Secret Add(const std::string& hostName, int64_t now, int64_t expires);

  // The token with this text, if it is known, unused and has not expired. The comparison of the secret takes
  // the same time wherever it differs.
  std::optional<Token> Find(std::string_view text, int64_t now);

  // Uses the token up; false when somebody else has been first.
  bool Claim(const std::string& id, const std::string& hostName, int64_t now);
  // Undoes Claim, for a creation that came to nothing.
  void Release(const std::string& id);

  std::vector<Token> List();
  // False when there is no such token.
  bool Remove(const std::string& id);

 private:
  std::mutex mutex_;
  Database database_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_TOKEN_STORE_H
