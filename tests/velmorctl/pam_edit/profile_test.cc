// Files that pam-auth-update keeps: every policy that Debian's packages bring.
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include "velmorctl/pam_edit/debian_root.h"
#include "velmorctl/prepared_host.h"

namespace velmorctltest {

namespace {

const std::string COMMON_AUTH = "/etc/pam.d/common-auth";
const std::string PROFILE = "/usr/share/pam-configs/velmor";

constexpr int DIFFERENCE = 13;
constexpr int NOT_READY = 7;
constexpr int CONFLICT = 10;

class PamProfileTest : public PreparedHost {
 protected:
  DebianRoot root_;
};

bool Contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

/// The services of Debian's packages through which people log in.
const std::vector<std::string> LOGIN_SERVICES = {"chfn",     "chsh",  "cron", "login",
                                                 "polkit-1", "samba", "sshd", "sssd-shadowutils",
                                                 "su",       "su-l",  "sudo", "sudo-i"};

TEST_F(PamProfileTest, EveryStockServiceIsShown) {
  const Outcome all = root_.Pam({"show", "--all"});
  EXPECT_EQ(all.exitCode, 0) << all.errors;
  const std::vector<std::string> services = root_.Services();
  EXPECT_EQ(services.size(), 24U);
  for (const std::string& service : services) {
    EXPECT_EQ(root_.Pam({"show", service}).exitCode, 0) << service;
  }
}

TEST_F(PamProfileTest, CheckFindsNothingInStockFiles) {
  const Outcome outcome = root_.Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
}

TEST_F(PamProfileTest, CheckFindsNothingAfterEnabling) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Outcome outcome = root_.Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
}

TEST_F(PamProfileTest, DiffShowsTheChangeAndWritesNothing) {
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"diff", "--enable"});
  EXPECT_EQ(outcome.exitCode, DIFFERENCE) << outcome.errors;
  EXPECT_PRED2(Contains, outcome.output,
               "-auth\t[success=1 default=ignore]\tpam_unix.so nullok\n"
               "+auth\t[success=3 default=ignore]\tpam_unix.so nullok\n"
               "+auth\t[success=1 default=ignore]\tpam_localuser.so \n"
               "+auth\t[success=1 default=ignore]\tpam_ctlscript first second try_first_pass\n");
  EXPECT_EQ(root_.Files(), before);
  EXPECT_FALSE(testsupport::Exists(root_.Path() + "/var/lib/quenix"));
}

TEST_F(PamProfileTest, DryRunShowsTheSameAndWritesNothing) {
  const Tree before = root_.Files();
  const Outcome diff = root_.Pam({"diff", "--enable"});
  const Outcome outcome = root_.Pam({"enable", "--dry-run"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_TRUE(outcome.output.starts_with(diff.output)) << outcome.output;
  EXPECT_EQ(root_.Files(), before);
  EXPECT_FALSE(testsupport::Exists(root_.Path() + "/var/lib/quenix"));
}

TEST_F(PamProfileTest, EnablingTwiceChangesNothing) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Tree before = root_.Files();
  EXPECT_EQ(root_.Pam({"diff", "--enable"}).exitCode, 0);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.output, "There is nothing to change.\n");
  EXPECT_EQ(root_.Files(), before);
}

const std::string LOCAL_ONLY =
    "auth required pam_localuser.so\n@include common-auth\n@include common-account\n"
    "@include common-session\n";

TEST_F(PamProfileTest, AServiceForLocalUsersOnlyHoldsUpNoOther) {
  root_.Write("/etc/pam.d/localonly", LOCAL_ONLY);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_PRED2(Contains, outcome.errors,
               "note: the service 'localonly' shares changed files with others, but a user of the directory "
               "would still not get in");
  EXPECT_TRUE(root_.LetsIn("sshd", "dora", "up"));
  EXPECT_FALSE(root_.LetsIn("localonly", "dora", "up"));
}

