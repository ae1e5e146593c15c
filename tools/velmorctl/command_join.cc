/// velmorctl join: makes the host a member of a domain.
#include <CLI/App.hpp>
#include <chrono>
#include <functional>
#include <iostream>
#include <thread>
#include <utility>

#include "account.h"
#include "authentication/active_directory_config_store.h"
#include "command.h"
#include "directory.h"
#include "failure.h"
#include "new_account.h"
#include "operation_lock.h"
#include "orvconfigstore/config_store_exception.h"
#include "password_source.h"
#include "progress.h"
#include "secret.h"
#include "settings_file.h"
#include "signal_pipe.h"
#include "text.h"
#include "trust_names.h"
#include "watched_call.h"

namespace velmorctl {

namespace {

using quenix::authentication::ActiveDirectoryConfigStore;

/// As long as the library's own stores.
constexpr std::chrono::seconds answerTimeout{60};

/// What a leave without an account does not undo.
constexpr char accountStays[] = "the computer account, which stays in the directory";

constexpr char waitForEnd[] =
    "interrupted: when the provider's call has ended, its join is undone (again: leave at once)";

struct Options {
  std::string target;
  std::string userName = "Administrator";
  PasswordSource password;
  bool skipHostNameCheck = false;
  std::string proxy;
  std::string container;

  bool ThroughProxy() const { return !proxy.empty(); }
  std::string Domain() const { return target.substr(0, target.find('/')); }

