#include "pam_edit/model_agreement.h"

#include <optional>
#include <sstream>

#include "pam_edit/local_guard.h"
#include "systemconfiguration/systemconfiguration.h"

namespace velmorctl::pam {

namespace {

using SystemConfiguration::PAMEntry;
using SystemConfiguration::PAMFacility;
using SystemConfiguration::PAMPolicy;
using SystemConfiguration::PAMStack;

constexpr PAMFacility::Facility facilities[] = {PAMFacility::Auth, PAMFacility::Account,
                                                PAMFacility::Password, PAMFacility::Session};

std::optional<PAMPolicy> Read(const std::string& content) {
  PAMPolicy policy("policy");
  std::istringstream stream(content);
  try {
    stream >> policy;
  } catch (const SystemConfiguration::InvalidControlException&) {
    return std::nullopt;
  } catch (const SystemConfiguration::InvalidFacilityException&) {
    return std::nullopt;
  }
  return policy;
}

bool IsOwn(const PAMEntry& entry, const OwnModules& own) {
  bool primer = entry.module() == "pam_permit.so" &&
                entry.control() == SystemConfiguration::PAMControl::Required && entry.parameters().empty();
  bool guard = entry.module() == guardModule && entry.control() == std::string(guardControl) &&
               entry.parameters().empty();
  return primer || guard || own.contains(entry.module());
}

bool StacksAgree(const PAMStack& without, const PAMStack& with, const OwnModules& own) {
  auto next = without.begin();
  for (const PAMEntry& entry : with) {
    if (next != without.end() && *next == entry) {
      ++next;
    } else if (!IsOwn(entry, own)) {
      return false;
    }
  }
  return next == without.end();
}

}  // namespace

bool ModelAgrees(const std::string& without, const std::string& with, const OwnModules& own) {
  std::optional<PAMPolicy> before = Read(without);
  if (!before) {
    return true;
  }
  std::optional<PAMPolicy> after = Read(with);
  if (!after) {
    return false;
  }
  for (PAMFacility::Facility facility : facilities) {
    if (!StacksAgree((*before)[facility], (*after)[facility], own)) {
      return false;
    }
  }
  return true;
}

}  // namespace velmorctl::pam
