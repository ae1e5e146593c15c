/// Everything that "velmorctl status" knows, collected before any of it is printed.
#ifndef VELMORCTL_STATUS_H
#define VELMORCTL_STATUS_H

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "answer_watch.h"
#include "authentication/directory_records.h"
#include "directory.h"
#include "exit_codes.h"

namespace velmorctl {

struct TrustedDomain {
  quenix::authentication::Domain domain;
  Answer<TrustRelationship> relationship;
};

/// Asks for the relationship with each of the domains.
std::vector<TrustedDomain> WithRelationships(Directory& directory,
                                             const std::deque<quenix::authentication::Domain>& domains);

/// A question that failed, rather than being answered late.
struct FailedQuestion {
  std::string question;
  std::string reason;
  ExitCode code;
};

struct Status {
  std::string store;
  std::string provider;                /// empty when none is configured
  std::optional<std::string> problem;  /// why the provider could not be asked
  std::optional<JoinRecord> joinRecord;
  Answer<quenix::authentication::ActiveDirectoryStoreConfiguration> configuration;
  Answer<TrustState> trustState;
  std::optional<std::string> domainController;  /// nothing when there was no answer in time
  Answer<std::vector<TrustedDomain>> trustedDomains;
  std::vector<FailedQuestion> failures;

  /// The joined domain's DNS name: the provider's or, when that gives none, the recorded one.
  std::string DomainName() const;
  bool Joined() const;

  /// Whether the provider gave every answer just now.
  bool Live() const;

  ExitCode Code() const;
};

/// Asks for everything; a question that fails does not keep the others from being asked. Throws Failure when
/// the active store cannot be told, and what loading the provider throws when the active store needs it; a
/// host whose store is "None" may have a provider that cannot be used, or none.
Status CollectStatus(std::chrono::seconds timeout);

}  // namespace velmorctl

#endif  // VELMORCTL_STATUS_H
