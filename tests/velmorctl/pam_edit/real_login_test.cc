// Logins through the real libpam, with the policies as they were edited, against what the simulation says.
#include <dlfcn.h>
#include <pwd.h>
#include <security/pam_appl.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <optional>
#include <system_error>

#include "velmorctl/pam_edit/debian_root.h"
#include "velmorctl/prepared_host.h"

namespace {

char emptyText[] = "";
char lockedPassword[] = "*";
char home[] = "/";
char shell[] = "/bin/bash";

}  // namespace

/// The directory's user is known as by a name-service module: no file has him, and nobody his hash.
extern "C" __attribute__((visibility("default"))) int getpwnam_r(const char* name, passwd* entry,
                                                                 char* buffer, size_t size, passwd** result) {
  if (std::strcmp(name, "dora") == 0 && size > 8) {
    std::strcpy(buffer, "dora");
    *entry = {buffer, lockedPassword, 200000, 200000, emptyText, home, shell};
    *result = entry;
    return 0;
  }
  using Function = int (*)(const char*, passwd*, char*, size_t, passwd**);
  static const auto real = reinterpret_cast<Function>(dlsym(RTLD_NEXT, "getpwnam_r"));
  return real(name, entry, buffer, size, result);
}

/// libpam takes a log that it cannot write to for a failure of the system, unless the kernel has none.
extern "C" __attribute__((visibility("default"))) int audit_open() {
  errno = EPROTONOSUPPORT;
  return -1;
}

namespace velmorctltest {

namespace {

constexpr char MODULE_FOLDER[] = "/usr/lib/" LIBRARY_ARCHITECTURE "/security";
const std::string LOCAL_PASSWORD = "local-secret";
// Of LOCAL_PASSWORD.
const std::string LOCAL_HASH =
    "$6$velmortest$79SH2xm3kyl8HfQA8KXsAJantaOMNZESj7cQsJQfIeUmdslkzczGCm7cB/gmW1JqhqCRB2sadpiXy9JekErEy1";
const std::string DIRECTORY_PASSWORD = "directory-secret";

/// Services whose policies do not let root in without a password, as which the test runs.
const std::vector<std::string> SERVICES = {"cron", "login", "polkit-1", "samba", "sshd", "sssd-shadowutils",
                                           "sudo", "sudo-i"};

int Converse(int count, const pam_message** messages, pam_response** responses, void* password) {
  *responses = static_cast<pam_response*>(std::calloc(static_cast<std::size_t>(count), sizeof(pam_response)));
  for (int index = 0; index < count; ++index) {
    if (messages[index]->msg_style == PAM_PROMPT_ECHO_OFF) {
      (*responses)[index].resp = strdup(static_cast<const std::string*>(password)->c_str());
    }
  }
  return PAM_SUCCESS;
}

void NoDelay(int, unsigned int, void*) {}

bool LogIn(const std::string& service, const std::string& user, std::string password) {
  const pam_conv conversation = {Converse, &password};
  pam_handle_t* handle = nullptr;
  if (pam_start(service.c_str(), user.c_str(), &conversation, &handle) != PAM_SUCCESS) {
    return false;
  }
  void* delay = nullptr;
  void (*const function)(int, unsigned int, void*) = NoDelay;
  std::memcpy(&delay, &function, sizeof delay);
  pam_set_item(handle, PAM_FAIL_DELAY, delay);
  int code = pam_authenticate(handle, 0);
  code = code == PAM_SUCCESS ? pam_acct_mgmt(handle, 0) : code;
  code = code == PAM_SUCCESS ? pam_setcred(handle, PAM_ESTABLISH_CRED) : code;
  pam_end(handle, code);
  return code == PAM_SUCCESS;
}

/// In a process of its own, since modules leave things behind.
bool LetsInForReal(const std::string& service, const std::string& user, const std::string& password) {
  const pid_t child = fork();
  if (child == 0) {
    _exit(LogIn(service, user, password) ? 0 : 1);
  }
  int status = 0;
  waitpid(child, &status, 0);
  if (!WIFEXITED(status) || WEXITSTATUS(status) > 1) {
    throw std::runtime_error("the login to " + service + " crashed");
  }
  return WEXITSTATUS(status) == 0;
}

class PamRealLoginTest : public PreparedHost {
 protected:
  PamRealLoginTest() {
    testsupport::MakeFolders("/run/directory");
    BringDirectoryBack();
    InstallModule();
    ReplaceFile("/etc/passwd", "root:x:0:0:root:/root:/bin/bash\nlocal:x:1500:1500::/:/bin/bash\n");
    ReplaceFile("/etc/shadow", "root:*:19000:0:99999:7:::\nlocal:" + LOCAL_HASH + ":19000:0:99999:7:::\n");
  }

