/// The thumbprints of CAM servers in a file of their own.
#ifndef AUTHENTICATION_CAM_THUMBPRINT_STORE_H
#define AUTHENTICATION_CAM_THUMBPRINT_STORE_H

#include <string>

#include "authentication/configuration.h"
#include "authentication/export.h"

namespace quenix::authentication {

/// A key-value file whose keys are CAM servers and whose values are the thumbprints of their certificates.
/// The library's own joins use the host configuration store instead. For one thread.
class VELMOR_EXPORT CAMThumbprintStore : public Configuration {
 public:
  /// Reads the file; throws as Configuration does.
  explicit CAMThumbprintStore(const std::string& path);
  ~CAMThumbprintStore() override;

  /// The thumbprint of `server`; empty when it has none.
  std::string LookupThumbprint(const std::string& server) const;

  /// Stores the thumbprint of `server`, and writes the file if that changed anything. Throws as Write() does.
  void ImportThumbprint(const std::string& thumbprint, const std::string& server);
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_CAM_THUMBPRINT_STORE_H
