/// The store "Active Directory" as the commands ask it.
#ifndef VELMORCTL_DIRECTORY_H
#define VELMORCTL_DIRECTORY_H

#include <chrono>
#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "answer_watch.h"
#include "authentication/active_directory_store.h"
#include "authentication/directory_records.h"
#include "command_line.h"

namespace velmorctl {

/// Adds --timeout, how many seconds to wait for each answer.
void AddTimeoutOption(CLI::App& command, int& timeoutSeconds);

/// How long the commands that only read wait for an answer unless they are told otherwise.
inline constexpr int defaultTimeoutSeconds = 30;

/// Looks at the configured provider's plug-in in a child process, before the library loads it into this one.
/// Throws Failure when it cannot be used; leaves a fault of provider.conf to the library.
void RequireUsableProvider();

/// The record of the join in the host's configuration store.
struct JoinRecord {
  std::string domainName;
  std::string organizationalUnit;
};

/// The record, or nothing when there is none. Throws OrvConfigStore::ConfigStoreException.
std::optional<JoinRecord> ReadJoinRecord();

/// Asks the store and knows of each answer whether the provider gave it just now. Only one object may exist
/// at a time; for one thread.
class Directory {
 public:
  /// Loads the provider; throws Failure when its plug-in cannot be used, and what the store's constructor
  /// throws.
  explicit Directory(std::chrono::seconds timeout);

  Answer<quenix::authentication::ActiveDirectoryStoreConfiguration> Configuration();
  Answer<std::deque<quenix::authentication::Domain>> TrustedDomains();
  Answer<TrustState> State();
  Answer<TrustRelationship> RelationshipWith(const std::string& domain);

  /// These two have no cache: nothing when the provider does not answer in time.
  std::optional<std::string> ControllerOf(const std::string& domain);
  std::optional<std::vector<std::string>> SmartCardServices();

  /// The DNS name of the joined domain: the provider's or, when that gives none, the one that was recorded
  /// at the join. Throws Failure when there is neither.
  std::string JoinedDomain();

  /// The store itself; shared with threads that may outlive this object.
  std::shared_ptr<quenix::authentication::ActiveDirectoryStore> Store() const { return store_; }

 private:
  AnswerWatch watch_;
  std::shared_ptr<quenix::authentication::ActiveDirectoryStore> store_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_DIRECTORY_H