  static void TakeDirectoryAway() { testsupport::RemoveFile("/run/directory/users"); }
  static void BringDirectoryBack() {
    testsupport::WriteFile("/run/directory/users", "dora " + DIRECTORY_PASSWORD + "\n");
  }

  /// Makes the policies of the root those of the sandbox.
  void UsePolicies() {
    policies_.emplace("/etc/pam.d", 8U << 20);
    for (const char* folder : {"/usr/lib/pam.d", "/etc/pam.d"}) {
      for (const auto& entry : std::filesystem::directory_iterator(root_.Path() + folder)) {
        std::filesystem::copy(
            entry.path(), "/etc/pam.d/",
            std::filesystem::copy_options::copy_symlinks | std::filesystem::copy_options::overwrite_existing);
      }
    }
  }

  /// Compares with the simulation, and both with what must be.
  void Expect(bool in, const std::string& service, const std::string& user, const std::string& password,
              const std::string& directory, const std::vector<std::string>& answers = {}) const {
    EXPECT_EQ(LetsInForReal(service, user, password), in)
        << service << ", user " << user << ", directory " << directory;
    EXPECT_EQ(root_.LetsIn(service, user, directory, answers), in)
        << service << " in the simulation, user " << user << ", directory " << directory;
  }

  DebianRoot root_;

 private:
  /// The file that is there may not be this user's.
  static void ReplaceFile(const std::string& path, const std::string& content) {
    testsupport::WriteFile(path + ".new", content);
    std::filesystem::rename(path + ".new", path);
  }

  static void InstallModule() {
    for (const char* folder : {"/run/modules/upper", "/run/modules/work"}) {
      testsupport::MakeFolders(folder);
    }
    testsupport::CopyFile(SCRIPTED_DIRECTORY_MODULE, "/run/modules/upper/" + DIRECTORY_MODULE);
    const std::string options =
        std::string("lowerdir=") + MODULE_FOLDER + ",upperdir=/run/modules/upper,workdir=/run/modules/work";
    if (mount("modules", MODULE_FOLDER, "overlay", 0, options.c_str()) != 0) {
      throw std::system_error(errno, std::generic_category(), MODULE_FOLDER);
    }
  }

  std::optional<testsupport::SmallFileSystem> policies_;
};

TEST_F(PamRealLoginTest, StockPoliciesLetLocalUsersInOnly) {
  UsePolicies();
  for (const std::string& service : SERVICES) {
    Expect(true, service, "local", LOCAL_PASSWORD, "up");
    Expect(false, service, "local", "wrong", "up", {"auth:pam_unix=auth_err"});
    Expect(false, service, "dora", DIRECTORY_PASSWORD, "up");
  }
}

TEST_F(PamRealLoginTest, WithTheDirectoryUp) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  UsePolicies();
  for (const std::string& service : SERVICES) {
    Expect(true, service, "local", LOCAL_PASSWORD, "up");
    Expect(false, service, "local", "wrong", "up", {"auth:pam_unix=auth_err"});
    Expect(true, service, "dora", DIRECTORY_PASSWORD, "up", {"auth:pam_unix=auth_err"});
    Expect(false, service, "dora", "wrong", "up", {DirectoryAnswers("auth", "auth_err")});
  }
}

TEST_F(PamRealLoginTest, WithTheDirectoryAway) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  UsePolicies();
  TakeDirectoryAway();
  for (const std::string& service : SERVICES) {
    Expect(true, service, "local", LOCAL_PASSWORD, "down");
    Expect(false, service, "local", "wrong", "down", {"auth:pam_unix=auth_err"});
    Expect(false, service, "dora", DIRECTORY_PASSWORD, "down");
  }
}

TEST_F(PamRealLoginTest, AnAccountThatTheDirectoryRefusesStaysOut) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  UsePolicies();
  testsupport::WriteFile("/run/directory/refused", "");
  for (const std::string& service : SERVICES) {
    Expect(true, service, "local", LOCAL_PASSWORD, "up");
    Expect(false, service, "dora", DIRECTORY_PASSWORD, "up", {DirectoryAnswers("account", "acct_expired")});
  }
}

TEST_F(PamRealLoginTest, LocalUsersGetInWhenTheModuleIsRemoved) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  UsePolicies();
  testsupport::RemoveFile(std::string(MODULE_FOLDER) + "/" + DIRECTORY_MODULE);
  for (const std::string& service : SERVICES) {
    Expect(true, service, "local", LOCAL_PASSWORD, "down", {DIRECTORY_MODULE + "=module_unknown"});
    Expect(false, service, "dora", DIRECTORY_PASSWORD, "down", {DIRECTORY_MODULE + "=module_unknown"});
  }
}

}  // namespace

}  // namespace velmorctltest
