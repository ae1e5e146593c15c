/// Looking at a provider plug-in without trusting it.
#ifndef VELMORCTL_PLUGIN_FILE_H
#define VELMORCTL_PLUGIN_FILE_H

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "file_problem.h"

namespace velmorctl {

inline constexpr char pluginDirectory[] = "/usr/libexec/velmor";

enum class PluginKind { Directory, CamProxy, Unknown };

/// What a plug-in says of itself.
struct PluginDescription {
  std::string name;
  std::string file;
  PluginKind kind = PluginKind::Unknown;
  bool loads = false;  /// whether the dynamic loader takes the file
  std::int32_t apiVersion = 0;
  std::string pamModule;
  std::string pamModuleParameters;
  std::string nssModule;
  std::string nssModuleParameters;
  std::vector<std::pair<std::string, bool>> operations;  /// name, and whether the plug-in has it
  std::optional<FileProblem> problem;                    /// why the library cannot use it
};

/// The names of the operations that a usable plug-in does not have.
std::vector<std::string> MissingOperations(const PluginDescription& plugin);

/// Whether the text can name a provider: it becomes a part of a file name.
bool IsProviderName(const std::string& name);

/// Where the library looks for the provider's plug-in, in its order.
std::vector<std::string> PluginCandidates(const std::string& name);

/// The plug-in that the library would load for the name, looked at. When there is none, `file` is where it
/// should be and `problem` says so.
///
/// The file is loaded in a child process, which is ended when it takes longer than ten seconds: a plug-in
/// that crashes, hangs or exits while it is loaded becomes a problem in the description.
PluginDescription InspectProvider(const std::string& name);

/// The same for every plug-in in the directory, sorted by name, without CAM proxy plug-ins.
std::vector<PluginDescription> InspectAllProviders();

}  // namespace velmorctl

#endif  // VELMORCTL_PLUGIN_FILE_H
