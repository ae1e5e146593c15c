#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <system_error>

#include "marked_file.h"
#include "plugins/scripted_plugin.h"
#include "prepared_host.h"
#include "stock_files.h"
#include "tool.h"

namespace velmorctltest {

namespace {

using testsupport::Exists;
using testsupport::MakeFolders;
using testsupport::ReadFile;
using testsupport::WriteFile;

const std::string SWITCH_FILE = "/etc/nsswitch.conf";
const std::string BACKUPS = "/var/lib/quenix/backups/nss";

struct stat StatusOf(const std::string& path) {
  struct stat status {};
  EXPECT_EQ(lstat(path.c_str(), &status), 0) << path;
  return status;
}

/// What a change leaves in a file's status besides its content.
std::vector<unsigned long> Attributes(const std::string& path) {
  const struct stat status = StatusOf(path);
  return {status.st_mode, status.st_uid, status.st_gid};
}

bool SameFile(const struct stat& left, const struct stat& right) {
  return left.st_ino == right.st_ino && left.st_mtim.tv_sec == right.st_mtim.tv_sec &&
         left.st_mtim.tv_nsec == right.st_mtim.tv_nsec && left.st_ctim.tv_sec == right.st_ctim.tv_sec &&
         left.st_ctim.tv_nsec == right.st_ctim.tv_nsec;
}

void ExpectIn(const std::string& text, const std::string& part) {
  EXPECT_NE(text.find(part), std::string::npos) << "not in:\n" << text << "is:\n" << part;
}

/// The host itself, whose file is that of a stock Debian.
class NameServiceTest : public PreparedHost {
 protected:
  NameServiceTest() { WriteFile(SWITCH_FILE, StockFiles().front().text); }

  static std::vector<std::string> Backups() {
    return Exists(BACKUPS) ? testsupport::NamesIn(BACKUPS) : std::vector<std::string>();
  }
};

/// Another root with a stock file.
class StockFileTest : public ::testing::TestWithParam<StockFile> {
 protected:
  StockFileTest() : file_(root_.Path() + "etc/nsswitch.conf") {
    MakeFolders(root_.Path() + "etc");
    WriteFile(file_, GetParam().text);
    testsupport::SetMode(file_, 0640);
    EXPECT_TRUE(Mark(file_, "mark"));
  }

  Outcome Nss(std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), "nss");
    arguments.insert(arguments.end(), {"--root", root_.Path()});
    return Velmorctl(arguments);
  }

  void ExpectAsBefore(const std::vector<unsigned long>& attributes) const {
    EXPECT_EQ(ReadFile(file_), GetParam().text);
    EXPECT_EQ(Attributes(file_), attributes);
    EXPECT_EQ(MarkOf(file_), "mark");
  }

  testsupport::ScratchFolder root_;
  std::string file_;
};

TEST_P(StockFileTest, IsShown) {
  const nlohmann::json document = Nss({"show", "--json"}).Json();
  EXPECT_EQ(document["schema"], "velmor.nss/1");
  EXPECT_EQ(document["file"], root_.Path() + "etc/nsswitch.conf");
  const std::string& text = GetParam().text;
  std::ptrdiff_t lines = 0;
  for (std::size_t start = 0; start < text.size();
       start = std::min(text.find('\n', start), text.size() - 1) + 1) {
    lines += text[start] != '#' && text[start] != '\n' ? 1 : 0;
  }
  EXPECT_EQ(static_cast<std::ptrdiff_t>(document["databases"].size()), lines);
}

TEST_P(StockFileTest, IsChecked) {
  const Outcome outcome = Nss({"check"});
  EXPECT_EQ(outcome.exitCode, GetParam().checkExitCode) << outcome.output << outcome.errors;
}

TEST_P(StockFileTest, IsTheSameAfterAnAdditionAndItsRemoval) {
  const std::vector<unsigned long> attributes = Attributes(file_);
  EXPECT_EQ(Nss({"add", "passwd", "winbind"}).exitCode, 0);
  EXPECT_NE(ReadFile(file_), GetParam().text);
  EXPECT_EQ(Nss({"remove", "passwd", "winbind"}).exitCode, 0);
  ExpectAsBefore(attributes);
}

