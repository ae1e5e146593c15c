#include "pam_edit/directory_module.h"

#include <algorithm>
#include <sstream>

#include "active_provider.h"
#include "failure.h"
#include "text.h"

namespace velmorctl::pam {

namespace {

std::vector<std::string> Words(const std::string& text) {
  std::istringstream stream(text);
  std::vector<std::string> words;
  for (std::string word; stream >> word;) {
    words.push_back(word);
  }
  return words;
}

/// Whether the word means itself in a policy file and in a profile of pam-auth-update: no comment, no
/// bracket, no continued line.
bool IsPlainWord(const std::string& word) {
  return !word.empty() && std::all_of(word.begin(), word.end(), [](unsigned char character) {
    return character > 0x20 && character < 0x7f &&
           std::string_view("#[]\\").find(static_cast<char>(character)) == std::string_view::npos;
  });
}

void RequirePlain(const PluginDescription& plugin, const std::string& word) {
  if (!IsPlainWord(word)) {
    throw Failure(ExitCode::ProviderUnusable, "the provider's PAM module cannot be used")
        .Detail("file", plugin.file)
        .Detail("value", Printable(word))
        .Detail("reason", "the plug-in names a PAM module or parameter that cannot stand in a policy file")
        .Try(
            "install the package that brings this plug-in again, or choose another provider with "
            "\"velmorctl provider use\"");
  }
}

}  // namespace

DirectoryModule ReadDirectoryModule(const RootFolder& root) {
  PluginDescription plugin = ActiveProvider(root);
  DirectoryModule module = {plugin.name, plugin.pamModule, Words(plugin.pamModuleParameters)};
  RequirePlain(plugin, module.name);
  for (const std::string& parameter : module.parameters) {
    RequirePlain(plugin, parameter);
  }
  return module;
}

}  // namespace velmorctl::pam
