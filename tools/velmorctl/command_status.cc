/// velmorctl status: where the host stands.
#include <CLI/App.hpp>
#include <iostream>

#include "command.h"
#include "output.h"
#include "settings_file.h"
#include "status.h"
#include "text.h"
#include "trust_names.h"

namespace velmorctl {

namespace {

struct Options {
  bool json = false;
  int timeoutSeconds = defaultTimeoutSeconds;
};

Json TextOrNull(const std::string& text) {
  return text.empty() ? Json() : Json(text);
}

Json AsJson(const TrustedDomain& trusted) {
  return {{"dnsName", trusted.domain.dnsName},
          {"netbiosName", trusted.domain.netbiosName},
          {"relationship", TrustRelationshipName(trusted.relationship.value)},
          {"live", trusted.relationship.live}};
}

Json FailuresAsJson(const Status& status) {
  Json failures = Json::array();
  for (const FailedQuestion& failure : status.failures) {
    failures.push_back({{"question", failure.question}, {"reason", failure.reason}});
  }
  return failures;
}

Json DomainAsJson(const Status& status) {
  const auto& configuration = status.configuration.value;
  Json trustedDomains = Json::array();
  for (const TrustedDomain& trusted : status.trustedDomains.value) {
    trustedDomains.push_back(AsJson(trusted));
  }
  return {
      {"dnsName", status.DomainName()},
      {"netbiosName", TextOrNull(configuration.activeDomain.netbiosName)},
      {"organizationalUnit", status.joinRecord ? TextOrNull(status.joinRecord->organizationalUnit) : Json()},
      {"machineAccountDN", TextOrNull(configuration.machineAccountDN)},
      {"domainController", TextOrNull(status.domainController.value_or(""))},
      {"preferredDomainControllers", configuration.preferredDomainControllers},
      {"trustState", TrustStateName(status.trustState.value)},
      {"trustStateLive", status.trustState.live},
      {"trustedDomains", trustedDomains},
      {"trustedDomainsLive", status.trustedDomains.live},
      {"failures", FailuresAsJson(status)}};
}

Json AsJson(const Status& status) {
  return {{"schema", "velmor.status/1"},
          {"store", status.store},
          {"provider", TextOrNull(status.provider)},
          {"providerProblem", status.problem ? Json(*status.problem) : Json()},
          {"joined", status.Joined()},
          {"recordedDomain", status.joinRecord ? Json(status.joinRecord->domainName) : Json()},
          {"domain", status.Joined() ? DomainAsJson(status) : Json()},
          {"live", !status.problem && status.Live()}};
}

/// What an answer that is not the provider's own is marked with.
std::string Marked(const std::string& text, bool live) {
  return live ? text : (text.empty() ? "no answer" : text + "  (no answer; from the cache)");
}

std::string DomainText(const Status& status) {
  const auto& domain = status.configuration.value.activeDomain;
  if (!status.configuration.live) {
    return Marked(status.DomainName(), false);
  }
  if (domain.dnsName.empty()) {
    return status.DomainName() + "  (as recorded at the join; the provider does not name it)";
  }
  return domain.netbiosName.empty() ? domain.dnsName : domain.dnsName + " (" + domain.netbiosName + ")";
}

using Rows = std::vector<std::vector<std::string>>;

void AddDomainRows(Rows& rows, const Status& status) {
  const auto& configuration = status.configuration.value;
  const auto& preferred = configuration.preferredDomainControllers;
  std::vector<std::string> preferredNames(preferred.begin(), preferred.end());
  std::string unit = status.joinRecord ? status.joinRecord->organizationalUnit : "";
  std::string controller = status.domainController.value_or("");
  rows.push_back({"Domain:", DomainText(status)});
  rows.push_back({"Organizational unit:", unit.empty() ? "none named at the join" : unit});
  rows.push_back({"Machine account:", Marked(configuration.machineAccountDN, status.configuration.live)});
  rows.push_back({"Domain controller:", Marked(controller, status.domainController.has_value())});
  rows.push_back({"Preferred controllers:", preferred.empty() ? "none" : Join(preferredNames, ", ")});
  rows.push_back({"Trust state:", Marked(TrustStateName(status.trustState.value), status.trustState.live)});
  if (status.trustedDomains.value.empty()) {
    bool live = status.trustedDomains.live;
    rows.push_back({"Trusted domains:", Marked(live ? "none" : "", live)});
  }
  rows.push_back({"Answers:", status.Live() ? "live" : "some are missing or from the cache"});
  for (const FailedQuestion& failure : status.failures) {
    rows.push_back({"Failed:", failure.question + ": " + failure.reason});
  }
}

Rows StatusRows(const Status& status) {
  Rows rows = {{"Store:", status.store}, {"Provider:", status.provider.empty() ? "none" : status.provider}};
  if (status.problem) {
    rows.push_back({"Provider's problem:", *status.problem});
  }
  if (status.Joined()) {
    AddDomainRows(rows, status);
    return rows;
  }
  rows.push_back({"Domain:", status.configuration.live || status.problem ? "not joined" : "no answer"});
  if (status.joinRecord) {
    rows.push_back(
        {"Recorded domain:", status.joinRecord->domainName + "  (\"velmorctl leave\" removes the record)"});
  }
  return rows;
}

void PrintTrustedDomains(const Status& status) {
  Rows rows = {{"Trusted domain", "NetBIOS name", "Relationship"}};
  for (const TrustedDomain& trusted : status.trustedDomains.value) {
    rows.push_back({trusted.domain.dnsName, trusted.domain.netbiosName,
                    Marked(TrustRelationshipName(trusted.relationship.value), trusted.relationship.live)});
  }
  std::cout << "\n";
  PrintTable(rows);
}

void Print(const Status& status) {
  PrintTable(StatusRows(status));
  if (!status.trustedDomains.value.empty()) {
    PrintTrustedDomains(status);
  }
  if (status.Joined() && status.store == "None") {
    std::cout
        << "\nThe host is joined, but its store is \"None\": users of the domain are not authenticated.\n"
           "\"velmorctl store use 'Active Directory'\" changes that.\n";
  }
}

ExitCode Show(const Options& options, Situation& situation) {
  situation.doing = "ask for the host's state";
  Status status = CollectStatus(std::chrono::seconds(options.timeoutSeconds));
  if (options.json) {
    PrintJson(AsJson(status));
  } else {
    Print(status);
  }
  return status.Code();
}

}  // namespace

void AddStatusCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* status = root.add_subcommand("status", "Show the store, the domain and the state of the trust");
  AddJsonFlag(*status, options->json);
  AddTimeoutOption(*status, options->timeoutSeconds);
  Bind(*status, invocation, options, Show);
}

}  // namespace velmorctl
