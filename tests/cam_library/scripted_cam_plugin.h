/// A CAM proxy plug-in that does what the test says.
#ifndef CAM_LIBRARY_SCRIPTED_CAM_PLUGIN_H
#define CAM_LIBRARY_SCRIPTED_CAM_PLUGIN_H

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace testsupport {

/// Handles the plug-in's operations. At first the domain is CORP and the account "HOST1$" with the blob
/// "blob".
struct CamScript {
  std::function<std::uint32_t(const char*, int, const char*, char**, char**, char**)> getDomainInfo;
  std::function<std::uint32_t(const char*, const char*, const char*, int, const char*, char**, char**)>
      createMachineAccount;
  int domainRequests = 0;
  int creations = 0;
  std::vector<std::string> released;  /// the texts, in the order of their release
};

/// Copies a built plug-in ("scripted_cam", "no_cam_symbol", "without_domain_info", ...) to where the library
/// looks.
void InstallCamPlugin(const std::string& name);

/// Names the plug-in in the CAM provider configuration.
void ConfigureCamProvider(const std::string& name);

/// Installs and configures "scripted_cam", and returns its script. Once in a process.
CamScript& UseScriptedCamPlugin();

}  // namespace testsupport

#endif  // CAM_LIBRARY_SCRIPTED_CAM_PLUGIN_H
