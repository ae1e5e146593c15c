#include "nss/switch_edit.h"

#include <gtest/gtest.h>

#include <random>

#include "failure_of.h"
#include "nss/databases.h"

namespace velmorctltest {

namespace {

using velmorctl::ExitCode;
using velmorctl::Failure;
using velmorctl::SwitchEdit;
using velmorctl::SwitchFile;

SwitchEdit Add(const std::string& text, const std::string& database, const std::string& service,
               const std::string& after = "") {
  return velmorctl::AddService(SwitchFile(text), "nsswitch.conf", database, {service, {}}, after);
}

SwitchEdit Remove(const std::string& text, const std::string& database, const std::string& service) {
  return velmorctl::RemoveService(SwitchFile(text), "nsswitch.conf", database, service);
}

struct Addition {
  const char* name;
  std::string before;
  const char* database;
  const char* service;
  const char* after;
  std::string result;
};

class AddServiceTest : public ::testing::TestWithParam<Addition> {};

TEST_P(AddServiceTest, ChangesTheLine) {
  EXPECT_EQ(Add(GetParam().before, GetParam().database, GetParam().service, GetParam().after).content,
            GetParam().result);
}

INSTANTIATE_TEST_SUITE_P(
    Each, AddServiceTest,
    ::testing::Values(
        Addition{"AtTheEnd", "passwd: files\n", "passwd", "winbind", "", "passwd: files winbind\n"},
        Addition{"KeepsBlanksAndTabs", "passwd:\t  files\t systemd  \n", "passwd", "winbind", "",
                 "passwd:\t  files\t systemd winbind  \n"},
        Addition{"KeepsTheCarriageReturn", "passwd: files\r\n", "passwd", "winbind", "",
                 "passwd: files winbind\r\n"},
        Addition{"BehindTheBracketsOfTheLast", "group: files [SUCCESS=merge]\n", "group", "winbind", "",
                 "group: files [SUCCESS=merge] winbind\n"},
        Addition{"BehindAService", "passwd: files systemd\n", "passwd", "winbind", "files",
                 "passwd: files winbind systemd\n"},
        Addition{"BehindTheBracketsOfAService", "group: files [SUCCESS=merge] systemd\n", "group", "winbind",
                 "files", "group: files [SUCCESS=merge] winbind systemd\n"},
        Addition{"WhereNoBlankFollows", "hosts: files[NOTFOUND=continue]dns\n", "hosts", "wins", "files",
                 "hosts: files[NOTFOUND=continue] wins dns\n"},
        Addition{"BeforeARemark", "passwd: files # ours\n", "passwd", "winbind", "",
                 "passwd: files winbind # ours\n"},
        Addition{"BeforeARemarkWithoutABlank", "passwd: files#ours\n", "passwd", "winbind", "",
                 "passwd: files winbind #ours\n"},
        Addition{"OnlyTheOneLine", "# passwd: files\npasswd: files\nfoo bar\npasswd_compat: nis\n", "passwd",
                 "winbind", "", "# passwd: files\npasswd: files winbind\nfoo bar\npasswd_compat: nis\n"},
        Addition{"ToADatabaseWithoutServices", "hosts:\n", "hosts", "files", "", "hosts: files\n"},
        Addition{"BehindTheBlanksOfADatabaseWithoutServices", "group: \npasswd: files\n", "group", "winbind",
                 "", "group: files winbind\npasswd: files\n"},
        Addition{"FilesToo", "passwd:\n", "passwd", "winbind", "", "passwd: files winbind\n"},
        Addition{"FilesFirst", "passwd:   sss\n", "passwd", "files", "", "passwd:   files sss\n"},
        Addition{"BehindWhatStandsBeforeFiles", "passwd: sss files\n", "passwd", "winbind", "",
                 "passwd: sss files winbind\n"},
        Addition{"ToAnUnknownDatabaseWithALine", "foo: bar\n", "foo", "winbind", "", "foo: bar winbind\n"},
        Addition{"ALine", "group: files\n", "passwd", "winbind", "", "group: files\npasswd: files winbind\n"},
        Addition{"ALineForFiles", "group: files\n", "passwd", "files", "", "group: files\npasswd: files\n"},
        Addition{"ALineBehindFiles", "group: files\n", "passwd", "winbind", "files",
                 "group: files\npasswd: files winbind\n"},
        Addition{"ALineWithACarriageReturn", "group: files\r\n", "passwd", "winbind", "",
                 "group: files\r\npasswd: files winbind\r\n"},
        Addition{"ALineToAnEmptyFile", "", "passwd", "winbind", "", "passwd: files winbind\n"},
        Addition{"NothingThatIsThere", "passwd: files winbind\n", "passwd", "winbind", "",
                 "passwd: files winbind\n"},
        Addition{"KeepsALastLineWithoutNewline", "passwd: files\nhosts: files", "passwd", "winbind", "",
                 "passwd: files winbind\nhosts: files"}),
    [](const auto& test) { return std::string(test.param.name); });

TEST(AddServiceWithParametersTest, WritesThemInBrackets) {
  EXPECT_EQ(velmorctl::AddService(SwitchFile("passwd: files\n"), "", "passwd",
                                  {"winbind", {"NOTFOUND=return", "UNAVAIL=continue"}}, "")
                .content,
            "passwd: files winbind [NOTFOUND=return UNAVAIL=continue]\n");
}

TEST(AddServiceWithParametersTest, RefusesThoseThatTheLibraryDoesNotKnow) {
  EXPECT_EQ(FailureOf([] {
              velmorctl::AddService(SwitchFile("passwd: files\n"), "", "passwd", {"winbind", {"debug"}}, "");
            }).Code(),
            ExitCode::Other);
}

TEST(AddServiceWarningTest, NamesTheBracketsThatEndTheSearch) {
  const SwitchEdit edit = Add("passwd: files [NOTFOUND=return] sss\n", "passwd", "winbind");
  EXPECT_EQ(edit.content, "passwd: files [NOTFOUND=return] sss winbind\n");
  EXPECT_EQ(edit.warnings,
            (std::vector<std::string>{"\"winbind\" is not asked for what \"files\" does not find, because of "
                                      "[NOTFOUND=return] in \"passwd\""}));
}

TEST(AddServiceWarningTest, KnowsNegatedBrackets) {
  EXPECT_EQ(Add("hosts: resolve [!UNAVAIL=return] files\n", "hosts", "wins").warnings.size(), 1U);
}

TEST(AddServiceWarningTest, IsNotGivenForTheBracketsOfLaterServices) {
  EXPECT_TRUE(Add("hosts: files resolve [!UNAVAIL=return] dns\n", "hosts", "wins", "files").warnings.empty());
}

TEST(AddServiceWarningTest, IsNotGivenForBracketsThatGoOn) {
  EXPECT_TRUE(Add("group: files [SUCCESS=merge] systemd\n", "group", "winbind").warnings.empty());
}

TEST(AddServiceWarningTest, TellsThatLocalAccountsAreNotRead) {
  EXPECT_EQ(Add("passwd: sss\n", "passwd", "winbind").warnings,
            (std::vector<std::string>{
                "\"passwd\" has neither \"files\" nor \"compat\", so that no local account is found"}));
}

TEST(AddServiceWarningTest, IsNotGivenForLocalFilesThatAreAdded) {
  EXPECT_TRUE(Add("passwd: sss\n", "passwd", "files").warnings.empty());
  EXPECT_TRUE(Add("passwd:\n", "passwd", "winbind").warnings.empty());
}

TEST(AddServiceBeforeLocalFilesTest, NamesTheServiceToStandBehind) {
  EXPECT_EQ(FailureOf([] { Add("group: sss compat\n", "group", "winbind", "sss"); }).Advice(),
            "put it behind the local files, with --after compat or without --after");
}

TEST(AddServiceThatIsThereTest, IsRefusedWhenItsBracketsMeanSomethingElse) {
  for (const char* line : {"passwd: files some\n", "passwd: files some [TRYAGAIN=continue]\n"}) {
    const Failure failure = FailureOf([&] {
      velmorctl::AddService(SwitchFile(line), "", "passwd", {"some", {"TRYAGAIN=return"}}, "");
    });
    EXPECT_EQ(failure.Code(), ExitCode::Configuration);
    EXPECT_EQ(DetailOf(failure, "reason"), "the provider needs [TRYAGAIN=return] behind it");
  }
}

TEST(AddServiceThatIsThereTest, StaysWhenItsBracketsMeanTheSame) {
  const std::string line = "passwd: files some [tryagain=RETURN UNAVAIL=continue]\n";
  EXPECT_EQ(velmorctl::AddService(SwitchFile(line), "", "passwd", {"some", {"TRYAGAIN=return"}}, "").content,
            line);
}

struct Removal {
  const char* name;
  std::string before;
  const char* database;
  const char* service;
  std::string result;
};

class RemoveServiceTest : public ::testing::TestWithParam<Removal> {};

TEST_P(RemoveServiceTest, ChangesTheLine) {
  EXPECT_EQ(Remove(GetParam().before, GetParam().database, GetParam().service).content, GetParam().result);
}

INSTANTIATE_TEST_SUITE_P(
    Each, RemoveServiceTest,
    ::testing::Values(
        Removal{"TheLast", "passwd: files winbind\n", "passwd", "winbind", "passwd: files\n"},
        Removal{"OneInTheMiddle", "passwd:\tfiles\twinbind  systemd\n", "passwd", "winbind",
                "passwd:\tfiles  systemd\n"},
        Removal{"TheFirst", "hosts:    files  dns\n", "hosts", "files", "hosts:    dns\n"},
        Removal{"TheOnlyOne", "sudoers: files\n", "sudoers", "files", "sudoers:\n"},
        Removal{"ItsBracketsToo", "hosts: files mdns4_minimal [NOTFOUND=return] dns\n", "hosts",
                "mdns4_minimal", "hosts: files dns\n"},
        Removal{"ItsBracketsWithoutBlanks", "hosts: files nis[NOTFOUND=return]dns\n", "hosts", "nis",
                "hosts: files dns\n"},
        Removal{"TheFirstWithBrackets", "hosts: resolve [!UNAVAIL=return] files\n", "hosts", "resolve",
                "hosts: files\n"},
        Removal{"NotTheBracketsOfAnother", "hosts: files [NOTFOUND=return] dns\n", "hosts", "dns",
                "hosts: files [NOTFOUND=return]\n"},
        Removal{"BothOfTwo", "hosts: files wins dns wins\n", "hosts", "wins", "hosts: files dns\n"},
        Removal{"BeforeARemark", "hosts: files wins#ours\n", "hosts", "wins", "hosts: files #ours\n"},
        Removal{"BeforeACarriageReturn", "hosts: files dns\r\n", "hosts", "dns", "hosts: files\r\n"},
        Removal{"NothingThatIsNotThere", "hosts: files\n", "hosts", "dns", "hosts: files\n"},
        Removal{"NothingWithoutALine", "hosts: files\n", "passwd", "winbind", "hosts: files\n"},
        Removal{"CompatBehindFiles", "passwd: files compat\n", "passwd", "compat", "passwd: files\n"},
        Removal{"WhatStandsBeforeFiles", "passwd: sss files\n", "passwd", "sss", "passwd: files\n"}),
    [](const auto& test) { return std::string(test.param.name); });

struct Refusal {
  const char* name;
  const char* text;
  const char* command;
  const char* database;
  const char* service;
  const char* after;
  ExitCode code;
};

class RefusedEditTest : public ::testing::TestWithParam<Refusal> {};

TEST_P(RefusedEditTest, SaysWhy) {
  const Refusal& edit = GetParam();
  const Failure failure = FailureOf([&] {
    if (edit.command == std::string("add")) {
      Add(edit.text, edit.database, edit.service, edit.after);
    } else {
      Remove(edit.text, edit.database, edit.service);
    }
  });
  EXPECT_EQ(failure.Code(), edit.code) << failure.what();
  EXPECT_FALSE(failure.Advice().empty());
}

INSTANTIATE_TEST_SUITE_P(
    Each, RefusedEditTest,
    ::testing::Values(
        Refusal{"TakesFilesAway", "passwd: files sss\n", "remove", "passwd", "files", "", ExitCode::Usage},
        Refusal{"TakesTheOnlyServiceAway", "hosts: files\n", "remove", "hosts", "files", "", ExitCode::Usage},
        Refusal{"TakesTheOnlyFilesAway", "group: files\n", "remove", "group", "files", "", ExitCode::Usage},
        Refusal{"TakesFilesAwayFromTheMiddle", "shadow: sss files\n", "remove", "shadow", "files", "",
                ExitCode::Usage},
        Refusal{"TakesCompatAway", "shadow: compat sss\n", "remove", "shadow", "compat", "", ExitCode::Usage},
        Refusal{"StandsBehindWhatIsNotThere", "passwd: files\n", "add", "passwd", "winbind", "sss",
                ExitCode::Usage},
        Refusal{"StandsBeforeFiles", "passwd: sss files\n", "add", "passwd", "winbind", "sss",
                ExitCode::Usage},
        Refusal{"StandsBehindWhatIsNoDefault", "group: files\n", "add", "passwd", "winbind", "sss",
                ExitCode::Usage},
        Refusal{"NameWithABracket", "passwd: files\n", "add", "passwd", "win[bind", "", ExitCode::Usage},
        Refusal{"NameWithABlank", "passwd: files\n", "add", "passwd", "win bind", "", ExitCode::Usage},
        Refusal{"NameWithANewline", "passwd: files\n", "add", "passwd", "winbind\ngroup: x", "",
                ExitCode::Usage},
        Refusal{"NameWithASlash", "passwd: files\n", "add", "passwd", "../winbind", "", ExitCode::Usage},
        Refusal{"NameOfNothing", "passwd: files\n", "add", "passwd", "", "", ExitCode::Usage},
        Refusal{"NameOfNothingToRemove", "passwd: files\n", "remove", "passwd", "", "", ExitCode::Usage},
        Refusal{"UnknownDatabase", "passwd: files\n", "add", "pass", "winbind", "", ExitCode::Usage},
        Refusal{"UnknownDatabaseToRemoveFrom", "passwd: files\n", "remove", "pass", "winbind", "",
                ExitCode::Usage},
        Refusal{"HostsWithoutALine", "passwd: files\n", "add", "hosts", "wins", "", ExitCode::Usage},
        Refusal{"InitgroupsWithoutALine", "passwd: files\n", "add", "initgroups", "winbind", "",
                ExitCode::Usage},
        Refusal{"TwoLines", "passwd: files\npasswd: files\n", "add", "passwd", "winbind", "",
                ExitCode::Configuration},
        Refusal{"NoColon", "passwd files\n", "add", "passwd", "winbind", "", ExitCode::Configuration},
        Refusal{"TwoColons", "passwd:: files\n", "add", "passwd", "winbind", "", ExitCode::Configuration},
        Refusal{"LoneBracket", "passwd: [NOTFOUND=return] files\n", "add", "passwd", "winbind", "",
                ExitCode::Configuration},
        Refusal{"BadCriterion", "passwd: files [X]\n", "add", "passwd", "winbind", "",
                ExitCode::Configuration},
        Refusal{"BadCriterionOfAnotherDatabase", "passwd: files\nhosts: files [X]\n", "add", "passwd",
                "winbind", "", ExitCode::Configuration},
        Refusal{"NoNewline", "passwd: files", "add", "passwd", "winbind", "", ExitCode::Configuration},
        Refusal{"NoNewlineBeforeANewLine", "group: files", "add", "passwd", "winbind", "",
                ExitCode::Configuration},
        Refusal{"FaultBeforeARemoval", "passwd: files winbind", "remove", "passwd", "winbind", "",
                ExitCode::Configuration}),
    [](const auto& test) { return std::string(test.param.name); });

TEST(SwitchEditTest, PassesOverTheFaultsOfDatabasesThatTheLibraryDoesNotRead) {
  EXPECT_EQ(Add("sudoers: files [X]\npasswd: files\n", "passwd", "winbind").content,
            "sudoers: files [X]\npasswd: files winbind\n");
}

/// A line of a switch file, with blanks, brackets and line ends of all kinds.
std::string RandomLine(std::mt19937& random, const std::string& database) {
  const auto oneOf = [&random](std::initializer_list<const char*> words) {
    return std::string(words.begin()[random() % words.size()]);
  };
  std::string line = oneOf({"", "", " "}) + database + ":";
  std::vector<std::string> services = {"files", "sss", "nis", "db"};
  for (auto count = 1 + random() % services.size(); count > 0; --count) {
    line += oneOf({" ", "  ", "\t"}) + services[services.size() - count];
    line += oneOf({"", "", " [NOTFOUND=return]", "[!UNAVAIL=return]", "  [ SUCCESS=merge TRYAGAIN=return ]"});
  }
  return line + oneOf({"", "", "", " ", "  ", "\r", " # remark"}) + "\n";
}

std::string RandomFile(std::mt19937& random) {
  std::string text;
  for (const char* database : {"passwd", "group", "hosts", "sudoers", "foo"}) {
    text += random() % 4 == 0 ? "# comment\n\n" : "";
    text += RandomLine(random, database);
  }
  return text;
}

TEST(SwitchEditOfRandomFilesTest, IsUndoneByItsOpposite) {
  std::mt19937 random(42);  // NOLINT(cert-msc51-cpp): the same files each time
  for (int count = 0; count < 300; ++count) {
    const std::string text = RandomFile(random);
    for (const char* database : {"passwd", "group", "hosts", "sudoers", "foo"}) {
      const std::string added = Add(text, database, "winbind").content;
      EXPECT_NE(added, text);
      EXPECT_EQ(Remove(added, database, "winbind").content, text) << added;
    }
  }
}

TEST(SwitchEditOfRandomFilesTest, TakesEveryServiceOut) {
  std::mt19937 random(43);  // NOLINT(cert-msc51-cpp): the same files each time
  for (int count = 0; count < 300; ++count) {
    std::string text = RandomFile(random);
    for (const char* service : {"sss", "nis", "db", "files"}) {
      text = Remove(text, "foo", service).content;
    }
    EXPECT_TRUE(SwitchFile(text).LinesOf("foo").front()->services.empty()) << text;
  }
}

}  // namespace

}  // namespace velmorctltest
