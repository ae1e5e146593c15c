/// Memory that the plug-in hands to the library. Each result is one block, so that ReleaseResult frees an
/// array with all that it points to.
#ifndef SAMBA_PLUGIN_RESULT_MEMORY_H
#define SAMBA_PLUGIN_RESULT_MEMORY_H

#include <string>
#include <vector>

#include "authentication/plugin/active_directory_client.h"

namespace sambaprovider {

struct DomainNames {
  std::string dnsName;
  std::string netbiosName;
};

extern "C" void ReleaseResult(void* memory);

/// All throw std::bad_alloc.
char* CopyForCaller(const std::string& text);
char** CopyForCaller(const std::vector<std::string>& texts);
ActiveDirectoryDomainPair** CopyForCaller(const std::vector<DomainNames>& domains);

}  // namespace sambaprovider

#endif  // SAMBA_PLUGIN_RESULT_MEMORY_H
