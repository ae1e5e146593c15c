// The files in which policies are written, in memory.
#include "pam_edit/written_policies.h"

#include <gtest/gtest.h>

#include "velmorctl/pam/policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::FileReading;
using velmorctl::pam::ReadingProblem;
using velmorctl::pam::ReadWrittenPolicies;
using velmorctl::pam::WrittenPolicies;

const std::string SERVICE = "/etc/pam.d/svc";

std::vector<std::string> FilesIn(const PolicySet& files, const std::vector<std::string>& names = {SERVICE}) {
  std::vector<std::string> found;
  for (const auto& [name, content] : ReadWrittenPolicies(names, ReaderOf(files)).contents) {
    found.push_back(name);
  }
  return found;
}

TEST(WrittenPoliciesTest, HoldTheContentOfEachFile) {
  const PolicySet files = {{"svc", "auth required pam_unix.so\n"}};
  EXPECT_EQ(ReadWrittenPolicies({SERVICE}, ReaderOf(files)).contents,
            (std::map<std::string, std::string>{{SERVICE, "auth required pam_unix.so\n"}}));
}

TEST(WrittenPoliciesTest, HoldWhatIsIncludedByAnyOfTheThreeWays) {
  EXPECT_EQ(
      FilesIn({{"svc", "@include a\nauth include b\naccount substack /etc/security/c\n"},
               {"a", ""},
               {"b", "auth include d\n"},
               {"d", ""},
               {"/etc/security/c", ""}}),
      (std::vector<std::string>{"/etc/pam.d/a", "/etc/pam.d/b", "/etc/pam.d/d", SERVICE, "/etc/security/c"}));
}

TEST(WrittenPoliciesTest, GoOnBehindALineThatLibpamRefuses) {
  EXPECT_EQ(FilesIn({{"svc", "@include nowhere\nauth required ?\nauth include\n@include a\n"}, {"a", ""}}),
            (std::vector<std::string>{"/etc/pam.d/a", SERVICE}));
}

TEST(WrittenPoliciesTest, HoldEachFileOfACircleOnce) {
  EXPECT_EQ(FilesIn({{"svc", "@include a\n"}, {"a", "@include svc\n@include a\n"}}),
            (std::vector<std::string>{"/etc/pam.d/a", SERVICE}));
}

TEST(WrittenPoliciesTest, NameFilesThatCannotBeReadAndNoMissingOnes) {
  const auto read = [](const std::string& name) -> FileReading {
    if (name == SERVICE) {
      return {"@include bad\n@include missing\n", std::nullopt};
    }
    return name == "/etc/pam.d/bad"
               ? FileReading{std::nullopt, ReadingProblem{"it is no text file", "put one there", 0, ""}}
               : FileReading();
  };
  const WrittenPolicies written = ReadWrittenPolicies({SERVICE}, read);
  EXPECT_EQ(written.contents.size(), 1U);
  EXPECT_EQ(written.unreadable,
            (std::map<std::string, std::string>{{"/etc/pam.d/bad", "it is no text file"}}));
}

}  // namespace

}  // namespace velmorctltest