TEST_F(PamProfileTest, EnablingAgainBesideANewServiceForLocalUsersOnlyChangesNothing) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  root_.Write("/etc/pam.d/localonly", LOCAL_ONLY);
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, EnablingAgainDoesNotTakeTheProfileOutForAServiceThatIsRefused) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  // The jump of this one counts the lines of the file that it passes over.
  root_.Write("/etc/pam.d/jumping",
              "auth [success=5 default=ignore] pam_userdb.so\nauth include common-auth\n"
              "auth required pam_deny.so\nauth required pam_permit.so\naccount include common-account\n");
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "the service 'jumping' cannot keep what was put into its files");
  EXPECT_PRED2(Contains, outcome.errors, "a jump of this entry would lead to another one");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, DisablingWhatWasNotEnabledChangesNothing) {
  const Tree before = root_.Files();
  EXPECT_EQ(root_.Pam({"diff", "--disable"}).exitCode, 0);
  EXPECT_EQ(root_.Pam({"disable"}).output, "There is nothing to change.\n");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, DisablingGivesBackEveryByte) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_NE(root_.Files(), before);
  const Outcome outcome = root_.Pam({"disable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, RestoringGivesBackEveryByte) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Outcome outcome = root_.Pam({"restore"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, ABackupIsRestoredByItsId) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Tree enabled = root_.Files();
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  const nlohmann::json backups = root_.Pam({"backups", "--json"}).Json()["backups"];
  ASSERT_EQ(backups.size(), 2U);
  EXPECT_EQ(backups[0]["command"], "pam disable");
  EXPECT_EQ(backups[1]["command"], "pam enable");
  ASSERT_EQ(root_.Pam({"restore", backups[0]["id"]}).exitCode, 0);
  EXPECT_EQ(root_.Files(), enabled);
  ASSERT_EQ(root_.Pam({"restore", backups[1]["id"]}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, ModeAndAccessListStay) {
  const std::string file = root_.Path() + COMMON_AUTH;
  const std::string list(
      "\x02\0\0\0"
      "\x01\0\x06\0\xff\xff\xff\xff"
      "\x04\0\x04\0\xff\xff\xff\xff"
      "\x08\0\x04\0\0\0\0\0"
      "\x10\0\x04\0\xff\xff\xff\xff"
      "\x20\0\0\0\xff\xff\xff\xff",
      44);
  ASSERT_EQ(setxattr(file.c_str(), "system.posix_acl_access", list.data(), list.size(), 0), 0);
  const unsigned int mode = testsupport::ModeOf(file);
  for (const char* command : {"enable", "disable"}) {
    ASSERT_EQ(root_.Pam({command}).exitCode, 0);
    EXPECT_EQ(testsupport::ModeOf(file), mode);
    char kept[64] = {};
    ASSERT_EQ(getxattr(file.c_str(), "system.posix_acl_access", kept, sizeof kept), 44);
    EXPECT_EQ(std::string(kept, 44), list);
  }
}

TEST_F(PamProfileTest, EveryLoginServiceLetsUsersOfTheDirectoryIn) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  for (const std::string& service : LOGIN_SERVICES) {
    EXPECT_TRUE(root_.LetsIn(service, "dora", "up")) << service;
    EXPECT_FALSE(root_.LetsIn(service, "dora", "down")) << service;
    EXPECT_TRUE(root_.LetsIn(service, "local", "up")) << service;
    EXPECT_TRUE(root_.LetsIn(service, "local", "down")) << service;
    EXPECT_FALSE(root_.LetsIn(service, "dora", "up", {DirectoryAnswers("account", "acct_expired")}))
        << service;
    EXPECT_FALSE(root_.LetsIn(service, "dora", "up", {DirectoryAnswers("auth", "auth_err")})) << service;
  }
}

TEST_F(PamProfileTest, ThePasswordOfAnAccountOfTheDirectoryOpensNoLocalOneOfThatName) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  for (const std::string& service : LOGIN_SERVICES) {
    for (const std::string user : {"local", "root"}) {
      EXPECT_FALSE(root_.LetsIn(
          service, user, "up",
          {"auth:pam_unix=auth_err", "auth:pam_rootok=auth_err", DirectoryAnswers("auth", "success")}))
          << service << ", " << user;
    }
  }
}

TEST_F(PamProfileTest, NobodyOfTheDirectoryGetsInBefore) {
  for (const std::string& service : LOGIN_SERVICES) {
    EXPECT_FALSE(root_.LetsIn(service, "dora", "up")) << service;
    EXPECT_TRUE(root_.LetsIn(service, "local", "down")) << service;
  }
}

TEST_F(PamProfileTest, PamAuthUpdateTakesTheResultForItsOwn) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Tree enabled = root_.Files();
  root_.UpdateProfiles({"--package"});
  EXPECT_EQ(root_.Files(), enabled);
}

