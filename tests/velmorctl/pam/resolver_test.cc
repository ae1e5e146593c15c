#include "pam/resolver.h"

#include <gtest/gtest.h>

#include "policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::Facility;
using velmorctl::pam::FileReading;
using velmorctl::pam::ModuleName;
using velmorctl::pam::Origin;
using velmorctl::pam::Policy;
using velmorctl::pam::ResolvePolicy;
using velmorctl::pam::StackEntry;
using State = Policy::State;

Policy Resolve(const PolicySet& files, const std::string& service = "svc") {
  return ResolvePolicy(service, ReaderOf(files));
}

/// "level:module@file:line" of each entry.
std::vector<std::string> Entries(const Policy& policy, Facility facility) {
  std::vector<std::string> entries;
  for (const StackEntry& entry : policy.StackOf(facility)) {
    entries.push_back(std::to_string(entry.level) + ":" + entry.module + "@" + entry.origin.file + ":" +
                      std::to_string(entry.origin.line));
  }
  return entries;
}

TEST(ResolverTest, PutsIncludedLinesIntoTheStackWithTheirOrigin) {
  const Policy policy = Resolve({{"svc", "auth required a.so\n@include part\nauth include part\n"},
                                 {"part", "# x\nauth required b.so\naccount required c.so\n"}});
  EXPECT_EQ(Entries(policy, Facility::Auth),
            (std::vector<std::string>{"0:a.so@/etc/pam.d/svc:1", "0:b.so@/etc/pam.d/part:2",
                                      "0:b.so@/etc/pam.d/part:2"}));
  EXPECT_EQ(Entries(policy, Facility::Account), std::vector<std::string>{"0:c.so@/etc/pam.d/part:3"});
  EXPECT_TRUE(policy.findings.empty());
}

TEST(ResolverTest, ASubstackHasAHigherLevel) {
  const Policy policy =
      Resolve({{"svc", "auth substack part\nauth required a.so\n"}, {"part", "auth required b.so\n"}});
  EXPECT_EQ(Entries(policy, Facility::Auth),
            (std::vector<std::string>{"0:part@/etc/pam.d/svc:1", "1:b.so@/etc/pam.d/part:1",
                                      "0:a.so@/etc/pam.d/svc:2"}));
  EXPECT_EQ(policy.StackOf(Facility::Auth)[0].kind, StackEntry::Kind::Substack);
}

TEST(ResolverTest, TakesMissingStacksFromOther) {
  const Policy policy =
      Resolve({{"svc", "auth required a.so\n"}, {"other", "auth required b.so\naccount required c.so\n"}});
  EXPECT_EQ(Entries(policy, Facility::Auth), std::vector<std::string>{"0:a.so@/etc/pam.d/svc:1"});
  EXPECT_FALSE(policy.IsFromOther(Facility::Auth));
  EXPECT_EQ(Entries(policy, Facility::Account), std::vector<std::string>{"0:c.so@/etc/pam.d/other:2"});
  EXPECT_TRUE(policy.IsFromOther(Facility::Account));
}

TEST(ResolverTest, TheAdministratorsFileHidesTheVendors) {
  const PolicySet files = {{"svc", "auth required a.so\n"}, {"/usr/lib/pam.d/svc", "auth required b.so\n"}};
  EXPECT_EQ(Resolve(files).file, "/etc/pam.d/svc");
  EXPECT_EQ(Resolve({{"/usr/lib/pam.d/svc", "auth required b.so\n"}}).file, "/usr/lib/pam.d/svc");
}

TEST(ResolverTest, AVendorsFileIsNotIncluded) {
  const Policy policy =
      Resolve({{"svc", "auth include part\n"}, {"/usr/lib/pam.d/part", "auth required b.so\n"}});
  ASSERT_EQ(policy.StackOf(Facility::Auth).size(), 1U);
  EXPECT_EQ(policy.StackOf(Facility::Auth)[0].kind, StackEntry::Kind::AlwaysFails);
}

