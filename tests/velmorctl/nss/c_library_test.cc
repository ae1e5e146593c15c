/// The C library of this machine against our reader: what it does with a file is what the reader says.
#include <gtest/gtest.h>
#include <pwd.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <random>

#include "nss/databases.h"
#include "nss/switch_file.h"
#include "support/files.h"

namespace velmorctltest {

namespace {

using velmorctl::LineFault;
using velmorctl::LookupAction;
using velmorctl::LookupStatus;
using velmorctl::SwitchFile;
using velmorctl::SwitchLine;

const std::string SWITCH_FILE = "/etc/nsswitch.conf";

/// Whether a process that reads the file for the first time finds root.
bool LibraryFindsRoot(const std::string& text) {
  testsupport::WriteFile(SWITCH_FILE, text);
  const pid_t child = fork();
  if (child == 0) {
    _exit(getpwnam("root") != nullptr ? 1 : 0);
  }
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  EXPECT_TRUE(child > 0 && WIFEXITED(status)) << text;
  return WEXITSTATUS(status) == 1;
}

/// Whether one of the services finds root: "files" does, and of the others there is no module.
bool FindsRoot(const SwitchLine& line) {
  for (const velmorctl::SwitchService& service : line.services) {
    if (service.meaning.name == "files") {
      return true;
    }
    if (service.actions.For(LookupStatus::Unavailable) != LookupAction::Continue) {
      return false;
    }
  }
  return false;
}

/// Whether the C library would read past the end of a list; what happens then is a matter of luck.
bool HasEmptyLine(const std::string& text) {
  const SwitchFile file(text);
  const std::vector<const SwitchLine*> lines = file.LinesOf("passwd");
  return std::any_of(lines.begin(), lines.end(),
                     [&](const SwitchLine* line) { return file.Counts(*line) && line->services.empty(); });
}

/// The same as our reader tells it.
bool ReaderFindsRoot(const std::string& text) {
  const SwitchFile file(text);
  for (const SwitchLine& line : file.Lines()) {
    const bool isRead = velmorctl::IsLibraryDatabase(line.database) && !line.Has(LineFault::Kind::NoNewline);
    if (isRead && line.Has(LineFault::Kind::BadCriterion)) {
      return false;
    }
  }
  for (const SwitchLine* line : file.LinesOf("passwd")) {
    if (file.Counts(*line)) {
      return FindsRoot(*line);
    }
  }
  return velmorctl::DefaultsToFiles("passwd");
}

class CLibraryTest : public ::testing::TestWithParam<std::pair<const char*, bool>> {};

TEST_P(CLibraryTest, ReadsTheFileAsOurReader) {
  const auto& [text, found] = GetParam();
  EXPECT_EQ(LibraryFindsRoot(text), found) << text;
  EXPECT_EQ(ReaderFindsRoot(text), found) << text;
}

INSTANTIATE_TEST_SUITE_P(
    Each, CLibraryTest,
    ::testing::Values(std::pair{"", true}, std::pair{"passwd: none\n", false},
                      std::pair{"passwd: none\npasswd: files\n", true},
                      std::pair{"passwd: files\npasswd: none\n", false}, std::pair{"passwd none\n", false},
                      std::pair{"passwd : none\n", false}, std::pair{"passwd:: none\n", false},
                      std::pair{"PASSWD: none\n", true}, std::pair{" passwd: none\n", false},
                      std::pair{" # passwd: none\n", true}, std::pair{"passwd: none", true},
                      std::pair{"passwd: none\npasswd: files", false},
                      std::pair{"passwd: none [] files\n", false}, std::pair{"hosts: none []\n", false},
                      std::pair{"sudoers: none []\n", true}, std::pair{"netmasks: none []\n", true},
                      std::pair{"subid: none []\n", true}, std::pair{"hosts: none [] files", true},
                      std::pair{"passwd: none [UNAVAIL=return] files\n", false},
                      std::pair{"passwd: none[unavail=Continue]files\n", true},
                      std::pair{"passwd: none [!NOTFOUND=return] files\n", false},
                      std::pair{"passwd: none [!UNAVAIL=return] files\n", true},
                      std::pair{"passwd: none [ UNAVAIL = return ] files\n", false},
                      std::pair{"passwd: none [! UNAVAIL=continue] files\n", false},
                      std::pair{"passwd: none [UNAVAIL=continue,NOTFOUND=return] files\n", false},
                      std::pair{"passwd: none [UNAVAIL=merge] files\n", false},
                      std::pair{"passwd: none [UNAVAIL=continue] [NOTFOUND=continue] files\n", false},
                      std::pair{"passwd: none ] files\n", true},
                      std::pair{"passwd:\vnone\ffiles\r\n", true}));

/// Words that are good and bad in every place of a line.
std::string RandomText(std::mt19937& random) {
  const auto oneOf = [&random](std::initializer_list<const char*> words) {
    return std::string(words.begin()[random() % words.size()]);
  };
  std::string text;
  for (auto lines = 1 + random() % 4; lines > 0; --lines) {
    text += oneOf({"passwd", "passwd", "passwd", "hosts", "sudoers", " passwd", "#", "passwd_compat"}) +
            oneOf({":", ": ", " : ", " ", "::"});
    for (auto words = random() % 6; words > 0; --words) {
      text += oneOf({"none", "other", "none", "files", "]", "none[", "none["}) + oneOf({" ", "", "\t"});
      text += oneOf({"", "", "[UNAVAIL=return]", "[!UNAVAIL=return]", "[UNAVAIL=continue]",
                     "[NOTFOUND=return]", "[ tryagain=Return  unavail = continue ]",
                     "[!notfound=return UNAVAIL=continue]", "[UNAVAIL=merge]", "UNAVAIL=return]"});
      text += oneOf({" ", " ", "", "\r"});
    }
    text += lines > 1 || random() % 4 != 0 ? "\n" : "";
  }
  return text;
}

TEST(CLibraryOnRandomFilesTest, ReadsThemAsOurReader) {
  std::mt19937 random(1871);  // NOLINT(cert-msc51-cpp): the same files each time
  int found = 0;
  for (int count = 0; count < 1000; ++count) {
    const std::string text = RandomText(random);
    if (HasEmptyLine(text)) {
      continue;
    }
    const bool finds = LibraryFindsRoot(text);
    ASSERT_EQ(ReaderFindsRoot(text), finds) << text;
    found += finds ? 1 : 0;
  }
  EXPECT_GT(found, 100);
  EXPECT_LT(found, 900);
}

}  // namespace

}  // namespace velmorctltest