TEST_F(PamProfileTest, OtherDirectoriesAndPasswordRulesStayBesideIt) {
  root_.AddOtherProfiles();
  ASSERT_PRED2(Contains, root_.Read(COMMON_AUTH), "pam_sss.so");
  ASSERT_PRED2(Contains, root_.Read("/etc/pam.d/common-password"), "pam_pwquality.so");
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  ASSERT_EQ(outcome.exitCode, 0) << outcome.errors;
  const std::vector<std::string> nobodyElse = {"pam_sss=user_unknown", "pam_winbind=user_unknown"};
  EXPECT_TRUE(root_.LetsIn("sshd", "dora", "up", nobodyElse));
  EXPECT_FALSE(root_.LetsIn("sshd", "dora", "down", nobodyElse));
  EXPECT_TRUE(root_.LetsIn("sshd", "local", "down"));
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, DisablingLeavesWhatOtherPackagesDidMeanwhile) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  root_.Write("/usr/share/pam-configs/another",
              "Name: Another\nDefault: no\nPriority: 0\nSession-Type: "
              "Additional\nSession:\n\toptional\tpam_umask.so\n");
  root_.UpdateProfiles({"--enable", "another"});
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_PRED2(Contains, root_.Read("/etc/pam.d/common-session"), "pam_umask.so");
  EXPECT_EQ(root_.Files().at(COMMON_AUTH), before.at(COMMON_AUTH));
}

TEST_F(PamProfileTest, AProfileOfTheDistributionIsLeft) {
  root_.Write("/usr/share/pam-configs/stock",
              "Name: Stock\nDefault: yes\nPriority: 192\n"
              "Auth-Type: Primary\nAuth:\n\t[success=end default=ignore]\tpam_ctlscript try_first_pass\n");
  root_.UpdateProfiles({"--package"});
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_PRED2(Contains, outcome.errors,
               "/etc/pam.d/common-auth, line 18 calls pam_ctlscript already by the profile \"stock\"");
  // One service has a stack of its own, which no profile reaches.
  EXPECT_PRED2(Contains, root_.Read("/etc/pam.d/sssd-shadowutils"), "pam_ctlscript");
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, FilesChangedByHandAreRefusedWithTheReason) {
  root_.Write(COMMON_AUTH, std::string(root_.Read(COMMON_AUTH))
                               .insert(root_.Read(COMMON_AUTH).find("# here's the fallback"),
                                       "auth\t[success=1 default=ignore]\tpam_permit.so\n"));
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "pam-auth-update leaves the common-* files as they are");
  EXPECT_PRED2(Contains, outcome.errors, "changed by hand");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, OptionsThatTheAdministratorAddedStay) {
  std::string text = root_.Read(COMMON_AUTH);
  text.insert(text.find("pam_unix.so nullok") + 18, " nodelay");
  root_.Write(COMMON_AUTH, text);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_PRED2(Contains, root_.Read(COMMON_AUTH), "pam_unix.so nullok nodelay\n");
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Read(COMMON_AUTH), text);
}