TEST_P(StockFileTest, IsTheSameAfterARestore) {
  const std::vector<unsigned long> attributes = Attributes(file_);
  for (const char* database : {"passwd", "hosts", "shadow"}) {
    EXPECT_EQ(Nss({"add", database, "winbind"}).exitCode, 0);
    EXPECT_NE(ReadFile(file_), GetParam().text);
    EXPECT_EQ(Nss({"restore"}).exitCode, 0);
    ExpectAsBefore(attributes);
  }
}

TEST_P(StockFileTest, IsTheSameAfterADryRun) {
  const struct stat before = StatusOf(file_);
  const Outcome outcome = Nss({"add", "passwd", "winbind", "--dry-run"});
  EXPECT_EQ(outcome.exitCode, 0);
  ExpectIn(outcome.output, "--- a/etc/nsswitch.conf\n+++ b/etc/nsswitch.conf\n");
  EXPECT_EQ(ReadFile(file_), GetParam().text);
  EXPECT_TRUE(SameFile(before, StatusOf(file_)));
  EXPECT_EQ(testsupport::NamesIn(root_.Path()), std::vector<std::string>{"etc"});
}

TEST_P(StockFileTest, IsTheSameAfterADryRunOfARemoval) {
  Nss({"add", "passwd", "winbind"});
  const std::string added = ReadFile(file_);
  const struct stat before = StatusOf(file_);
  const std::vector<std::string> backups = testsupport::NamesIn(root_.Path() + BACKUPS);
  const Outcome outcome = Nss({"remove", "passwd", "winbind", "--dry-run"});
  EXPECT_EQ(outcome.exitCode, 0);
  ExpectIn(outcome.output, "--- a/etc/nsswitch.conf\n+++ b/etc/nsswitch.conf\n");
  ExpectIn(outcome.output, "Nothing was written.\n");
  EXPECT_EQ(ReadFile(file_), added);
  EXPECT_TRUE(SameFile(before, StatusOf(file_)));
  EXPECT_EQ(testsupport::NamesIn(root_.Path() + BACKUPS), backups);
}

