#include "service/service.h"

#include <signal.h>
#include <sys/prctl.h>
#include <syslog.h>

#include <atomic>
#include <condition_variable>
#include <cstdio>
#include <mutex>
#include <thread>

#include "common/status.h"
#include "service/account_creation.h"
#include "service/audit_log.h"
#include "service/configuration.h"
#include "service/credential_file.h"
#include "service/domain_cache.h"
#include "service/request_handler.h"
#include "service/system_manager.h"
#include "service/unused_accounts.h"
#include "service/web_server.h"

namespace camd {
namespace {

constexpr std::chrono::minutes kTimeBetweenRemovals(10);

// Runs a piece of work now and then on a thread of its own.
class Repetition {
 public:
  Repetition(std::chrono::seconds interval, std::function<void()> work)
      : thread_([this, interval, work = std::move(work)] {
          std::unique_lock lock(mutex_);
          while (!ending_) {
            lock.unlock();
            work();
            lock.lock();
            changed_.wait_for(lock, interval, [this] { return ending_; });
          }
        }) {}
  Repetition(const Repetition&) = delete;
  Repetition& operator=(const Repetition&) = delete;
  ~Repetition() {
    {
      const std::lock_guard lock(mutex_);
      ending_ = true;
    }
    changed_.notify_all();
    thread_.join();
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  bool ending_ = false;
  std::thread thread_;
};

// The signals that the service waits for; blocked in this thread and in all that it starts.
sigset_t BlockSignals() {
  sigset_t signals;
  sigemptyset(&signals);
  for (const int signal : {SIGTERM, SIGINT, SIGHUP}) sigaddset(&signals, signal);
  sigprocmask(SIG_BLOCK, &signals, nullptr);
  signal(SIGPIPE, SIG_IGN);
  return signals;
}

// What is in force, and the parts that have to know of it.
class Service {
 public:
  Service(std::string path, const Configuration& configuration)
      : path_(std::move(path)),
        started_(configuration.server),
        ledger_(configuration.server.ledgerFile),
        tokens_(configuration.server.ledgerFile),
        creation_(ledger_, tokens_, directory_),
        domain_(directory_) {
    audit_.Open(configuration.auditFile);
    configuration_ = std::make_shared<const Configuration>(configuration);
  }

  void Run(const sigset_t& signals) {
    WorkQueue queue(started_.helpers, started_.queueLength);
    RequestHandler handler(creation_, domain_, audit_, queue);
    handler.Configure(configuration_);
    WebServer server(started_, ReadPublicFile(started_.certificateFile), ReadCredentialFile(started_.keyFile),
                     handler);
    std::atomic<bool> ending = false;
    const Repetition removal(kTimeBetweenRemovals, [this, &ending] {
      RemoveUnusedAccounts(Current()->directory, ledger_, directory_, creation_, audit_,
                           [&ending] { return ending.load(); });
    });
    syslog(LOG_INFO, "serving %s port %u", started_.listenAddress.c_str(), started_.port);
    TellReady();
    for (int signal = 0; sigwait(&signals, &signal) == 0 && signal == SIGHUP;) Reload(handler);
    ending = true;
    syslog(LOG_INFO, "stopping; requests under way are finished");
    TellStopping();
    handler.RefuseFurther();
    server.Stop();
  }

 private:
  std::shared_ptr<const Configuration> Current() {
    const std::lock_guard lock(mutex_);
    return configuration_;
  }

  // A configuration that is wrong changes nothing.
  void Reload(RequestHandler& handler) {
    try {
      auto configuration = std::make_shared<const Configuration>(ReadConfiguration(path_));
      ReadCredentialFile(configuration->directory.passwordFile);
      audit_.Open(configuration->auditFile);
      if (configuration->server != started_) {
        syslog(LOG_WARNING, "changes of section [server] take effect when the service is started again");
      }
      directory_.ForgetRefusal();
      domain_.Forget();
      handler.Configure(configuration);
      const std::lock_guard lock(mutex_);
      configuration_ = std::move(configuration);
      syslog(LOG_INFO, "the configuration was read again");
    } catch (const std::runtime_error& error) {
      syslog(LOG_ERR, "the old configuration stays in force: %s", error.what());
      audit_.Write({{"event", "reload"},
                    {"text", std::string("the old configuration stays in force: ") + error.what()}});
    }
  }

  const std::string path_;
  const ServerSettings started_;
  Ledger ledger_;
  TokenStore tokens_;
  DirectoryClient directory_;
  AuditLog audit_;
  AccountCreation creation_;
  DomainCache domain_;
  std::mutex mutex_;
  std::shared_ptr<const Configuration> configuration_;
};

}  // namespace

void Serve(const std::string& path) {
  prctl(PR_SET_DUMPABLE, 0);
  const sigset_t signals = BlockSignals();
  const Configuration configuration = ReadConfiguration(path);
  ReadCredentialFile(configuration.directory.passwordFile);
  Service(path, configuration).Run(signals);
}

void Check(const std::string& path) {
  const Configuration configuration = ReadConfiguration(path);
  const std::string& password = configuration.directory.passwordFile;
  const std::string& certificate = configuration.server.certificateFile;
  const std::string& key = configuration.server.keyFile;
  for (const std::string& name : {certificate, key, password}) {
    if (IsOutOfReach(name)) std::printf("not looked at: the credential '%s'\n", name.c_str());
  }
  if (!IsOutOfReach(password)) ReadCredentialFile(password);
  if (IsOutOfReach(certificate) || IsOutOfReach(key)) return;
  CheckPair(ReadPublicFile(certificate), ReadCredentialFile(key));
}

}  // namespace camd
