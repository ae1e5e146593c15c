#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <regex>
#include <set>
#include <sstream>

#include "program.h"
#include "support/files.h"
#include "tool.h"

namespace velmorctltest {

namespace {

const std::string SOURCES = VELMOR_SOURCE_FOLDER;

std::string Page(const std::string& name) {
  return testsupport::ReadFile(SOURCES + "/docs/man/" + name);
}

std::vector<std::string> Lines(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(line);
  }
  return lines;
}

std::string WithoutSuffix(std::string text, const std::string& suffix) {
  if (text.ends_with(suffix)) {
    text.resize(text.size() - suffix.size());
  }
  return text;
}

/// "priority: text" of each call of syslog() in the library's sources.
std::set<std::string> MessagesInSources() {
  static const std::regex call(R"re(syslog\(LOG_([A-Z]+),\s*"([^"]*)")re");
  std::set<std::string> messages;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(SOURCES + "/src")) {
    if (entry.path().extension() != ".cc") {
      continue;
    }
    const std::string source = testsupport::ReadFile(entry.path());
    for (std::sregex_iterator match(source.begin(), source.end(), call), end; match != end; ++match) {
      std::string priority = (*match)[1];
      std::transform(priority.begin(), priority.end(), priority.begin(),
                     [](unsigned char letter) { return std::tolower(letter); });
      messages.insert(priority + ": " + WithoutSuffix((*match)[2], "\\n"));
    }
  }
  return messages;
}

/// The number of calls of syslog(), however they are written.
std::size_t CallsInSources() {
  std::size_t calls = 0;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(SOURCES + "/src")) {
    if (entry.is_regular_file()) {
      const std::string source = testsupport::ReadFile(entry.path());
      static const std::regex call(R"(\bv?syslog\()");
      calls += static_cast<std::size_t>(
          std::distance(std::sregex_iterator(source.begin(), source.end(), call), {}));
    }
  }
  return calls;
}

std::set<std::string> MessagesInPage() {
  static const std::regex entry("\\.It Qq \"([^\"]*)\"\n\\.Sy ([a-z]+) \\.\n[^.]");
  const std::string page = Page("velmor-messages.7");
  std::set<std::string> messages;
  for (std::sregex_iterator match(page.begin(), page.end(), entry), end; match != end; ++match) {
    messages.insert(std::string((*match)[2]) + ": " + WithoutSuffix((*match)[1], "\\&"));
  }
  return messages;
}

TEST(ManualTest, MessagesAreThoseOfTheLibrary) {
  EXPECT_EQ(MessagesInPage(), MessagesInSources());
}

TEST(ManualTest, EveryMessageOfTheLibraryIsOneLiteralAtItsCall) {
  static const std::regex call(R"re(syslog\(LOG_[A-Z]+,\s*"[^"]*"(?!\s*"))re");
  std::size_t literals = 0;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(SOURCES + "/src")) {
    if (entry.is_regular_file()) {
      const std::string source = testsupport::ReadFile(entry.path());
      literals += static_cast<std::size_t>(
          std::distance(std::sregex_iterator(source.begin(), source.end(), call), {}));
    }
  }
  EXPECT_GT(literals, 0U);
  EXPECT_EQ(literals, CallsInSources());
}

/// The exit codes in the help text: number, and meaning with a capital letter and a full stop.
std::vector<std::pair<std::string, std::string>> ExitCodesInHelp() {
  std::vector<std::pair<std::string, std::string>> codes;
  static const std::regex row("^  ([0-9]+)\t(.+)$");
  for (const std::string& line : Lines(Velmorctl({"--help"}).output)) {
    std::smatch match;
    if (std::regex_match(line, match, row)) {
      std::string meaning = match[2];
      meaning[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(meaning[0])));
      codes.emplace_back(match[1], meaning + ".");
    }
  }
  return codes;
}

std::vector<std::pair<std::string, std::string>> ExitCodesInPage() {
  const std::string page = Page("velmorctl.8");
  const std::string section = page.substr(page.find(".Sh EXIT STATUS"));
  std::vector<std::pair<std::string, std::string>> codes;
  const std::vector<std::string> lines = Lines(section);
  static const std::regex item(R"(\.It ([0-9]+))");
  for (std::size_t index = 0; index + 1 < lines.size(); ++index) {
    std::smatch match;
    if (std::regex_match(lines[index], match, item)) {
      codes.emplace_back(match[1], lines[index + 1]);
    }
  }
  return codes;
}

TEST(ManualTest, ExitCodesAreThoseOfTheCommand) {
  EXPECT_EQ(ExitCodesInHelp().size(), 15U);
  EXPECT_EQ(ExitCodesInPage(), ExitCodesInHelp());
}

/// The names of the subcommands in a help text.
std::vector<std::string> Subcommands(const std::vector<std::string>& command) {
  std::vector<std::string> arguments = command;
  arguments.push_back("--help");
  std::vector<std::string> names;
  bool inList = false;
  for (const std::string& line : Lines(Velmorctl(arguments).output)) {
    if (inList && line.starts_with("  ")) {
      names.push_back(line.substr(2, line.find(' ', 2) - 2));
    } else {
      inList = line == "Subcommands:";
    }
  }
  return names;
}

/// Every command in full: "status", "trust show" and so on.
std::vector<std::vector<std::string>> AllCommands() {
  std::vector<std::vector<std::string>> commands;
  for (const std::string& name : Subcommands({})) {
    const std::vector<std::string> parts = Subcommands({name});
    for (const std::string& part : parts) {
      commands.push_back({name, part});
    }
    if (parts.empty()) {
      commands.push_back({name});
    }
  }
  return commands;
}

/// The long options that a command's help text lists.
std::set<std::string> OptionsOf(std::vector<std::string> command) {
  command.push_back("--help");
  const std::string help = Velmorctl(command).output;
  static const std::regex option(R"(--([a-z][a-z0-9-]+))");
  std::set<std::string> options;
  for (std::sregex_iterator match(help.begin(), help.end(), option), end; match != end; ++match) {
    options.insert((*match)[1]);
  }
  return options;
}

TEST(ManualTest, EveryCommandIsInThePage) {
  const std::string page = Page("velmorctl.8");
  const std::vector<std::vector<std::string>> commands = AllCommands();
  EXPECT_GE(commands.size(), 16U);
  for (const std::vector<std::string>& command : commands) {
    const std::regex entry("\\.(Cm|It Cm) " + command[0] +
                           (command.size() > 1 ? "[a-z |]* " + command[1] : "") + "\\b");
    EXPECT_TRUE(std::regex_search(page, entry)) << command[0] << " " << command.back();
  }
}

TEST(ManualTest, EveryOptionIsInThePage) {
  const std::string page = Page("velmorctl.8");
  for (const std::vector<std::string>& command : AllCommands()) {
    for (const std::string& option : OptionsOf(command)) {
      if (option != "help" && option != "user") {
        EXPECT_NE(page.find("Fl -" + option), std::string::npos) << command[0] << " --" << option;
      }
    }
  }
}

TEST(ManualTest, RestoreWithoutAnIdMeansTheSameInThePageAndInTheHelp) {
  const std::string page = Page("velmorctl.8");
  for (const std::string kind : {"nss", "pam"}) {
    const std::string help = Velmorctl({kind, "restore", "--help"}).output;
    EXPECT_NE(help.find("without it the newest that no restore has left"), std::string::npos) << help;
    const std::string entry = page.substr(page.find(".It Cm " + kind + " restore Op Ar ID\n"), 300);
    EXPECT_NE(entry.find("before the newest one that is not a restore itself"), std::string::npos) << entry;
  }
}

TEST(ManualTest, EveryCommandIsCompletedByTheShell) {
  const std::string completion = testsupport::ReadFile(SOURCES + "/tools/velmorctl/velmorctl.bash");
  for (const std::vector<std::string>& command : AllCommands()) {
    const std::regex word("[ '\"(=]" + command.back() + "[ '\")]");
    EXPECT_TRUE(std::regex_search(completion, word)) << command[0] << " " << command.back();
  }
}

/// The long options that the shell offers behind a command.
std::set<std::string> OptionsOfferedBehind(const std::vector<std::string>& command) {
  std::vector<std::string> arguments = {
      "bash", "-c",
      "source \"$0\"; COMP_WORDS=(velmorctl \"$@\" --); COMP_CWORD=$(($# + 1)); _velmorctl; "
      "printf '%s\\n' \"${COMPREPLY[@]}\"",
      SOURCES + "/tools/velmorctl/velmorctl.bash"};
  arguments.insert(arguments.end(), command.begin(), command.end());
  std::set<std::string> options;
  for (const std::string& line : Lines(RunTool(arguments).output)) {
    if (line.starts_with("--")) {
      options.insert(line.substr(2));
    }
  }
  return options;
}

TEST(ManualTest, TheShellOffersTheOptionsThatACommandHas) {
  for (const std::vector<std::string>& command : AllCommands()) {
    std::set<std::string> options = OptionsOf(command);
    options.erase("help");
    EXPECT_EQ(OptionsOfferedBehind(command), options) << command[0] << " " << command.back();
  }
}

TEST(ManualTest, EverySchemaIsInThePage) {
  const std::string page = Page("velmorctl.8");
  static const std::regex schema(R"re("(velmor\.[a-z-]+/[0-9]+)")re");
  std::size_t found = 0;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(SOURCES + "/tools/velmorctl")) {
    const std::string source = entry.is_regular_file() ? testsupport::ReadFile(entry.path()) : "";
    for (std::sregex_iterator match(source.begin(), source.end(), schema), end; match != end; ++match) {
      ++found;
      EXPECT_NE(page.find("\n.Sq " + (*match)[1].str()), std::string::npos) << (*match)[1];
    }
  }
  EXPECT_GE(found, 11U);
}

}  // namespace

}  // namespace velmorctltest
