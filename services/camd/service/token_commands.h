// The commands with which an administrator hands out one-use tokens.
#ifndef CAMD_SERVICE_TOKEN_COMMANDS_H
#define CAMD_SERVICE_TOKEN_COMMANDS_H

#include <chrono>
#include <string>

namespace camd {

// All work on the ledger file that the configuration at `path` names, as the user who owns its folder when
// root calls, so that the service can go on reading it. They print to standard output and throw
// ConfigurationError or DatabaseError. The service may be running.

void AddToken(const std::string& path, const std::string& hostName, std::chrono::hours lifetime);
void ListTokens(const std::string& path);
// False when there is no such token.
bool RemoveToken(const std::string& path, const std::string& id);

}  // namespace camd

#endif  // CAMD_SERVICE_TOKEN_COMMANDS_H