TEST_F(PamProfileTest, AMissingRecordIsNamed) {
  testsupport::RemoveFile(root_.Path() + "/var/lib/pam/auth");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_NE(outcome.exitCode, 0);
  EXPECT_PRED2(Contains, outcome.errors, "/var/lib/pam/auth");
}

TEST_F(PamProfileTest, AToolThatCannotBeRunIsNamed) {
  const Tree before = root_.Files();
  ASSERT_EQ(mount("/dev/null", "/usr/sbin/pam-auth-update", nullptr, MS_BIND, nullptr), 0);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "cannot be run");
  EXPECT_PRED2(Contains, outcome.errors, "libpam-runtime");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, AToolThatFailsHalfWayChangesNothing) {
  const Tree before = root_.Files();
  const StandInForProfileTool tool(
      "echo nonsense >\"$2/etc/pam.d/common-auth\"\necho the disk is full >&2\nexit 1\n");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "it ended with status 1: the disk is full");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, AToolThatDoesMoreThanItShouldIsRefused) {
  const Tree before = root_.Files();
  const StandInForProfileTool tool(
      "\"$REAL\" \"$@\"\nsed -i s/pam_deny.so/pam_permit.so/ \"$2/etc/pam.d/common-auth\"\n");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(
      Contains, outcome.errors,
      "the service 'sshd' stays as it is: this entry would be another one: /etc/pam.d/common-auth, line 21");
  EXPECT_EQ(root_.Files().at(COMMON_AUTH), before.at(COMMON_AUTH));
  EXPECT_FALSE(testsupport::Exists(root_.Path() + PROFILE));
}

TEST_F(PamProfileTest, AProfileThatWouldComeAlongIsRefused) {
  root_.Write("/usr/share/pam-configs/unseen",
              "Name: Unseen\nDefault: yes\nPriority: 300\n"
              "Auth-Type: Primary\nAuth:\n\t[success=end default=ignore]\tpam_permit.so\n");
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "pam_permit.so");
  EXPECT_EQ(root_.Files().at(COMMON_AUTH), before.at(COMMON_AUTH));
}

TEST_F(PamProfileTest, AFileThatChangesMeanwhileIsNotOverwritten) {
  const std::string file = root_.Path() + COMMON_AUTH;
  const Tree before = root_.Files();
  const StandInForProfileTool tool("echo '# mine' >>" + file + "\nexec \"$REAL\" \"$@\"\n");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, CONFLICT);
  EXPECT_PRED2(Contains, outcome.errors, "was changed by somebody else meanwhile");
  Tree expected = before;
  expected[COMMON_AUTH] += "# mine\n";
  EXPECT_EQ(root_.Files(), expected);
}

TEST_F(PamProfileTest, ALinkStaysAndItsTargetIsEdited) {
  const std::string file = root_.Path() + COMMON_AUTH;
  std::filesystem::rename(file, file + "-target");
  std::filesystem::create_symlink("common-auth-target", file);
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_TRUE(std::filesystem::is_symlink(file));
  EXPECT_PRED2(Contains, root_.Read(COMMON_AUTH + "-target"), "pam_ctlscript");
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, AMissingModuleIsNamedWithItsPackage) {
  testsupport::MakeFolders(root_.Path() + "/lib/security");
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "the PAM module of the provider 'ctlscript' is not there");
  EXPECT_PRED2(Contains, outcome.errors, "libpam-ctlscript");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, DisablingNeedsNoProvider) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  testsupport::RemoveFile(testsupport::PLUGIN_FOLDER + "libctlscript.so");
  EXPECT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamProfileTest, NothingIsLeftOfTheTrial) {
  const StandInForProfileTool tool("printf %s \"$2\" >/run/trial-folder\nexec \"$REAL\" \"$@\"\n");
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const std::filesystem::path folder = testsupport::ReadFile("/run/trial-folder");
  EXPECT_EQ(folder.filename(), "root");
  EXPECT_FALSE(testsupport::Exists(folder.parent_path()));
}

}  // namespace

}  // namespace velmorctltest
