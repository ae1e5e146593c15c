#include "meanings.h"

#include <algorithm>
#include <iterator>

#include "authentication/exception.h"
#include "authentication/library_exceptions.h"
#include "hostmgmt/host_management_exception.h"
#include "orvconfigstore/config_store_exception.h"

namespace velmorctl {

namespace {

namespace authentication = quenix::authentication;

constexpr char checkPassword[] =
    "check the user name and the password; more wrong attempts may lock the account";
constexpr char checkAccount[] =
    "ask the domain's administrator about the account, or use another one with -U";
constexpr char checkNetwork[] =
    "check the domain's name, the name servers in /etc/resolv.conf and the way to the domain controllers";
constexpr char checkHostName[] =
    "give the host a name of at most 15 characters that resolves (hostnamectl set-hostname, /etc/hosts)";
constexpr char checkService[] = "look into the system log for the directory service (for example winbind)";
constexpr char checkProvider[] =
    "\"velmorctl provider list\" shows the providers and what is wrong with them";
constexpr char checkClock[] = "set the host's clock by the domain controllers (at most 300 seconds apart)";
constexpr char checkStore[] =
    "look at /var/lib/quenix/configstore.db: free space, permissions; a damaged file must come from a backup";
constexpr char joinAgain[] = "leave the domain with an account (velmorctl leave -U USER) and join it again";
constexpr char checkProxy[] = "check the proxy's address and its certificate";
constexpr char checkLog[] = "look into the system log and the provider's record of attempts";
constexpr char checkArgument[] = "check the arguments; the provider found one of them malformed";

struct CodeRow {
  unsigned long code;
  Meaning meaning;
};

/// By status code, ascending. Some codes have no class of their own in the library.
constexpr CodeRow codeRows[] = {
    {2, {ExitCode::Other, checkLog}},
    {5, {ExitCode::CredentialsRefused, "use an account that may do this in the domain, with -U"}},
    {86, {ExitCode::CredentialsRefused, checkPassword}},
    {87, {ExitCode::Other, checkArgument}},
    {120,
     {ExitCode::ProviderUnusable, "choose a provider that has it with \"velmorctl provider use\"", true}},
    {267,
     {ExitCode::Other, "give an organizational unit that exists, for example corp.example/Servers/Hosts"}},
    {609, {ExitCode::ProviderUnusable, checkProvider}},
    {1060,
     {ExitCode::HostNotReady, "install the directory service that the provider needs (for example winbind)"}},
    {1061, {ExitCode::Conflict, "wait until the other join, leave or change has ended, then try again"}},
    {1062, {ExitCode::HostNotReady, checkService}},
    {1064,
     {ExitCode::HostNotReady, "the provider's record of attempts says which file of the host is in the way"}},
    {1067, {ExitCode::HostNotReady, checkLog}},
    {1201, {ExitCode::DomainNotReachable, checkNetwork}},
    {1210, {ExitCode::HostNotReady, checkHostName}},
    {1212, {ExitCode::DomainNotReachable, checkNetwork}},
    {1216, {ExitCode::CredentialsRefused, checkPassword}},
    {1222, {ExitCode::DomainNotReachable, checkNetwork}},
    {1223, {ExitCode::Other, "try again"}},
    {1225, {ExitCode::DomainNotReachable, checkNetwork}},
    {1229, {ExitCode::DomainNotReachable, checkNetwork}},
    {1311,
     {ExitCode::DomainNotReachable,
      "the domain exists, but no domain controller answers: check the way to them"}},
    {1315, {ExitCode::CredentialsRefused, "write the user as \"name\", \"DOMAIN\\name\" or \"name@domain\""}},
    {1317, {ExitCode::CredentialsRefused, checkAccount}},
    {1324, {ExitCode::CredentialsRefused, checkPassword}},
    {1325, {ExitCode::CredentialsRefused, checkPassword}},
    {1326, {ExitCode::CredentialsRefused, checkPassword}},
    {1327, {ExitCode::CredentialsRefused, checkAccount}},
    {1328, {ExitCode::CredentialsRefused, checkAccount}},
    {1329, {ExitCode::CredentialsRefused, checkAccount}},
    {1330, {ExitCode::CredentialsRefused, "set a new password for the account first"}},
    {1331, {ExitCode::CredentialsRefused, checkAccount}},
    {1355, {ExitCode::DomainNotReachable, checkNetwork}},
    {1398, {ExitCode::HostNotReady, checkClock}},
    {1786, {ExitCode::TrustBroken, joinAgain}},
    {1787, {ExitCode::TrustBroken, joinAgain}},
    {1793, {ExitCode::CredentialsRefused, checkAccount}},
    {1810, {ExitCode::TrustBroken, joinAgain}},
    {1907, {ExitCode::CredentialsRefused, "set a new password for the account first"}},
    {1909, {ExitCode::CredentialsRefused, "have the domain's administrator unlock the account"}},
    {2138, {ExitCode::HostNotReady, checkService}},
    {2224,
     {ExitCode::Conflict,
      "a computer account of this name belongs to another host: rename this host, or remove that account, or "
      "let the provider's settings take it over"}},
    {2691, {ExitCode::Conflict, "leave the domain first: velmorctl leave"}},
    {2692, {ExitCode::NotJoined, "join a domain first: velmorctl join DOMAIN"}},
    {10060, {ExitCode::DomainNotReachable, checkNetwork}},
    {0x80090325, {ExitCode::Proxy, checkProxy}},
};
static_assert(std::is_sorted(std::begin(codeRows), std::end(codeRows),
                             [](const CodeRow& left, const CodeRow& right) {
                               return left.code < right.code;
                             }));

template <class Class>
bool Is(const std::exception& exception) {
  return dynamic_cast<const Class*>(&exception) != nullptr;
}

struct ClassRow {
  bool (*matches)(const std::exception&);
  Meaning meaning;
};

constexpr ClassRow classRows[] = {
    {Is<authentication::ProviderCallTimedOutException>, {ExitCode::DomainNotReachable, checkNetwork}},
    {Is<authentication::ConfigurationError>, {ExitCode::Configuration, "correct the file"}},
    {Is<authentication::IOError>,
     {ExitCode::Configuration, "make the file and its directory readable and writable, with free space"}},
    {Is<authentication::FilePermissionError>,
     {ExitCode::Configuration,
      "the file was replaced; give it the owner and permissions that it should have"}},
    {Is<authentication::InvalidKeyException>, {ExitCode::Configuration, "correct the file"}},
    {Is<authentication::UnknownRemoteAuthenticationStoreException>,
     {ExitCode::Configuration, "velmorctl store use None"}},
    {Is<authentication::InvalidRemoteAuthenticationStoreException>,
     {ExitCode::Configuration, "velmorctl store use None"}},
    {Is<authentication::InvalidActiveDirectoryProviderException>,
     {ExitCode::ProviderUnusable, checkProvider}},
    {Is<authentication::InvalidHostNameException>, {ExitCode::HostNotReady, checkHostName}},
    {Is<authentication::InvalidCredentialsException>, {ExitCode::CredentialsRefused, checkPassword}},
    {Is<authentication::InvalidCAMProxyProviderException>, {ExitCode::Proxy, checkProxy}},
    {Is<authentication::InvalidThumbprintStoreException>, {ExitCode::Proxy, checkProxy}},
    {Is<authentication::InvalidIPAddressException>, {ExitCode::Proxy, checkProxy}},
    {Is<authentication::InvalidVerifyCAMCertificateOptionException>,
     {ExitCode::Proxy, "velmorctl option set UserVars.ActiveDirectoryVerifyCAMCertificate 1"}},
    {Is<authentication::InvalidCertificateException>, {ExitCode::Proxy, checkProxy}},
    {Is<authentication::InvalidCAMCertificateException>, {ExitCode::Proxy, checkProxy}},
    {Is<OrvConfigStore::ConfigStoreException>, {ExitCode::Configuration, checkStore}},
    {Is<HostMgmt::Lib::HostMgmtException>,
     {ExitCode::HostNotReady, "correct what the message names, then try again"}},
};

constexpr Meaning otherMeaning = {ExitCode::Other, checkLog};

}  // namespace

const Meaning& MeaningOf(const std::exception& exception) {
  const auto* coded = dynamic_cast<const authentication::Exception*>(&exception);
  if (coded != nullptr && coded->Code() != 0) {
    const auto* row =
        std::lower_bound(std::begin(codeRows), std::end(codeRows), coded->Code(),
                         [](const CodeRow& left, unsigned long code) { return left.code < code; });
    return row != std::end(codeRows) && row->code == coded->Code() ? row->meaning : otherMeaning;
  }
  const auto* row =
      std::find_if(std::begin(classRows), std::end(classRows),
                   [&exception](const ClassRow& candidate) { return candidate.matches(exception); });
  return row != std::end(classRows) ? row->meaning : otherMeaning;
}

}  // namespace velmorctl
