#include "cam/plugin.h"

#include <dlfcn.h>

#include <stdexcept>

#include "support/files.h"

namespace camtest {

namespace {

std::string Take(const Plugin& plugin, char* text) {
  if (text == nullptr) return {};
  std::string copy = text;
  plugin.Operations().releaseString(text);
  return copy;
}

}  // namespace

Plugin::Plugin() : handle_(dlopen(CAM_PLUGIN, RTLD_LAZY | RTLD_GLOBAL)), operations_(nullptr) {
  if (handle_ == nullptr) throw std::runtime_error(dlerror());
  void* symbol = dlsym(handle_, CAM_PROXY_CLIENT_OPERATIONS_SYMBOL);
  operations_ = static_cast<const struct CAMProxyClientOperations*>(symbol);
  if (operations_ == nullptr) throw std::runtime_error("no table of operations");
}

Plugin::~Plugin() {
  dlclose(handle_);
}

DomainResult Plugin::GetDomain(const std::string& thumbprint, const std::string& server) const {
  char* netbios = nullptr;
  char* dns = nullptr;
  char* sid = nullptr;
  const auto status = operations_->getDomainInfo(server.c_str(), thumbprint.empty() ? 0 : 1,
                                                 thumbprint.c_str(), &netbios, &dns, &sid);
  return {status, Take(*this, netbios), Take(*this, dns), Take(*this, sid)};
}

AccountResult Plugin::Create(const std::string& hostName, const std::string& thumbprint,
                             const char* container) const {
  char* name = nullptr;
  char* blob = nullptr;
  const auto status =
      operations_->createMachineAccount(LOOPBACK.c_str(), hostName.c_str(), container,
                                        thumbprint.empty() ? 0 : 1, thumbprint.c_str(), &name, &blob);
  return {status, Take(*this, name), Take(*this, blob)};
}

void WriteSettings(std::uint16_t port, const std::string& lines) {
  testsupport::WriteFile(SETTINGS, "port = \"" + std::to_string(port) + "\"\n" + lines);
  testsupport::SetMode(SETTINGS, 0600);
}

}  // namespace camtest
