#include "real_libpam.h"

#include <security/pam_appl.h>
#include <sys/resource.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <memory>
#include <ostream>

#include "support/files.h"

namespace {

std::vector<std::string>* calls = nullptr;

}  // namespace

/// The scripted module tells of its calls through this one.
extern "C" __attribute__((visibility("default"))) void ScriptedModuleCalled(const char* operation, int count,
                                                                            const char** arguments) {
  if (calls != nullptr) {
    calls->push_back(velmorctltest::CallLine(operation, {arguments, arguments + count}));
  }
}

/// libpam takes a log that it cannot write to for a failure of the system, unless the kernel has none.
extern "C" __attribute__((visibility("default"))) int audit_open() {
  errno = EPROTONOSUPPORT;
  return -1;
}

namespace velmorctltest {

namespace {

using velmorctl::pam::NameOf;
using velmorctl::pam::Operation;
using velmorctl::pam::ReturnCode;

constexpr char POLICY_FOLDER[] = "/etc/pam.d";
constexpr std::size_t FOLDER_SIZE = 8 << 20;

/// The policies of the machine are hidden while one exists.
class PolicyFolder {
 public:
  explicit PolicyFolder(const PolicySet& files) : folder_(POLICY_FOLDER, FOLDER_SIZE) {
    for (const auto& [name, content] : files) {
      testsupport::WriteFile(std::string(POLICY_FOLDER) + "/" + name, content);
    }
  }

 private:
  testsupport::SmallFileSystem folder_;
};

int NoAnswers(int, const pam_message**, pam_response**, void*) {
  return PAM_CONV_ERR;
}

int Call(pam_handle_t* handle, Operation operation) {
  switch (operation) {
    case Operation::Authenticate:
      return pam_authenticate(handle, 0);
    case Operation::SetCredentials:
      return pam_setcred(handle, PAM_ESTABLISH_CRED);
    case Operation::ManageAccount:
      return pam_acct_mgmt(handle, 0);
    case Operation::OpenSession:
      return pam_open_session(handle, 0);
    case Operation::CloseSession:
      return pam_close_session(handle, 0);
    case Operation::PrepareTokenChange:
    case Operation::ChangeToken:
      break;
  }
  return pam_chauthtok(handle, 0);
}

int Start(pam_handle_t** handle) {
  static const pam_conv conversation = {NoAnswers, nullptr};
  return pam_start("svc", "alice", &conversation, handle);
}

}  // namespace

std::ostream& operator<<(std::ostream& stream, const Protocol& protocol) {
  for (const std::string& line : protocol.lines) {
    stream << "\n  " << line;
  }
  return stream;
}

std::string CallLine(const std::string& operation, const std::vector<std::string>& arguments) {
  std::string line = operation;
  for (const std::string& argument : arguments) {
    line += " <" + argument + ">";
  }
  return line;
}

std::string ScriptName(Operation operation) {
  constexpr const char* names[] = {"auth", "cred", "account", "open", "close", "prepare", "change"};
  return names[static_cast<std::size_t>(operation)];
}

Protocol AskLibpam(const PolicySet& files, const std::vector<Operation>& operations) {
  PolicyFolder folder(files);
  Protocol protocol;
  pam_handle_t* handle = nullptr;
  int code = Start(&handle);
  if (code != PAM_SUCCESS) {
    protocol.lines.push_back("start=" + NameOf(static_cast<ReturnCode>(code)));
    return protocol;
  }
  calls = &protocol.lines;
  for (Operation operation : operations) {
    code = Call(handle, operation);
    protocol.lines.push_back(std::string(NameOf(operation)) + "=" + NameOf(static_cast<ReturnCode>(code)));
    if (code == PAM_INCOMPLETE) {
      break;
    }
  }
  calls = nullptr;
  pam_end(handle, code);
  return protocol;
}

bool LibpamCrashesOrHangs(const PolicySet& files) {
  PolicyFolder folder(files);
  const pid_t child = fork();
  if (child == 0) {
    const rlimit noCore = {0, 0};
    setrlimit(RLIMIT_CORE, &noCore);
    std::signal(SIGSEGV, SIG_DFL);
    const itimerval second = {{0, 0}, {1, 0}};
    setitimer(ITIMER_PROF, &second, nullptr);
    pam_handle_t* handle = nullptr;
    Start(&handle);
    _exit(0);
  }
  int status = 0;
  waitpid(child, &status, 0);
  return WIFSIGNALED(status) && (WTERMSIG(status) == SIGSEGV || WTERMSIG(status) == SIGPROF);
}

}  // namespace velmorctltest