TEST(ResolverTest, TakesTheServiceInLowerCase) {
  EXPECT_EQ(Resolve({{"svc", ""}}, "SVC").file, "/etc/pam.d/svc");
}

TEST(ResolverTest, OtherItselfIsReadTwice) {
  const Policy policy = Resolve({{"other", "auth required a.so\n"}}, "other");
  EXPECT_EQ(policy.StackOf(Facility::Auth).size(), 2U);
  EXPECT_TRUE(Resolve({{"other", "auth nonsense a.so\n"}}, "other").findings.size() == 1);
}

struct FaultyPolicy {
  const char* name;
  PolicySet files;
  State state;
  Origin origin;
};

class FaultyPolicyTest : public ::testing::TestWithParam<FaultyPolicy> {};

TEST_P(FaultyPolicyTest, HasAFindingWithItsPlace) {
  const Policy policy = Resolve(GetParam().files);
  EXPECT_EQ(policy.state, GetParam().state);
  ASSERT_FALSE(policy.findings.empty());
  EXPECT_EQ(policy.findings[0].origin, GetParam().origin);
  EXPECT_FALSE(policy.findings[0].reason.empty());
  EXPECT_FALSE(policy.findings[0].remedy.empty());
}

PolicySet Doubling() {
  PolicySet files = {{"svc", "@include part0\n"}};
  for (int number = 0; number < 30; ++number) {
    const std::string next = "@include part" + std::to_string(number + 1) + "\n";
    files["part" + std::to_string(number)] = next + next;
  }
  files["part30"] = "auth required a.so\n";
  return files;
}

PolicySet Deep() {
  PolicySet files = {{"svc", "@include part0\n"}};
  for (int number = 0; number < 300; ++number) {
    files["part" + std::to_string(number)] = "@include part" + std::to_string(number + 1) + "\n";
  }
  return files;
}

INSTANTIATE_TEST_SUITE_P(
    Each, FaultyPolicyTest,
    ::testing::Values(
        FaultyPolicy{"UnknownControl", {{"svc", "\nauth what a.so\n"}}, State::Usable, {"/etc/pam.d/svc", 2}},
        FaultyPolicy{"LongLine",
                     {{"svc", "auth required a.so " + std::string(2000, 'x')}},
                     State::Usable,
                     {"/etc/pam.d/svc", 1}},
        FaultyPolicy{
            "IncludeMissing", {{"svc", "auth include nowhere\n"}}, State::Usable, {"/etc/pam.d/svc", 1}},
        FaultyPolicy{
            "WholeIncludeMissing", {{"svc", "@include nowhere\n"}}, State::Refused, {"/etc/pam.d/svc", 1}},
        FaultyPolicy{"Unfinished", {{"svc", "auth \\\n"}}, State::Refused, {"/etc/pam.d/svc", 1}},
        FaultyPolicy{"OtherUnfinished",
                     {{"svc", "auth required a.so\n"}, {"other", "a\nauth \\\n"}},
                     State::Refused,
                     {"/etc/pam.d/other", 1}},
        FaultyPolicy{"NoSuchService", {}, State::Refused, {"/etc/pam.d/svc", 0}},
        FaultyPolicy{"Circle",
                     {{"svc", "auth include a\n"}, {"a", "auth include b\n"}, {"b", "auth include a\n"}},
                     State::Fatal,
                     {"/etc/pam.d/b", 1}},
        FaultyPolicy{"IncludeOfNothing", {{"svc", "auth include\n"}}, State::Fatal, {"/etc/pam.d/svc", 1}},
        FaultyPolicy{
            "Endless", {{"svc", std::string(1022, 'x') + "\\\n"}}, State::Fatal, {"/etc/pam.d/svc", 1}},
        FaultyPolicy{"Doubling", Doubling(), State::Fatal, {"/etc/pam.d/part30", 1}},
        FaultyPolicy{
            "SubstackCircle", {{"svc", "auth substack svc\n"}}, State::Usable, {"/etc/pam.d/svc", 1}}),
    [](const ::testing::TestParamInfo<FaultyPolicy>& faulty) { return faulty.param.name; });

