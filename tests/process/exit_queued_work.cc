// Ends while a host's scheduler still holds work that it never ran.

#include <functional>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"

namespace {

std::vector<std::function<void()>> queue;

}  // namespace

int main() {
  using namespace quenix::authentication;
  testsupport::InstallPlugin("version3");
  testsupport::ConfigureProvider("version3");
  VelmorThreadUtil::SetScheduler([](std::function<void()> work) { queue.push_back(std::move(work)); });
  ActiveDirectoryStore(0).GetTrustedDomains();
  return queue.size() == 1 ? 0 : 1;
}
