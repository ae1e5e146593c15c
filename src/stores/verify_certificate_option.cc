#include "stores/verify_certificate_option.h"

#include <cstdint>
#include <memory>

#include "authentication/library_exceptions.h"
#include "hostmgmt/host.h"
#include "hostmgmt/host_management_exception.h"

namespace quenix::authentication {

namespace {

using HostMgmt::Adv::AdvancedIntegerOption;
using HostMgmt::Lib::HostMgmtException;

std::int64_t ReadOption() {
  const auto root = HostMgmt::HostFactory::GetHost()->GetAdvancedOptions();
  if (!root) throw HostMgmtException("Unable to get root option branch");
  const auto branch = root->GetChild("UserVars");
  if (!branch) throw HostMgmtException("Unable to get user from root");
  const auto option = std::dynamic_pointer_cast<const AdvancedIntegerOption>(
      branch->GetOption("ActiveDirectoryVerifyCAMCertificate"));
  if (!option) throw HostMgmtException("Unable to get the user option");
  return option->GetValue();
}

std::int64_t ReadOptionOrThrow() {
  try {
    return ReadOption();
  } catch (const HostMgmtException&) {
    throw InvalidVerifyCAMCertificateOptionException(
        "Unable to get advanced option UserVars.ActiveDirectoryVerifyCAMCertificate");
  }
}

}  // namespace

bool MustVerifyCAMCertificate() {
  const std::int64_t value = ReadOptionOrThrow();
  if (value != 0 && value != 1) {
    throw InvalidVerifyCAMCertificateOptionException(
        "Invalid value for UserVars.ActiveDirectoryVerifyCAMCertificate");
  }
  return value == 1;
}

}  // namespace quenix::authentication
