#include "pam_edit/model_agreement.h"

#include <algorithm>
#include <iterator>
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

/// Whether `with` is `without` and own entries between its entries.
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

bool PoliciesAgree(PAMPolicy& without, PAMPolicy& with, const OwnModules& own) {
  return std::all_of(std::begin(facilities), std::end(facilities), [&](PAMFacility::Facility facility) {
    return StacksAgree(without[facility], with[facility], own);
  });
}

}  // namespace

bool ModelSeesOwnAdded(const std::string& before, const std::string& after, const OwnModules& own) {
  std::optional<PAMPolicy> was = Read(before);
  std::optional<PAMPolicy> is = Read(after);
  return !was || (is && PoliciesAgree(*was, *is, own));
}

bool ModelSeesOwnRemoved(const std::string& before, const std::string& after, const OwnModules& own) {
  std::optional<PAMPolicy> was = Read(before);
  std::optional<PAMPolicy> is = Read(after);
  return !was || (is && PoliciesAgree(*is, *was, own));
}

}  // namespace velmorctl::pam
