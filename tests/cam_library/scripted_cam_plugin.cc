#include "cam_library/scripted_cam_plugin.h"

#include <dlfcn.h>

#include <cstdlib>
#include <cstring>
#include <stdexcept>

#include "authentication/plugin/cam_proxy_client.h"
#include "support/files.h"

namespace testsupport {

namespace {

CamScript& TheCamScript() {
  static CamScript script;
  return script;
}

void Connect(struct CAMProxyClientOperations& answers) {
  answers.getDomainInfo = [](auto... arguments) {
    ++TheCamScript().domainRequests;
    return TheCamScript().getDomainInfo(arguments...);
  };
  answers.createMachineAccount = [](auto... arguments) {
    ++TheCamScript().creations;
    return TheCamScript().createMachineAccount(arguments...);
  };
  answers.releaseString = [](char* text) {
    TheCamScript().released.emplace_back(text);
    std::free(text);
  };
}

}  // namespace

void InstallCamPlugin(const std::string& name) {
  CopyFile(std::string(VELMOR_CAM_PLUGIN_FOLDER "/lib").append(name).append(".so"),
           PLUGIN_FOLDER + "lib" + name + ".so");
}

void ConfigureCamProvider(const std::string& name) {
  WriteFile(CAMPROVIDER_CONF, "provider = \"" + name + "\"\n");
}

CamScript& UseScriptedCamPlugin() {
  InstallCamPlugin("scripted_cam");
  ConfigureCamProvider("scripted_cam");
  void* plugin = dlopen((PLUGIN_FOLDER + "libscripted_cam.so").c_str(), RTLD_NOW | RTLD_GLOBAL);
  if (plugin == nullptr) throw std::runtime_error(dlerror());
  CamScript& script = TheCamScript();
  script.getDomainInfo = [](const char*, int, const char*, char** netbios, char** dns, char** sid) {
    *netbios = strdup("CORP");
    *dns = strdup("corp.example");
    *sid = strdup("S-1-5-21-1-2-3");
    return 0U;
  };
  script.createMachineAccount = [](const char*, const char*, const char*, int, const char*, char** account,
                                   char** blob) {
    *account = strdup("HOST1$");
    *blob = strdup("blob");
    return 0U;
  };
  Connect(*static_cast<struct CAMProxyClientOperations*>(dlsym(plugin, "scriptedCamAnswers")));
  return script;
}

}  // namespace testsupport
