/// velmorctl leave: ends the host's membership in its domain.
#include <CLI/App.hpp>
#include <iostream>

#include "account.h"
#include "authentication/active_directory_config_store.h"
#include "command.h"
#include "directory.h"
#include "failure.h"
#include "operation_lock.h"
#include "orvconfigstore/config_store_exception.h"
#include "password_source.h"
#include "progress.h"
#include "secret.h"
#include "settings_file.h"
#include "signal_pipe.h"
#include "text.h"
#include "watched_call.h"

namespace velmorctl {

namespace {

using quenix::authentication::ActiveDirectoryConfigStore;

constexpr std::chrono::seconds answerTimeout{60};

/// What a provider returns when the host is in no domain.
constexpr unsigned long notJoinedStatus = 2692;

struct Options {
  std::string userName;
  PasswordSource password;
};

std::shared_ptr<Account> ReadAccount(const Options& options) {
  if (options.userName.empty()) {
    return nullptr;
  }
  auto account = std::make_shared<Account>();
  account->userName = options.userName;
  options.password.Read(options.userName, account->password);
  return account;
}

/// For a leave that was to be interrupted.
std::string HowItEnded(const std::exception_ptr& failure) {
  if (!failure) {
    return "the host has left the domain";
  }
  try {
    std::rethrow_exception(failure);
  } catch (const OrvConfigStore::ConfigStoreException& exception) {
    return std::string("the host has left the domain, but the record of the join is still there: ") +
           exception.what();
  } catch (...) {
    return FailedByThen("the leave", failure);
  }
}

/// The library's leave with an account keeps the record of the join, so that is removed here.
void LeaveThroughStore(Directory& directory, const std::shared_ptr<Account>& account, Progress& progress) {
  SignalPipe signals{SIGINT, SIGTERM, SIGHUP};
  auto leave = [store = directory.Store(), account] {
    if (account) {
      store->PartDomain(account->AsCredentials());
      ActiveDirectoryConfigStore().RemoveDomainInfo();
    } else {
      store->PartDomain();
    }
  };
  CallOutcome outcome = RunWatched(
      leave, progress, signals, "interrupted: a leave is not undone, and ends first (again: leave at once)");
  if (outcome.signalNumber) {
    throw Interrupted(*outcome.signalNumber, HowItEnded(outcome.failure));
  }
  if (outcome.failure) {
    std::rethrow_exception(outcome.failure);
  }
}

/// A host that is in no domain any more but still has the record of its join loses that.
bool RemoveStaleRecord(const quenix::authentication::Exception& exception,
                       const std::optional<JoinRecord>& record) {
  if (exception.Code() != notJoinedStatus || !record) {
    return false;
  }
  ActiveDirectoryConfigStore().RemoveDomainInfo();
  return true;
}

void PrintEnd(const std::string& domain) {
  std::cout << "The host has left " << Printable(domain) << ".\n";
  if (InspectAuthenticationFile().value == "Active Directory") {
    std::cout
        << "The active store is still \"Active Directory\"; \"velmorctl store use None\" changes that.\n";
  }
}

ExitCode Leave(const Options& options, Situation& situation) {
  RequireRoot("leave a domain");
  ForbidCoreFiles();
  IgnoreBrokenPipes();
  situation.doing = "leave the domain";
  OperationLock lock;
  Directory directory(answerTimeout);
  std::optional<JoinRecord> record = ReadJoinRecord();
  std::string domain = directory.JoinedDomain();
  situation.doing = "leave " + domain;
  std::shared_ptr<Account> account = ReadAccount(options);
  Progress progress(InspectProviderFile().value);
  progress.Step("leaving " + domain + (account ? " as " + account->userName : " without an account"));
  try {
    LeaveThroughStore(directory, account, progress);
  } catch (const OrvConfigStore::ConfigStoreException&) {
    // Only what comes after the leave itself uses the configuration store.
    situation.AddChange("the host has left " + domain + ", but the record of the join is still there");
    throw;
  } catch (const quenix::authentication::Exception& exception) {
    situation.providerReason = progress.ProviderReason();
    if (!RemoveStaleRecord(exception, record)) {
      throw;
    }
    progress.Step("the host was in no domain any more; the record of its join is removed");
  }
  PrintEnd(domain);
  return ExitCode::Fine;
}

}  // namespace

void AddLeaveCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* leave = root.add_subcommand("leave", "Leave the domain");
  CLI::Option* user = leave->add_option(
      "-U,--user", options->userName,
      "An account that may remove the computer account; without it, the computer account stays");
  for (CLI::Option* password : options->password.AddOptions(*leave)) {
    password->needs(user);
  }
  Bind(*leave, invocation, options, Leave);
}

}  // namespace velmorctl
