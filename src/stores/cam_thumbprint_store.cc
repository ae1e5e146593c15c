#include "authentication/cam_thumbprint_store.h"

namespace quenix::authentication {

CAMThumbprintStore::CAMThumbprintStore(const std::string& path) : Configuration(path) {}
CAMThumbprintStore::~CAMThumbprintStore() = default;

std::string CAMThumbprintStore::LookupThumbprint(const std::string& server) const {
  const auto entry = find(server);
  return entry == end() ? "" : entry->second;
}

void CAMThumbprintStore::ImportThumbprint(const std::string& thumbprint, const std::string& server) {
  const auto [entry, added] = try_emplace(server, thumbprint);
  if (!added) {
    if (entry->second == thumbprint) return;
    entry->second = thumbprint;
  }
  Write();
}

}  // namespace quenix::authentication
