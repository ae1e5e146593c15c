#include "plugins/scripted_plugin.h"

#include <dlfcn.h>

#include <cstdlib>
#include <cstring>
#include <mutex>
#include <stdexcept>

#include "support/files.h"

namespace testsupport {
namespace {

constinit std::mutex releasedMutex;

// Both are never destroyed: a worker of the library may still be in an operation while the process ends.
std::vector<void*>& ReleasedList() {
  static auto* list = new std::vector<void*>;
  return *list;
}

Script& TheScript() {
  static auto* script = new Script;
  return *script;
}

void NoteRelease(void* memory) {
  const std::lock_guard lock(releasedMutex);
  ReleasedList().push_back(memory);
}

void Succeed(Script& script) {
  script.joinDomain = [](auto...) { return 0U; };
  script.partDomain = [](auto...) { return 0U; };
  script.getActiveDomain = [](auto* domain, auto* release) { return Answer(domain, release, {"", ""}); };
  script.setPreferredDomainControllers = [](auto...) { return 0U; };
  script.getPreferredDomainControllers = [](char*** names, auto* release) {
    return Answer(names, release, std::vector<std::string>());
  };
  script.reserved = [] { std::abort(); };
  script.getDomainTrustState = [] { return TRUST_STATE_HEALTHY; };
  script.getTrustedDomains = [](auto*** domains, auto* release) {
    return Answer(domains, release, std::vector<NamePair>());
  };
  script.getMachineAccountDN = [](char** text, auto* release) { return Answer(text, release, ""); };
  script.getAnyDomainController = [](const char*, const char*, char** text, auto* release) {
    return Answer(text, release, "");
  };
  script.convertCanonicalUsername = [](const char*, char** text, auto* release) {
    return Answer(text, release, "");
  };
  script.joinDomainWithMachineAccount = [](auto...) { return 0U; };
  script.getHostPrincipalForDomain = [](const char*, char** text, auto* release) {
    return Answer(text, release, "");
  };
  script.getDomainTrustRelationship = [](auto...) { return TRUST_RELATIONSHIP_TWO_WAY; };
  script.setSmartCardEnabledServices = [](auto...) { return 0U; };
  script.getSmartCardEnabledServices = [](char*** names, auto* release) {
    return Answer(names, release, std::vector<std::string>());
  };
}

void Connect(struct ActiveDirectoryClientOperations& answers) {
  answers.joinDomain = [](auto... arguments) { return TheScript().joinDomain(arguments...); };
  answers.partDomain = [](auto... arguments) { return TheScript().partDomain(arguments...); };
  answers.getActiveDomain = [](auto... arguments) { return TheScript().getActiveDomain(arguments...); };
  answers.setPreferredDomainControllers = [](auto... arguments) {
    return TheScript().setPreferredDomainControllers(arguments...);
  };
  answers.getPreferredDomainControllers = [](auto... arguments) {
    return TheScript().getPreferredDomainControllers(arguments...);
  };
  answers.reserved = [] { TheScript().reserved(); };
  answers.getDomainTrustState = [] { return TheScript().getDomainTrustState(); };
  answers.getTrustedDomains = [](auto... arguments) { return TheScript().getTrustedDomains(arguments...); };
  answers.getMachineAccountDN = [](auto... arguments) {
    return TheScript().getMachineAccountDN(arguments...);
  };
  answers.getAnyDomainController = [](auto... arguments) {
    return TheScript().getAnyDomainController(arguments...);
  };
  answers.convertCanonicalUsername = [](auto... arguments) {
    return TheScript().convertCanonicalUsername(arguments...);
  };
  answers.joinDomainWithMachineAccount = [](auto... arguments) {
    return TheScript().joinDomainWithMachineAccount(arguments...);
  };
  answers.getHostPrincipalForDomain = [](auto... arguments) {
    return TheScript().getHostPrincipalForDomain(arguments...);
  };
  answers.getDomainTrustRelationship = [](auto... arguments) {
    return TheScript().getDomainTrustRelationship(arguments...);
  };
  answers.setSmartCardEnabledServices = [](auto... arguments) {
    return TheScript().setSmartCardEnabledServices(arguments...);
  };
  answers.getSmartCardEnabledServices = [](auto... arguments) {
    return TheScript().getSmartCardEnabledServices(arguments...);
  };
}

template <class Element>
Element* NewArray(std::size_t count) {
  return static_cast<Element*>(std::calloc(count, sizeof(Element)));
}

}  // namespace

std::string BuiltPlugin(const std::string& name) {
  return std::string(VELMOR_TEST_PLUGIN_FOLDER "/lib").append(name).append(".so");
}

std::string InstalledPlugin(const std::string& name) {
  return PLUGIN_FOLDER + "lib" + name + ".so";
}

void InstallPlugin(const std::string& name) {
  CopyFile(BuiltPlugin(name), InstalledPlugin(name));
}

void ConfigureProvider(const std::string& name) {
  WriteFile(PROVIDER_CONF, "provider = \"" + name + "\"\n");
}

Script& UseScriptedPlugin() {
  InstallPlugin("scripted");
  ConfigureProvider("scripted");
  void* plugin = dlopen(InstalledPlugin("scripted").c_str(), RTLD_NOW | RTLD_GLOBAL);
  if (plugin == nullptr) {
    throw std::runtime_error(dlerror());
  }
  Succeed(TheScript());
  Connect(*static_cast<struct ActiveDirectoryClientOperations*>(dlsym(plugin, "scriptedAnswers")));
  return TheScript();
}

std::uint32_t Answer(char** text, ActiveDirectoryFree* release, const std::string& answer) {
  *text = strdup(answer.c_str());
  *release = ReleaseString;
  return 0;
}

std::uint32_t Answer(char*** names, ActiveDirectoryFree* release, const std::vector<std::string>& answer) {
  *names = NewArray<char*>(answer.size() + 1);
  for (std::size_t index = 0; index < answer.size(); ++index) {
    (*names)[index] = strdup(answer[index].c_str());
  }
  *release = ReleaseStrings;
  return 0;
}

std::uint32_t Answer(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release,
                     const NamePair& answer) {
  domain->dnsName = strdup(answer.first.c_str());
  domain->netbiosName = strdup(answer.second.c_str());
  *release = ReleaseString;
  return 0;
}

std::uint32_t Answer(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release,
                     const std::vector<NamePair>& answer) {
  *domains = NewArray<ActiveDirectoryDomainPair*>(answer.size() + 1);
  for (std::size_t index = 0; index < answer.size(); ++index) {
    (*domains)[index] = NewArray<ActiveDirectoryDomainPair>(1);
    (*domains)[index]->dnsName = strdup(answer[index].first.c_str());
    (*domains)[index]->netbiosName = strdup(answer[index].second.c_str());
  }
  *release = ReleaseDomains;
  return 0;
}

void ReleaseString(void* memory) {
  NoteRelease(memory);
  std::free(memory);
}

void ReleaseStrings(void* memory) {
  NoteRelease(memory);
  for (char** name = static_cast<char**>(memory); name != nullptr && *name != nullptr; ++name) {
    std::free(*name);
  }
  std::free(memory);
}

void ReleaseDomains(void* memory) {
  NoteRelease(memory);
  auto** domain = static_cast<ActiveDirectoryDomainPair**>(memory);
  for (; domain != nullptr && *domain != nullptr; ++domain) {
    std::free((*domain)->dnsName);
    std::free((*domain)->netbiosName);
    std::free(*domain);
  }
  std::free(memory);
}

std::vector<void*> Released() {
  const std::lock_guard lock(releasedMutex);
  return ReleasedList();
}

std::vector<std::string> ListOf(const char* const* names) {
  std::vector<std::string> list;
  for (; *names != nullptr; ++names) {
    list.push_back(*names);
  }
  return list;
}

}  // namespace testsupport
