/// Asks a store with a time-out of its own, for the tests: reads one question per line, and answers each with
/// a line of the milliseconds that it took and the answer.
///
/// usage: store_questioner TIMEOUT_SECONDS
///   questions: "trust-state", "trusted-domains", "relationship DOMAIN", "configuration"
#include <chrono>
#include <cstdlib>
#include <exception>
#include <iostream>
#include <memory>
#include <sstream>
#include <string>

#include "authentication/authentication.h"

namespace {

using quenix::authentication::ActiveDirectoryStore;
using quenix::authentication::ActiveDirectoryStoreConfiguration;
using quenix::authentication::Domain;
using quenix::authentication::StoreConfiguration;

std::string TrustedDomains(const ActiveDirectoryStore& store) {
  std::string names;
  for (const Domain& domain : store.GetTrustedDomains()) {
    names += (names.empty() ? "" : " ") + domain.dnsName;
  }
  return names;
}

std::string Configuration(const ActiveDirectoryStore& store) {
  const std::unique_ptr<StoreConfiguration> answer = store.GetStoreConfiguration();
  const auto& configuration = dynamic_cast<const ActiveDirectoryStoreConfiguration&>(*answer);
  return configuration.activeDomain.dnsName + " " + configuration.machineAccountDN;
}

std::string Answer(const ActiveDirectoryStore& store, const std::string& question) {
  std::istringstream words(question);
  std::string kind;
  std::string argument;
  words >> kind >> argument;
  if (kind == "trust-state") return std::to_string(store.GetDomainTrustState());
  if (kind == "trusted-domains") return TrustedDomains(store);
  if (kind == "relationship") return std::to_string(store.GetDomainTrustRelationship(argument));
  if (kind == "configuration") return Configuration(store);
  return "there is no such question";
}

std::string AnswerOrFailure(const ActiveDirectoryStore& store, const std::string& question) {
  try {
    return Answer(store, question);
  } catch (const std::exception& failure) {
    return std::string("failed: ") + failure.what();
  }
}

int AnswerAll(int timeoutSeconds) {
  using Clock = std::chrono::steady_clock;
  const ActiveDirectoryStore store(timeoutSeconds);
  std::string question;
  while (std::getline(std::cin, question)) {
    const Clock::time_point start = Clock::now();
    const std::string answer = AnswerOrFailure(store, question);
    const auto taken = std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - start);
    std::cout << taken.count() << ' ' << answer << std::endl;
  }
  return EXIT_SUCCESS;
}

}  // namespace

int main(int argumentCount, char** arguments) {
  try {
    if (argumentCount != 2) throw std::invalid_argument("usage: store_questioner TIMEOUT_SECONDS");
    return AnswerAll(std::stoi(arguments[1]));
  } catch (const std::exception& failure) {
    std::cerr << failure.what() << '\n';
    return EXIT_FAILURE;
  }
}
