#include "service/token_store.h"

#include <gnutls/crypto.h>
#include <gnutls/gnutls.h>

#include <algorithm>
#include <array>
#include <cstring>

namespace camd {
namespace {

constexpr size_t kIdBytes = 8;
constexpr size_t kSecretBytes = 32;
constexpr size_t kDigestBytes = 32;

constexpr const char* kSchema = R"(
  CREATE TABLE IF NOT EXISTS tokens (
    id TEXT PRIMARY KEY,
    digest TEXT NOT NULL,
    hostName TEXT NOT NULL,
    made INTEGER NOT NULL,
    expires INTEGER NOT NULL,
    used INTEGER NOT NULL DEFAULT 0,
    usedBy TEXT NOT NULL DEFAULT '');
)";

constexpr const char* kColumns = "SELECT id, hostName, made, expires, used, usedBy, digest FROM tokens ";

Token TokenOf(const Statement& row) {
  return {row.Text(0), row.Text(1), row.Number(2), row.Number(3), row.Number(4), row.Text(5)};
}

void WriteHex(const unsigned char* bytes, size_t size, char* text) {
  constexpr const char* kDigits = "0123456789abcdef";
  for (size_t index = 0; index < size; ++index) {
    *text++ = kDigits[bytes[index] >> 4];
    *text++ = kDigits[bytes[index] & 15];
  }
}

std::string DigestOf(std::string_view text) {
  std::array<unsigned char, kDigestBytes> digest = {};
  gnutls_hash_fast(GNUTLS_DIG_SHA256, text.data(), text.size(), digest.data());
  std::string hex(2 * digest.size(), '\0');
  WriteHex(digest.data(), digest.size(), hex.data());
  return hex;
}

}  // namespace

TokenStore::TokenStore(const std::string& ledgerFile) : database_(ledgerFile) {
  database_.Execute(kSchema);
}

Secret TokenStore::Add(const std::string& hostName, int64_t now, int64_t expires) {
  std::array<unsigned char, kIdBytes + kSecretBytes> random;
  if (gnutls_rnd(GNUTLS_RND_KEY, random.data(), random.size()) != 0) {
    throw DatabaseError("there are no random numbers to be had");
  }
  Secret text(2 * random.size() + 1);
  WriteHex(random.data(), kIdBytes, text.Data());
  text.Data()[2 * kIdBytes] = '.';
  WriteHex(random.data() + kIdBytes, kSecretBytes, text.Data() + 2 * kIdBytes + 1);
  explicit_bzero(random.data(), random.size());
  const std::lock_guard lock(mutex_);
  Statement(database_, "INSERT INTO tokens (id, digest, hostName, made, expires) VALUES (?, ?, ?, ?, ?)")
      .Bind(text.View().substr(0, 2 * kIdBytes))
      .Bind(DigestOf(text.View()))
      .Bind(hostName)
      .Bind(now)
      .Bind(expires)
      .Run();
  return text;
}

std::optional<Token> TokenStore::Find(std::string_view text, int64_t now) {
  const std::string digest = DigestOf(text);
  const std::lock_guard lock(mutex_);
  Statement rows(database_, std::string(kColumns) + "WHERE id = ? AND used = 0 AND expires > ?");
  if (!rows.Bind(text.substr(0, text.find('.'))).Bind(now).Next()) return std::nullopt;
  const std::string known = rows.Text(6);
  if (known.size() != digest.size() || gnutls_memcmp(known.data(), digest.data(), digest.size()) != 0) {
    return std::nullopt;
  }
  return TokenOf(rows);
}

bool TokenStore::Claim(const std::string& id, const std::string& hostName, int64_t now) {
  const std::lock_guard lock(mutex_);
  Statement(database_, "UPDATE tokens SET used = ?, usedBy = ? WHERE id = ? AND used = 0")
      .Bind(now)
      .Bind(hostName)
      .Bind(id)
      .Run();
  return database_.ChangedRows() == 1;
}

void TokenStore::Release(const std::string& id) {
  const std::lock_guard lock(mutex_);
  Statement(database_, "UPDATE tokens SET used = 0, usedBy = '' WHERE id = ?").Bind(id).Run();
}

std::vector<Token> TokenStore::List() {
  const std::lock_guard lock(mutex_);
  Statement rows(database_, std::string(kColumns) + "ORDER BY made, id");
  std::vector<Token> tokens;
  while (rows.Next()) tokens.push_back(TokenOf(rows));
  return tokens;
}

bool TokenStore::Remove(const std::string& id) {
  const std::lock_guard lock(mutex_);
  Statement(database_, "DELETE FROM tokens WHERE id = ?").Bind(id).Run();
  return database_.ChangedRows() == 1;
}

}  // namespace camd
