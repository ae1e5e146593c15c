/// velmorctl trust: the trust with the joined domain, and of that with others.
#include <CLI/App.hpp>
#include <iostream>

#include "command.h"
#include "directory.h"
#include "output.h"
#include "status.h"
#include "trust_names.h"

namespace velmorctl {

namespace {

struct Options {
  bool json = false;
  int timeoutSeconds = defaultTimeoutSeconds;
  std::string domain;
};

void PrintAnswer(const std::string& text, bool live) {
  std::cout << text << (live ? "" : "  (no answer; from the cache)") << "\n";
}

ExitCode ShowState(const Options& options, Directory& directory, const std::string& joinedDomain) {
  Answer<TrustState> state = directory.State();
  if (options.json) {
    PrintJson({{"schema", "velmor.trust/1"},
               {"domain", joinedDomain},
               {"state", TrustStateName(state.value)},
               {"stateNumber", static_cast<std::uint32_t>(state.value)},
               {"live", state.live}});
  } else {
    PrintAnswer(TrustStateName(state.value), state.live);
  }
  return state.live ? TrustStateExitCode(state.value) : ExitCode::FromCache;
}

ExitCode ShowRelationship(const Options& options, Directory& directory, const std::string& joinedDomain) {
  Answer<TrustRelationship> relationship = directory.RelationshipWith(options.domain);
  if (options.json) {
    PrintJson({{"schema", "velmor.trust-relationship/1"},
               {"domain", joinedDomain},
               {"with", options.domain},
               {"relationship", TrustRelationshipName(relationship.value)},
               {"relationshipNumber", static_cast<std::uint32_t>(relationship.value)},
               {"live", relationship.live}});
  } else {
    PrintAnswer(TrustRelationshipName(relationship.value), relationship.live);
  }
  return relationship.live ? ExitCode::Fine : ExitCode::FromCache;
}

ExitCode Show(const Options& options, Situation& situation) {
  situation.doing = "ask for the trust";
  Directory directory{std::chrono::seconds(options.timeoutSeconds)};
  std::string joinedDomain = directory.JoinedDomain();
  return options.domain.empty() ? ShowState(options, directory, joinedDomain)
                                : ShowRelationship(options, directory, joinedDomain);
}

ExitCode List(const Options& options, Situation& situation) {
  situation.doing = "ask for the trusted domains";
  Directory directory{std::chrono::seconds(options.timeoutSeconds)};
  std::string joinedDomain = directory.JoinedDomain();
  auto domains = directory.TrustedDomains();
  bool live = domains.live;
  Json entries = Json::array();
  std::vector<std::vector<std::string>> rows = {{"DOMAIN", "NETBIOS NAME", "RELATIONSHIP"}};
  for (const TrustedDomain& trusted : WithRelationships(directory, domains.value)) {
    std::string relationship = TrustRelationshipName(trusted.relationship.value);
    live = live && trusted.relationship.live;
    entries.push_back({{"dnsName", trusted.domain.dnsName},
                       {"netbiosName", trusted.domain.netbiosName},
                       {"relationship", relationship},
                       {"live", trusted.relationship.live}});
    rows.push_back({trusted.domain.dnsName, trusted.domain.netbiosName,
                    relationship + (trusted.relationship.live ? "" : "  (no answer; from the cache)")});
  }
  if (options.json) {
    PrintJson({{"schema", "velmor.trust-list/1"},
               {"domain", joinedDomain},
               {"trustedDomains", entries},
               {"trustedDomainsLive", domains.live}});
  } else {
    PrintTable(rows);
    std::cout << (domains.live ? "" : "The provider did not answer; the list is from the cache.\n");
  }
  return live ? ExitCode::Fine : ExitCode::FromCache;
}

}  // namespace

void AddTrustCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* trust =
      root.add_subcommand("trust", "Show the trust with the domain, or list the trusted domains");
  trust->require_subcommand(1);
  CLI::App* show = trust->add_subcommand("show", "Show the state of the trust with the joined domain");
  show->add_option("DOMAIN", options->domain,
                   "Show instead how the joined domain and this one trust each other");
  CLI::App* list = trust->add_subcommand("list", "List the domains that the joined one trusts");
  for (CLI::App* command : {show, list}) {
    AddJsonFlag(*command, options->json);
    AddTimeoutOption(*command, options->timeoutSeconds);
  }
  Bind(*show, invocation, options, Show);
  Bind(*list, invocation, options, List);
}

}  // namespace velmorctl