  /// What is joined, and how, for people.
  std::string Description() const {
    return ThroughProxy() ? "the domain of the CAM service at " + proxy : Domain() + " as " + userName;
  }
};

/// Which domain a join was to. Through the proxy, only the record of the join knows.
std::string JoinedDomain(const Options& options) {
  return options.ThroughProxy() ? ActiveDirectoryConfigStore().GetDomainName() : options.Domain();
}

void WatchHostFiles(Situation& situation) {
  for (const char* file : {authenticationFile, "/etc/hosts", "/etc/resolv.conf", "/etc/samba/smb.conf"}) {
    situation.Watch(file);
  }
}

/// Finds out what would stand in the way after the join, before anything is changed.
void RequireActivation(Directory& directory) {
  SettingsInspection record =
      InspectSettingsFile(authenticationFile, storeKey, "remote-authentication-store = \"None\"");
  if (record.problem) {
    throw AsFailure(*record.problem, ExitCode::Configuration,
                    "the join could not be followed by the store's activation");
  }
  auto configuration = directory.Configuration();
  const std::string& domain = configuration.value.activeDomain.dnsName;
  if (configuration.live && !domain.empty()) {
    throw Failure(ExitCode::Conflict, "the host is joined to " + domain + " already").Try("velmorctl leave");
  }
}

std::shared_ptr<Account> ReadAccount(const Options& options) {
  auto account = std::make_shared<Account>();
  account->userName = options.userName;
  options.password.Read(options.userName, account->password);
  return account;
}

/// Leaves the domain again and removes the record of the join. A join through the proxy has no account.
[[noreturn]] void Undo(Directory& directory, const std::shared_ptr<Account>& account, Progress& progress,
                       SignalPipe& signals, int signalNumber, Situation& situation) {
  progress.Step("undoing the join");
  auto undo = [store = directory.Store(), account] {
    if (!account) {
      store->PartDomain();
      return;
    }
    store->PartDomain(account->AsCredentials());
    ActiveDirectoryConfigStore().RemoveDomainInfo();
  };
  CallOutcome outcome =
      RunWatched(undo, progress, signals, "interrupted: the undoing goes on (again: leave at once)");
  if (outcome.failure) {
    throw Interrupted(signalNumber, "the join could not be undone: \"velmorctl leave\" does it");
  }
  situation.ForgetChanges();
  situation.AddChange(account ? "the computer account, which may stay in the directory, disabled"
                              : accountStays);
  throw Interrupted(signalNumber, "the host has left the domain again");
}

std::function<void()> JoinCall(const Options& options, Directory& directory,
                               const std::shared_ptr<Account>& account) {
  if (options.ThroughProxy()) {
    return [store = directory.Store(), proxy = options.proxy, container = options.container,
            skip = options.skipHostNameCheck] { store->JoinDomainWithCAM(proxy, container, skip); };
  }
  return [store = directory.Store(), account, target = options.target, skip = options.skipHostNameCheck] {
    store->JoinDomain(target, account->AsCredentials(), skip);
  };
}

/// Only what comes after the join itself uses the configuration store; the library then leaves without an
/// account.
void AddWhatStays(const std::exception_ptr& failure, Situation& situation) {
  try {
    std::rethrow_exception(failure);
  } catch (const OrvConfigStore::ConfigStoreException&) {
    situation.AddChange(accountStays);
  } catch (...) {
    // Nothing was joined.
  }
}

void JoinInterruptibly(const Options& options, Directory& directory, const std::shared_ptr<Account>& account,
                       Progress& progress, Situation& situation) {
  SignalPipe signals{SIGINT, SIGTERM, SIGHUP};
  progress.Step(
      "joining " +
      (options.ThroughProxy() ? options.Description() : options.target + " as " + options.userName) +
      (options.skipHostNameCheck ? "" : ", after a check of the host's name"));
  std::function<void()> join = JoinCall(options, directory, account);
  CallOutcome outcome = RunWatched(join, progress, signals, waitForEnd);
  situation.providerReason = progress.ProviderReason();
  if (outcome.failure) {
    AddWhatStays(outcome.failure, situation);
    if (outcome.signalNumber) {
      throw Interrupted(*outcome.signalNumber, FailedByThen("the join", outcome.failure));
    }
    std::rethrow_exception(outcome.failure);
  }
  const std::string domain = JoinedDomain(options);
  situation.AddChange("the host has joined " + domain);
  progress.Step("joined " + domain + " and recorded it");
  if (outcome.signalNumber) {
    Undo(directory, account, progress, signals, *outcome.signalNumber, situation);
  }
}

Answer<TrustState> StateAfterJoin(Directory& directory, Progress& progress) {
  bool told = false;
  return AskAboutNewAccount([&directory] { return directory.State(); },
                            [&progress, &told] {
                              if (!std::exchange(told, true)) {
                                progress.Step("waiting until the controller in use knows the account");
                              }
                              std::this_thread::sleep_for(std::chrono::seconds(1));
                              progress.Tick();
                            });
}

/// Asks the domain whether the join holds. From here on a signal ends the command at once.
ExitCode Verify(Directory& directory, Progress& progress, const std::string& requestedDomain) {
  auto configuration = directory.Configuration();
  Answer<TrustState> state = StateAfterJoin(directory, progress);
  const std::string& domain = configuration.value.activeDomain.dnsName;
  progress.Step("trust state: " + TrustStateName(state.value) + (state.live ? "" : " (no answer in time)"));
  std::cout << "The host is joined to " << Printable(domain.empty() ? requestedDomain : domain)
            << ", and the store \"Active Directory\" is active.\n";
  ExitCode code = state.live ? TrustStateExitCode(state.value) : ExitCode::FromCache;
  if (code != ExitCode::Fine) {
    std::cerr << "velmorctl: warning: the trust could not be verified: " << TrustStateName(state.value)
              << "; try \"velmorctl status\" in a minute\n";
  }
  return code;
}

void RequireTarget(const Options& options) {
  if (options.ThroughProxy() != options.target.empty()) {
    throw Failure(ExitCode::Usage, "give either a domain or a proxy, which knows the domain")
        .Try("velmorctl join corp.example/Servers/Hosts, or velmorctl join --proxy ADDRESS");
  }
  if (!options.ThroughProxy() && options.Domain().empty()) {
    throw Failure(ExitCode::Usage, "the domain is missing").Try("velmorctl join corp.example/Servers/Hosts");
  }
}

ExitCode Join(const Options& options, Situation& situation) {
  RequireRoot("join a domain");
  RequireTarget(options);
  ForbidCoreFiles();
  IgnoreBrokenPipes();
  situation.doing = "join " + options.Description();
  situation.throughProxy = options.ThroughProxy();
  WatchHostFiles(situation);
  OperationLock lock;
  Directory directory(answerTimeout);
  RequireActivation(directory);
  std::shared_ptr<Account> account = options.ThroughProxy() ? nullptr : ReadAccount(options);
  std::string provider = InspectProviderFile().value;
  Progress progress(provider);
  progress.Step("provider: " + provider);
  JoinInterruptibly(options, directory, account, progress, situation);
  account.reset();
  situation.throughProxy = false;
  situation.doing = "make the store \"Active Directory\" active";
  progress.Step("making the store \"Active Directory\" active");
  directory.Store()->MakeActive();
  situation.doing = "verify the join";
  return Verify(directory, progress, JoinedDomain(options));
}

}  // namespace

void AddJoinCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* join = root.add_subcommand("join", "Join a domain");
  join->add_option("DOMAIN[/OU]", options->target,
                   "The domain's DNS name, and the organizational unit for the computer account");
  CLI::Option* proxy =
      join->add_option("--proxy", options->proxy,
                       "Let the CAM service at this IPv4 address create the computer account; needs no user");
  join->add_option("--container", options->container, "Where that service creates the account")->needs(proxy);
  join->add_option("-U,--user", options->userName, "The account that may join hosts")
      ->capture_default_str()
      ->excludes(proxy);
  join->add_flag("--skip-hostname-check", options->skipHostNameCheck,
                 "Take the host's name as it is, and leave the hosts file and the DNS search list alone");
  for (CLI::Option* password : options->password.AddOptions(*join)) {
    password->excludes(proxy);
  }
  Bind(*join, invocation, options, Join);
}

}  // namespace velmorctl
