#include "precheck/directory.h"

#include <charconv>
#include <cstdint>

namespace sambaprovider {

bool IsControllersAccount(const std::string& userAccountControl) {
  constexpr uint32_t kServerTrustAccount = 0x2000;
  constexpr uint32_t kPartialSecretsAccount = 0x4000000;  // of a read-only controller
  int32_t flags = 0;
  const char* const end = userAccountControl.data() + userAccountControl.size();
  if (std::from_chars(userAccountControl.data(), end, flags).ptr != end) return false;
  return (static_cast<uint32_t>(flags) & (kServerTrustAccount | kPartialSecretsAccount)) != 0;
}

ComputerAccount Directory::FindComputer(const velmor::RootEntry& root, const std::string& computer) {
  const auto entry =
      Find(root.baseDn, LDAP_SCOPE_SUBTREE, "(&(objectClass=computer)(sAMAccountName=" + computer + "$))",
           {"dNSHostName", "userAccountControl"});
  if (!entry) return {};
  return {entry->dn, entry->Value("dNSHostName"), IsControllersAccount(entry->Value("userAccountControl"))};
}

}  // namespace sambaprovider