TEST(ResolverTest, GivesUpOnIncludesThatAreNestedTooDeep) {
  const Policy policy = Resolve(Deep());
  EXPECT_EQ(policy.state, State::Fatal);
  ASSERT_EQ(policy.findings.size(), 1U);
  EXPECT_EQ(policy.findings[0].reason, "includes are nested more than 200 deep");
}

TEST(ResolverTest, AWholeIncludeThatFailsWithinAnIncludeIsBad) {
  const Policy policy = Resolve({{"svc", "auth include part\n"}, {"part", "@include nowhere\n"}});
  EXPECT_EQ(policy.state, State::Usable);
  ASSERT_EQ(policy.StackOf(Facility::Auth).size(), 1U);
  EXPECT_EQ(policy.StackOf(Facility::Auth)[0].kind, StackEntry::Kind::AlwaysFails);
  ASSERT_EQ(policy.findings.size(), 1U);
  EXPECT_EQ(policy.findings[0].origin, (Origin{"/etc/pam.d/part", 1}));
}

TEST(ResolverTest, AFaultOfAnIncludedFileIsFoundOnce) {
  const Policy policy = Resolve({{"svc", "@include part\n@include part\n"}, {"part", "auth what a.so\n"}});
  EXPECT_EQ(policy.findings.size(), 1U);
}

TEST(ResolverTest, WhatIsWrongInOtherIsItsOwnMatterWhereItIsNotUsed) {
  const std::string all =
      "auth required a.so\naccount required a.so\npassword required a.so\nsession required a.so\n";
  EXPECT_TRUE(Resolve({{"svc", all}, {"other", "auth what b.so\n"}}).findings.empty());
  EXPECT_FALSE(Resolve({{"svc", ""}, {"other", "auth what b.so\n"}}).findings.empty());
}

const velmorctl::pam::ReadingProblem binary = {"it is no text file", "put a text file there", 3, "0x00"};

TEST(ResolverTest, AFileThatCannotBeReadIsAFindingWithItsPlace) {
  const Policy policy = ResolvePolicy("svc", [](const std::string& path) {
    return path == "/etc/pam.d/svc" ? FileReading{std::nullopt, binary} : FileReading();
  });
  EXPECT_EQ(policy.state, State::Refused);
  ASSERT_FALSE(policy.findings.empty());
  EXPECT_EQ(policy.findings[0].origin, (Origin{"/etc/pam.d/svc", 3}));
  EXPECT_EQ(policy.findings[0].value, "0x00");
  EXPECT_EQ(policy.findings[0].reason, "the file cannot be read: it is no text file");
  EXPECT_EQ(policy.findings[0].remedy, "put a text file there");
}

TEST(ResolverTest, AnIncludedFileThatCannotBeReadIsAFindingOfTheLineThatIncludesIt) {
  const Policy policy = ResolvePolicy("svc", [](const std::string& path) {
    return path == "/etc/pam.d/svc"    ? FileReading{"\n@include part\n", std::nullopt}
           : path == "/etc/pam.d/part" ? FileReading{std::nullopt, binary}
                                       : FileReading();
  });
  ASSERT_EQ(policy.findings.size(), 1U);
  EXPECT_EQ(policy.findings[0].origin, (Origin{"/etc/pam.d/svc", 2}));
  EXPECT_EQ(policy.findings[0].value, "part");
  EXPECT_EQ(policy.findings[0].reason,
            "the included file \"/etc/pam.d/part\" cannot be read: it is no text file (line 3: 0x00)");
  EXPECT_EQ(policy.findings[0].remedy, "put a text file there");
}

TEST(ResolverTest, NamesModulesWithoutFolderAndSuffix) {
  EXPECT_EQ(ModuleName("pam_unix.so"), "pam_unix");
  EXPECT_EQ(ModuleName("/lib/security/pam_unix.so"), "pam_unix");
  EXPECT_EQ(ModuleName("pam_unix"), "pam_unix");
}

}  // namespace

}  // namespace velmorctltest
