#include "status.h"

#include <algorithm>

#include "authentication/exception.h"
#include "failure.h"
#include "meanings.h"
#include "plugin_file.h"
#include "settings_file.h"
#include "trust_names.h"

namespace velmorctl {

namespace {

/// Why a host that does not use its provider could not ask it, or nothing.
std::optional<std::string> ProviderProblem(const SettingsInspection& settings) {
  std::optional<FileProblem> problem =
      settings.problem ? settings.problem : InspectProvider(settings.value).problem;
  if (!problem) {
    return std::nullopt;
  }
  return problem->file + ": " + problem->reason;
}

/// Asks one question; the answer is empty when it fails.
template <class Question>
auto Attempt(Status& status, const char* name, Question ask) -> decltype(ask()) {
  try {
    return ask();
  } catch (const quenix::authentication::Exception& exception) {
    status.failures.push_back({name, exception.what(), MeaningOf(exception).code});
    return {};
  }
}

Answer<std::vector<TrustedDomain>> TrustedDomainsOf(Directory& directory) {
  auto domains = directory.TrustedDomains();
  return {WithRelationships(directory, domains.value), domains.live};
}

void AskProvider(Status& status, Directory& directory) {
  status.configuration = directory.Configuration();
  if (status.DomainName().empty()) {
    return;
  }
  status.trustState = Attempt(status, "trust state", [&] { return directory.State(); });
  if (!status.Joined()) {
    return;
  }
  status.trustedDomains = Attempt(status, "trusted domains", [&] { return TrustedDomainsOf(directory); });
  status.domainController =
      Attempt(status, "domain controller", [&] { return directory.ControllerOf(status.DomainName()); });
}

}  // namespace

std::vector<TrustedDomain> WithRelationships(Directory& directory,
                                             const std::deque<quenix::authentication::Domain>& domains) {
  std::vector<TrustedDomain> result;
  result.reserve(domains.size());
  for (const quenix::authentication::Domain& domain : domains) {
    result.push_back({domain, directory.RelationshipWith(domain.dnsName)});
  }
  return result;
}

std::string Status::DomainName() const {
  const std::string& name = configuration.value.activeDomain.dnsName;
  return name.empty() && joinRecord ? joinRecord->domainName : name;
}

bool Status::Joined() const {
  return !DomainName().empty() && trustState.value != TRUST_STATE_NOT_JOINED;
}

bool Status::Live() const {
  if (!Joined()) {
    return configuration.live;
  }
  return configuration.live && trustState.live && trustedDomains.live && domainController &&
         std::all_of(trustedDomains.value.begin(), trustedDomains.value.end(),
                     [](const TrustedDomain& trusted) { return trusted.relationship.live; });
}

ExitCode Status::Code() const {
  if (!Joined()) {
    return configuration.live || problem ? ExitCode::NotJoined : ExitCode::FromCache;
  }
  if (problem) {
    return ExitCode::ProviderUnusable;
  }
  ExitCode trust = TrustStateExitCode(trustState.value);
  if (trustState.live && trust != ExitCode::Fine) {
    return trust;
  }
  if (!failures.empty()) {
    return failures.front().code;
  }
  return Live() ? ExitCode::Fine : ExitCode::FromCache;
}

Status CollectStatus(std::chrono::seconds timeout) {
  SettingsInspection authentication = InspectAuthenticationFile();
  if (authentication.problem) {
    throw AsFailure(*authentication.problem, ExitCode::Configuration, "cannot tell which store is active");
  }
  Status status;
  status.store = authentication.value;
  status.joinRecord = ReadJoinRecord();
  SettingsInspection provider = InspectProviderFile();
  status.provider = provider.value;
  if (status.store == "None") {
    status.problem = ProviderProblem(provider);
  }
  if (!status.problem) {
    Directory directory(timeout);
    AskProvider(status, directory);
  }
  return status;
}

}  // namespace velmorctl