INSTANTIATE_TEST_SUITE_P(Each, StockFileTest, ::testing::ValuesIn(StockFiles()),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(NameServiceTest, ShowsOneDatabase) {
  EXPECT_EQ(Velmorctl({"nss", "show", "hosts"}).output,
            "DATABASE  SERVICES\n"
            "hosts     files dns\n");
}

TEST_F(NameServiceTest, ShowsCriteriaAndLinesThatDoNotCount) {
  WriteFile(SWITCH_FILE, "hosts: nis [ NOTFOUND=return ] dns\nhosts: files\n");
  EXPECT_EQ(Velmorctl({"nss", "show"}).output,
            "DATABASE  SERVICES\n"
            "hosts     nis [NOTFOUND=return] dns (does not count)\n"
            "hosts     files\n");
  EXPECT_EQ(Velmorctl({"nss", "show", "--json"}).Json()["databases"][0], nlohmann::json::parse(R"({
    "name": "hosts", "line": 1, "counts": false,
    "services": [{"name": "nis", "criterion": ["NOTFOUND=return"]}, {"name": "dns", "criterion": []}]
  })"));
}

TEST_F(NameServiceTest, ShowsNoDatabaseThatIsNotThere) {
  EXPECT_EQ(Velmorctl({"nss", "show", "initgroups"}).exitCode, 11);
}

TEST_F(NameServiceTest, AddsAService) {
  const Outcome outcome = Velmorctl({"nss", "add", "passwd", "winbind"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  ExpectIn(ReadFile(SWITCH_FILE), "\npasswd:         files winbind\ngroup:          files\n");
  ExpectIn(outcome.output, "-passwd:         files\n+passwd:         files winbind\n");
  ASSERT_EQ(Backups().size(), 1U);
  ExpectIn(outcome.output, "To undo it: velmorctl nss restore " + Backups().front() + "\n");
}

TEST_F(NameServiceTest, ChangesNothingTheSecondTime) {
  Velmorctl({"nss", "add", "passwd", "winbind"});
  const struct stat before = StatusOf(SWITCH_FILE);
  const Outcome outcome = Velmorctl({"nss", "add", "passwd", "winbind"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.output, "There is nothing to change.\n");
  EXPECT_TRUE(SameFile(before, StatusOf(SWITCH_FILE)));
  EXPECT_EQ(Backups().size(), 1U);
}

TEST_F(NameServiceTest, RemovesNothingThatIsNotThere) {
  EXPECT_EQ(Velmorctl({"nss", "remove", "passwd", "winbind"}).output, "There is nothing to change.\n");
}

TEST_F(NameServiceTest, SaysWhyFilesStays) {
  const Outcome outcome = Velmorctl({"nss", "remove", "passwd", "files"});
  EXPECT_EQ(outcome.exitCode, 2);
  ExpectIn(outcome.errors, "\"files\" or \"compat\" must stay first in \"passwd\"");
  ExpectIn(outcome.errors, "no local account, root included, could log in");
  ExpectIn(outcome.errors, "  file:     /etc/nsswitch.conf\n  line:     5\n");
  ExpectIn(outcome.errors, "  changed:  nothing\n");
}

TEST_F(NameServiceTest, WarnsOfAMissingModule) {
  ExpectIn(Velmorctl({"nss", "add", "passwd", "nosuch"}).errors, "there is no module libnss_nosuch.so.2 yet");
}

TEST_F(NameServiceTest, WarnsOfBracketsThatEndTheSearch) {
  WriteFile(SWITCH_FILE, "passwd: files [NOTFOUND=return]\n");
  ExpectIn(Velmorctl({"nss", "add", "passwd", "winbind"}).errors,
           "velmorctl: warning: \"winbind\" is not asked for what \"files\" does not find");
}

TEST_F(NameServiceTest, NeedsRootOnTheHostOnly) {
  EXPECT_EQ(Velmorctl({"nss", "add", "passwd", "winbind"}, WithoutRoot()).exitCode, 77);
  EXPECT_EQ(Velmorctl({"nss", "add", "passwd", "winbind", "--dry-run"}, WithoutRoot()).exitCode, 0);
  EXPECT_EQ(Velmorctl({"nss", "show"}, WithoutRoot()).exitCode, 0);
}

TEST_F(NameServiceTest, NeedsRootForAFileThatOnlyRootMayRead) {
  testsupport::SetMode(SWITCH_FILE, 0);
  const Outcome outcome = Velmorctl({"nss", "show"}, WithoutRoot());
  EXPECT_EQ(outcome.exitCode, 77);
  ExpectIn(outcome.errors, "  file:     /etc/nsswitch.conf\n  reason:   Permission denied\n");
}

TEST_F(NameServiceTest, EditsTheFileBehindALinkAndKeepsTheLink) {
  MakeFolders("/etc/switch");
  WriteFile("/etc/switch/nsswitch.conf", "passwd: files\n");
  testsupport::RemoveFile(SWITCH_FILE);
  ASSERT_EQ(symlink("/etc/switch/nsswitch.conf", SWITCH_FILE.c_str()), 0);
  EXPECT_EQ(Velmorctl({"nss", "add", "passwd", "winbind"}).exitCode, 0);
  EXPECT_EQ(ReadFile("/etc/switch/nsswitch.conf"), "passwd: files winbind\n");
  EXPECT_TRUE(S_ISLNK(StatusOf(SWITCH_FILE).st_mode));
}

TEST_F(NameServiceTest, StaysInsideTheRootWhereALinkIsAbsolute) {
  const testsupport::ScratchFolder root;
  MakeFolders(root.Path() + "etc/switch");
  WriteFile(root.Path() + "etc/switch/nsswitch.conf", "passwd: files\n");
  ASSERT_EQ(symlink("/etc/switch/nsswitch.conf", (root.Path() + "etc/nsswitch.conf").c_str()), 0);
  const std::string before = ReadFile(SWITCH_FILE);
  EXPECT_EQ(Velmorctl({"nss", "add", "passwd", "winbind", "--root", root.Path()}).exitCode, 0);
  EXPECT_EQ(ReadFile(root.Path() + "etc/switch/nsswitch.conf"), "passwd: files winbind\n");
  EXPECT_EQ(ReadFile(SWITCH_FILE), before);
  EXPECT_TRUE(Backups().empty());
}

TEST_F(NameServiceTest, CanBeCheckedForMonitoring) {
  WriteFile(SWITCH_FILE, "passwd: files nosuch\n");
  const Outcome outcome = Velmorctl({"nss", "check", "--json"});
  EXPECT_EQ(outcome.exitCode, 13);
  const nlohmann::json document = outcome.Json();
  EXPECT_EQ(document["schema"], "velmor.nss-check/1");
  ASSERT_EQ(document["findings"].size(), 1U);
  EXPECT_EQ(document["findings"][0]["file"], SWITCH_FILE);
  EXPECT_EQ(document["findings"][0]["line"], 1);
  EXPECT_EQ(document["findings"][0]["value"], "nosuch");
  ExpectIn(Velmorctl({"nss", "check"}).output,
           "/etc/nsswitch.conf:1: the library folders have no module libnss_nosuch.so.2\n"
           "  value:    nosuch\n"
           "  try:      ");
}

TEST_F(NameServiceTest, ShowsWhatTheProviderNeeds) {
  const Outcome outcome = Velmorctl({"nss", "diff"});
  EXPECT_EQ(outcome.exitCode, 13) << outcome.errors;
  ExpectIn(outcome.output, "+passwd:         files ctlscript\n+group:          files ctlscript\n");
  EXPECT_EQ(ReadFile(SWITCH_FILE), StockFiles().front().text);
  EXPECT_TRUE(Backups().empty());
}

TEST_F(NameServiceTest, ShowsNoDifferenceOnceTheProvidersServiceIsAdded) {
  Velmorctl({"nss", "add", "passwd", "ctlscript"});
  Velmorctl({"nss", "add", "group", "ctlscript"});
  EXPECT_EQ(Velmorctl({"nss", "diff"}).exitCode, 0);
}

TEST_F(NameServiceTest, NeedsTheProvidersServiceWhereGroupsOfAUserAreLookedUp) {
  WriteFile(SWITCH_FILE, "passwd: files ctlscript\ngroup: files ctlscript\ninitgroups: files\n");
  ExpectIn(Velmorctl({"nss", "diff"}).output, "+initgroups: files ctlscript\n");
}

TEST_F(NameServiceTest, CannotTellTheDifferenceWithoutAProvider) {
  testsupport::RemoveFile(testsupport::PROVIDER_CONF);
  EXPECT_EQ(Velmorctl({"nss", "diff"}).exitCode, 9);
  testsupport::ConfigureProvider("nosuch");
  EXPECT_EQ(Velmorctl({"nss", "diff"}).exitCode, 9);
}

TEST_F(NameServiceTest, AddsAServiceOnAHostWithoutAProvider) {
  testsupport::RemoveFile(testsupport::PROVIDER_CONF);
  EXPECT_EQ(Velmorctl({"nss", "add", "passwd", "winbind"}).exitCode, 0);
}

TEST_F(NameServiceTest, TakesTheProviderOfTheRoot) {
  const testsupport::ScratchFolder root;
  MakeFolders(root.Path() + "etc/quenix/velmor");
  WriteFile(root.Path() + "etc/nsswitch.conf", "passwd: files\n");
  EXPECT_EQ(Velmorctl({"nss", "diff", "--root", root.Path()}).exitCode, 9);
  WriteFile(root.Path() + testsupport::PROVIDER_CONF, "provider = \"ctlscript\"\n");
  EXPECT_EQ(Velmorctl({"nss", "diff", "--root", root.Path()}).exitCode, 13);
}

/// A provider whose name-service module has parameters.
class ProviderWithParametersTest : public NameServiceTest {
 protected:
  static void Install(const std::string& name) {
    testsupport::CopyFile(std::string(VELMORCTL_NSS_PLUGIN_FOLDER "/lib") + name + ".so",
                          testsupport::InstalledPlugin(name));
    testsupport::ConfigureProvider(name);
  }
};

TEST_F(ProviderWithParametersTest, HasThemBehindItsService) {
  Install("parameters");
  ExpectIn(Velmorctl({"nss", "diff"}).output,
           "+passwd:         files some [UNAVAIL=continue TRYAGAIN=return]\n");
  EXPECT_EQ(Velmorctl({"nss", "add", "passwd", "some"}).exitCode, 0);
  ExpectIn(ReadFile(SWITCH_FILE), "passwd:         files some [UNAVAIL=continue TRYAGAIN=return]\n");
}

TEST_F(ProviderWithParametersTest, HasADifferenceWithoutThem) {
  Install("parameters");
  WriteFile(SWITCH_FILE, "passwd: files some\ngroup: files some\n");
  const Outcome outcome = Velmorctl({"nss", "diff"});
  EXPECT_EQ(outcome.exitCode, 11);
  ExpectIn(outcome.errors,
           "  line:     1\n  reason:   the provider needs [UNAVAIL=continue TRYAGAIN=return]");
}

TEST_F(ProviderWithParametersTest, HasADifferenceBesideADatabaseThatIsRefused) {
  Install("parameters");
  WriteFile(SWITCH_FILE, "passwd: files some\ngroup: files\n");
  const Outcome outcome = Velmorctl({"nss", "diff"});
  EXPECT_EQ(outcome.exitCode, 13);
  ExpectIn(outcome.output, "+group: files some [UNAVAIL=continue TRYAGAIN=return]\n");
  ExpectIn(outcome.errors, "warning: \"passwd\" stays as it is: ");
  ExpectIn(outcome.errors,
           "line: 1; reason: the provider needs [UNAVAIL=continue TRYAGAIN=return] behind it");
}

TEST_F(ProviderWithParametersTest, HasThemNotBehindAnotherService) {
  Install("parameters");
  Velmorctl({"nss", "add", "passwd", "winbind"});
  ExpectIn(ReadFile(SWITCH_FILE), "passwd:         files winbind\n");
}

TEST_F(ProviderWithParametersTest, IsRefusedWhenTheLibraryDoesNotKnowThem) {
  testsupport::InstallPlugin("spaced_parameters");
  testsupport::ConfigureProvider("spaced_parameters");
  const Outcome outcome = Velmorctl({"nss", "diff"});
  EXPECT_EQ(outcome.exitCode, 9);
  ExpectIn(outcome.errors, "that the C library does not know");
}

TEST_F(ProviderWithParametersTest, IsRefusedWhenItsServiceHasNoName) {
  Install("no_service");
  EXPECT_EQ(Velmorctl({"nss", "diff"}).exitCode, 9);
}

TEST_F(NameServiceTest, RestoresTheBackupOfAnId) {
  const std::string first = ReadFile(SWITCH_FILE);
  Velmorctl({"nss", "add", "passwd", "winbind"});
  Velmorctl({"nss", "add", "group", "winbind"});
  const std::vector<std::string> backups = Backups();
  ASSERT_EQ(backups.size(), 2U);
  EXPECT_EQ(Velmorctl({"nss", "restore", backups.front()}).exitCode, 0);
  EXPECT_EQ(ReadFile(SWITCH_FILE), first);
}

TEST_F(NameServiceTest, RestoresNothingInADryRun) {
  Velmorctl({"nss", "add", "passwd", "winbind"});
  const struct stat before = StatusOf(SWITCH_FILE);
  ExpectIn(Velmorctl({"nss", "restore", "--dry-run"}).output, "-passwd:         files winbind\n");
  EXPECT_TRUE(SameFile(before, StatusOf(SWITCH_FILE)));
  EXPECT_EQ(Backups().size(), 1U);
}

TEST_F(NameServiceTest, RestoresNoBackupThatIsNotThere) {
  EXPECT_EQ(Velmorctl({"nss", "restore"}).exitCode, 11);
  EXPECT_EQ(Velmorctl({"nss", "restore", "20200101T000000Z"}).exitCode, 2);
}

TEST_F(NameServiceTest, ListsTheBackups) {
  EXPECT_EQ(Velmorctl({"nss", "restore", "--list"}).output, "There are no backups.\n");
  Velmorctl({"nss", "add", "passwd", "winbind"});
  const std::string id = Backups().front();
  EXPECT_EQ(Velmorctl({"nss", "restore", "--list"}).output,
            "BACKUP            BEFORE                  FILES\n" + id +
                "  nss add passwd winbind  /etc/nsswitch.conf\n");
  EXPECT_EQ(Velmorctl({"nss", "restore", "--list", "--json"}).Json(),
            (nlohmann::json{{"schema", "velmor.backups/1"},
                            {"kind", "nss"},
                            {"backups",
                             {{{"id", id},
                               {"command", "nss add passwd winbind"},
                               {"files", nlohmann::json::array({SWITCH_FILE})}}}}}));
}

TEST_F(NameServiceTest, ListsADamagedBackupWithTheOthers) {
  Velmorctl({"nss", "add", "passwd", "winbind"});
  const std::string id = Backups().front();
  WriteFile(BACKUPS + "/" + id + "/0", "");
  ExpectIn(Velmorctl({"nss", "restore", "--list"}).output, "(the backup " + id + " cannot be used)");
}

TEST_F(NameServiceTest, LetsLocalUsersBeFoundWithAServiceThatHasNoModule) {
  ASSERT_EQ(RunTool({"getent", "passwd", "root"}).exitCode, 0);
  for (const char* database : {"passwd", "group", "shadow"}) {
    EXPECT_EQ(Velmorctl({"nss", "add", database, "nosuch"}).exitCode, 0);
    EXPECT_EQ(RunTool({"getent", database, "root"}).exitCode, 0) << database;
    EXPECT_EQ(RunTool({"getent", database, "nobody-of-this-name"}).exitCode, 2) << database;
  }
}

struct BadFile {
  const char* name;
  void (*make)();
  const char* reason;
};

class BadSwitchFileTest : public NameServiceTest, public ::testing::WithParamInterface<BadFile> {};

TEST_P(BadSwitchFileTest, IsReportedByEveryCommand) {
  testsupport::RemoveFile(SWITCH_FILE);
  GetParam().make();
  const struct stat before = StatusOf("/etc");
  for (const std::vector<std::string>& arguments : {std::vector<std::string>{"show"},
                                                    {"check"},
                                                    {"diff"},
                                                    {"add", "passwd", "x"},
                                                    {"remove", "passwd", "x"}}) {
    std::vector<std::string> command = {"nss"};
    command.insert(command.end(), arguments.begin(), arguments.end());
    const Outcome outcome = Velmorctl(command);
    EXPECT_EQ(outcome.exitCode, 11) << outcome.output;
    ExpectIn(outcome.errors, "  file:     /etc/nsswitch.conf\n");
    ExpectIn(outcome.errors, GetParam().reason);
    ExpectIn(outcome.errors, "  changed:  nothing\n  try:      ");
  }
  EXPECT_TRUE(SameFile(before, StatusOf("/etc")));
}

INSTANTIATE_TEST_SUITE_P(
    Each, BadSwitchFileTest,
    ::testing::Values(
        BadFile{"Missing", [] {}, "  reason:   it does not exist\n"},
        BadFile{"Folder", [] { MakeFolders(SWITCH_FILE); }, "  reason:   it is not a regular file\n"},
        BadFile{"DanglingLink", [] { EXPECT_EQ(symlink("/nowhere", SWITCH_FILE.c_str()), 0); },
                "  reason:   it leads to '/nowhere', which does not exist\n"},
        BadFile{"LinkToItself", [] { EXPECT_EQ(symlink("nsswitch.conf", SWITCH_FILE.c_str()), 0); },
                "Too many levels of symbolic links"},
        BadFile{"Device", [] { EXPECT_EQ(symlink("/dev/zero", SWITCH_FILE.c_str()), 0); },
                "  reason:   it is not a regular file\n"},
        BadFile{"NullBytes", [] { WriteFile(SWITCH_FILE, std::string("passwd: files\n\0", 15)); },
                "  line:     2\n  value:    0x00\n  reason:   it is no text file\n"},
        BadFile{"Binary", [] { testsupport::CopyFile(VELMORCTL_PROGRAM, SWITCH_FILE); }, "  reason:   it "},
        BadFile{"HundredMegabytes",
                [] {
                  WriteFile(SWITCH_FILE, "");
                  EXPECT_EQ(truncate(SWITCH_FILE.c_str(), 100'000'000), 0);
                },
                "  reason:   it has more than a mebibyte"},
        BadFile{"EndlessLine", [] { WriteFile(SWITCH_FILE, "passwd: " + std::string(2 << 20, 'x')); },
                "  reason:   it has more than a mebibyte"}),
    [](const auto& test) { return std::string(test.param.name); });

TEST_F(NameServiceTest, RefusesARootThatIsNone) {
  EXPECT_EQ(Velmorctl({"nss", "show", "--root", "/nowhere"}).exitCode, 2);
}

TEST_F(NameServiceTest, ShowsNoControlCharactersOfTheFile) {
  WriteFile(SWITCH_FILE, "passwd: files\r\nhosts: files\xc2\x9b\r\n");
  const std::string output = Velmorctl({"nss", "add", "passwd", "winbind", "--dry-run"}).output;
  ExpectIn(output, "+passwd: files winbind^M\n hosts: files^?^M\n");
  EXPECT_EQ(output.find('\r'), std::string::npos);
}

TEST_F(NameServiceTest, ChangesNothingThatItCannotShow) {
  const Outcome outcome = Velmorctl({"nss", "add", "passwd", "winbind"}, WithOutputTo("/dev/full"));
  EXPECT_EQ(outcome.exitCode, 1);
  ExpectIn(outcome.errors, "cannot write the output");
  ExpectIn(outcome.errors, "  changed:  nothing\n");
  EXPECT_EQ(ReadFile(SWITCH_FILE), StockFiles().front().text);
  EXPECT_TRUE(Backups().empty());
}

TEST_F(NameServiceTest, ShowsNoControlCharactersOfTheRoot) {
  const testsupport::ScratchFolder scratch;
  const std::string root = scratch.Path() + "a\x1b\xc2\x9b" + "b";
  MakeFolders(root + "/etc");
  WriteFile(root + "/etc/nsswitch.conf", "passwd: files nosuch\n");
  ExpectIn(Velmorctl({"nss", "add", "passwd", "winbind", "--root", root}).output,
           " --root '" + scratch.Path() + "a??b'\n");
}

TEST_F(NameServiceTest, NamesTheRootInARemedy) {
  const testsupport::ScratchFolder root;
  MakeFolders(root.Path() + "etc");
  MakeFolders(root.Path() + "usr/lib/x86_64-linux-gnu");
  WriteFile(root.Path() + "usr/lib/x86_64-linux-gnu/libnss_files.so.2", "");
  WriteFile(root.Path() + "etc/nsswitch.conf", "passwd: files nosuch\n");
  const std::string folder = root.Path().substr(0, root.Path().size() - 1);
  ExpectIn(Velmorctl({"nss", "check", "--root", folder}).output,
           "velmorctl nss remove passwd nosuch --root " + folder + "\n");
}

TEST_F(NameServiceTest, ReportsAWriteThatFailsAndLeavesTheFile) {
  const testsupport::ScratchFolder root;
  const testsupport::SmallFileSystem disk(root.Path(), 64 << 10);
  MakeFolders(root.Path() + "etc");
  WriteFile(root.Path() + "etc/nsswitch.conf", "passwd: files\n");
  EXPECT_THROW(WriteFile(root.Path() + "rest", std::string(1 << 20, 'x')), std::system_error);
  const Outcome outcome = Velmorctl({"nss", "add", "passwd", "winbind", "--root", root.Path()});
  EXPECT_EQ(outcome.exitCode, 11);
  ExpectIn(outcome.errors, "  changed:  nothing\n");
  EXPECT_EQ(ReadFile(root.Path() + "etc/nsswitch.conf"), "passwd: files\n");
}

}  // namespace

}  // namespace velmorctltest
