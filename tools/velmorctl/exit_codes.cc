#include "exit_codes.h"

namespace velmorctl {

namespace {

constexpr ExitCodeMeaning meanings[] = {
    {ExitCode::Fine, "everything is fine"},
    {ExitCode::Other, "another failure"},
    {ExitCode::Usage, "the command line is wrong"},
    {ExitCode::NotJoined, "the host has joined no domain"},
    {ExitCode::TrustBroken, "the trust with the domain is broken"},
    {ExitCode::FromCache, "the provider did not answer in time; the answer is from the cache"},
    {ExitCode::CredentialsRefused, "the credentials were refused"},
    {ExitCode::HostNotReady, "the host is not ready"},
    {ExitCode::DomainNotReachable, "the domain is not reachable"},
    {ExitCode::ProviderUnusable, "the provider is missing or invalid"},
    {ExitCode::Conflict, "a conflict with another command, host or domain"},
    {ExitCode::Configuration, "a configuration file or the configuration store cannot be used"},
    {ExitCode::Proxy, "the join proxy failed"},
    {ExitCode::Difference, "a check or a comparison found a difference"},
    {ExitCode::NeedsRoot, "only root may do this"},
};

}  // namespace

std::span<const ExitCodeMeaning> ExitCodeMeanings() {
  return meanings;
}

}  // namespace velmorctl
