#include <gtest/gtest.h>

#include <array>
#include <sstream>

#include "pam/resolver.h"
#include "policy_generator.h"
#include "real_libpam.h"
#include "support/files.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::FacilityFor;
using velmorctl::pam::FileReader;
using velmorctl::pam::FileReading;
using velmorctl::pam::FrozenChain;
using velmorctl::pam::NameOf;
using velmorctl::pam::Operation;
using velmorctl::pam::Policy;
using velmorctl::pam::ResolvePolicy;
using velmorctl::pam::ReturnCode;
using velmorctl::pam::Simulate;
using velmorctl::pam::Stack;
using velmorctl::pam::StackEntry;

const std::string MODULE = SCRIPTED_PAM_MODULE;

const std::vector<Operation> EVERY_OPERATION = {Operation::Authenticate,       Operation::ManageAccount,
                                                Operation::SetCredentials,     Operation::OpenSession,
                                                Operation::PrepareTokenChange, Operation::CloseSession};

/// Does with the simulator what AskLibpam does with libpam.
class Rehearsal {
 public:
  explicit Rehearsal(const Policy& policy) : policy_(policy) {}

  Protocol Run(const std::vector<Operation>& operations) {
    if (policy_.state != Policy::State::Usable) {
      return {{"start=abort"}};
    }
    for (Operation operation : operations) {
      ReturnCode code = Call(operation);
      if (operation == Operation::PrepareTokenChange && code == ReturnCode::Success) {
        code = Call(Operation::ChangeToken);
      }
      protocol_.lines.push_back(std::string(NameOf(operation)) + "=" + NameOf(code));
      if (code == ReturnCode::Incomplete) {
        break;
      }
    }
    return protocol_;
  }

 private:
  ReturnCode Call(Operation operation) {
    const Stack& stack = policy_.StackOf(FacilityFor(operation));
    FrozenChain& chain = chains_[static_cast<std::size_t>(FacilityFor(operation))];
    return Simulate(
               stack, operation,
               [this](const StackEntry& entry, std::size_t, Operation asked) { return Answer(entry, asked); },
               chain)
        .code;
  }

  ReturnCode Answer(const StackEntry& entry, Operation operation) {
    if (entry.module != MODULE) {
      return ReturnCode::ModuleUnknown;
    }
    const std::string name = ScriptName(operation);
    protocol_.lines.push_back(CallLine(name, entry.arguments));
    for (const std::string& argument : entry.arguments) {
      if (argument.starts_with(name + "=")) {
        return static_cast<ReturnCode>(std::stoi(argument.substr(name.size() + 1)));
      }
    }
    return ReturnCode::Success;
  }

  const Policy& policy_;
  std::array<FrozenChain, velmorctl::pam::facilities.size()> chains_;
  Protocol protocol_;
};

std::string Shown(const PolicySet& files) {
  std::ostringstream stream;
  for (const auto& [name, content] : files) {
    stream << "---- " << name << "\n" << content << "\n";
  }
  return stream.str();
}

/// Some texts include the module itself, which libpam reads like any other file.
Policy Resolve(const PolicySet& files) {
  const FileReader reader = ReaderOf(files);
  return ResolvePolicy("svc", [&reader](const std::string& path) {
    return path == MODULE ? FileReading{testsupport::ReadFile(path), std::nullopt} : reader(path);
  });
}

void ExpectTheSame(const PolicySet& files, const std::vector<Operation>& operations) {
  const Policy policy = Resolve(files);
  if (policy.state == Policy::State::Fatal) {
    EXPECT_TRUE(LibpamCrashesOrHangs(files)) << Shown(files);
    return;
  }
  EXPECT_EQ(Rehearsal(policy).Run(operations), AskLibpam(files, operations)) << Shown(files);
}

/// Ends at the first disagreement, which may bring many more.
void CompareGenerated(PolicySet (*generate)(std::uint32_t), std::uint32_t count,
                      const std::vector<Operation>& operations) {
  for (std::uint32_t number = 1; number <= count && !::testing::Test::HasFailure(); ++number) {
    SCOPED_TRACE("policy number " + std::to_string(number));
    ExpectTheSame(generate(number), operations);
  }
}

TEST(LibpamComparisonTest, GeneratedStacksHaveTheSameVerdicts) {
  CompareGenerated(GeneratePolicy, 1000, EVERY_OPERATION);
}

TEST(LibpamComparisonTest, CredentialsAndSessionsEndTheSameWithoutWhatGoesBefore) {
  CompareGenerated(GeneratePolicy, 200, {Operation::SetCredentials, Operation::CloseSession});
}

TEST(LibpamComparisonTest, GeneratedOddTextsAreReadTheSame) {
  CompareGenerated(GenerateOddText, 1000, {Operation::Authenticate, Operation::ManageAccount});
}

/// The comparison would prove nothing if the generated policies did nothing.
TEST(LibpamComparisonTest, GeneratedStacksSucceedAndFailAndUseEveryKindOfEntry) {
  std::size_t usable = 0;
  std::size_t substacks = 0;
  std::size_t failing = 0;
  std::size_t successes = 0;
  for (std::uint32_t number = 1; number <= 1000; ++number) {
    const PolicySet files = GeneratePolicy(number);
    const Policy policy = Resolve(files);
    usable += policy.state == Policy::State::Usable ? 1 : 0;
    for (const Stack& stack : policy.stacks) {
      for (const StackEntry& entry : stack) {
        substacks += entry.kind == StackEntry::Kind::Substack ? 1 : 0;
        failing += entry.kind == StackEntry::Kind::AlwaysFails ? 1 : 0;
      }
    }
    const Protocol protocol = Rehearsal(policy).Run({Operation::Authenticate});
    successes += protocol.lines.back() == "pam_authenticate=success" ? 1U : 0U;
  }
  EXPECT_GT(usable, 900U);
  EXPECT_GT(substacks, 500U);
  EXPECT_GT(failing, 50U);
  EXPECT_GT(successes, 150U);
  EXPECT_LT(successes, 850U);
}

struct OddPolicy {
  const char* name;
  PolicySet files;
};

std::string Good(const std::string& mark = "good") {
  return "auth required " + MODULE + " " + mark + "\n";
}

std::string Lines(const std::string& start, std::size_t count) {
  std::string lines;
  for (std::size_t number = 0; number < count; ++number) {
    lines += start;
  }
  return lines;
}

/// part1 includes part2 and so on; the last of `depth` files has a module.
PolicySet Chain(const std::string& how, int depth) {
  PolicySet files = {{"svc", how + "part1\n"}};
  for (int number = 1; number < depth; ++number) {
    files["part" + std::to_string(number)] = how + "part" + std::to_string(number + 1) + "\n";
  }
  files["part" + std::to_string(depth)] = Good();
  return files;
}

std::vector<OddPolicy> OddPolicies() {
  const std::string tail = " required " + MODULE + " ";
  return {
      {"NoService", {{"elsewhere", Good()}}},
      {"OnlyOther", {{"other", Good()}}},
      {"EmptyService", {{"svc", ""}}},
      {"OtherForMissingFacilities",
       {{"svc", Good()}, {"other", Good("other") + "account" + tail + "other\n"}}},
      {"BrokenOther", {{"svc", Good()}, {"other", Good() + "auth \\"}}},
      {"UpperCaseKeywords", {{"svc", "AUTH Required " + MODULE + "\n"}}},
      {"KeywordInBrackets", {{"svc", "[auth] [required] [" + MODULE + "] [a b] [c\\]d]e [f\n"}}},
      {"ListWithoutBrackets", {{"svc", "auth success=ok " + MODULE + "\n"}}},
      {"GluedList", {{"svc", "auth [success=okdefault=bad] " + MODULE + "\n"}}},
      {"SpacedList", {{"svc", "auth [ success = ok\tdefault = die ] " + MODULE + "\n"}}},
      {"UpperCaseList", {{"svc", "auth [SUCCESS=ok] " + MODULE + "\n"}}},
      {"EmptyList", {{"svc", "auth [] " + MODULE + " auth=25\n"}}},
      {"EmptyListWithoutModule", {{"svc", Good() + "auth []\n"}}},
      {"JumpZero", {{"svc", "auth [success=0] " + MODULE + "\n" + Good()}}},
      {"JumpSign", {{"svc", "auth [success=+1] " + MODULE + "\n" + Good()}}},
      {"JumpWithLeadingZero", {{"svc", "auth [success=01] " + MODULE + "\n" + Good("a") + Good("b")}}},
      {"JumpPastTheEnd", {{"svc", "auth [success=2] " + MODULE + "\n" + Good()}}},
      {"JumpToTheEnd", {{"svc", Good() + "auth [success=1] " + MODULE + "\nauth" + tail + "auth=7\n"}}},
      {"DefaultTwice", {{"svc", "auth [default=ok default=die] " + MODULE + " auth=7\n"}}},
      {"DefaultFirst", {{"svc", "auth [default=ok auth_err=die] " + MODULE + " auth=7\n" + Good()}}},
      {"ValueTwice", {{"svc", "auth [success=ok success=die] " + MODULE + "\n"}}},
      {"UnknownValueLast", {{"svc", "auth [success=ok what=ok] " + MODULE + "\n"}}},
      {"UnknownControl", {{"svc", "auth what " + MODULE + " auth=7\n"}}},
      {"UnknownFacility", {{"svc", "what" + tail + "\n" + Good()}}},
      {"UnknownFacilitySufficient", {{"svc", "what sufficient " + MODULE + "\n" + Good()}}},
      {"UnknownFacilityIncludes", {{"svc", "what include part1\n"}, {"part1", Good()}}},
      {"UnknownFacilityInInclude", {{"svc", "account include part1\n"}, {"part1", "what" + tail + "\n"}}},
      {"UnknownFacilityWithoutModuleName", {{"svc", Good() + "what required []\n"}}},
      {"FacilityAlone", {{"svc", "auth\n" + Good()}}},
      {"NoModule", {{"svc", "auth required\n" + Good()}}},
      {"NoModuleOptional", {{"svc", "auth optional\n" + Good()}}},
      {"EmptyFacility", {{"svc", "[]" + tail + "\n" + Good()}}},
      {"EmptyModule", {{"svc", Good() + "auth optional []\n"}}},
      {"ModuleOfASuffixAlone", {{"svc", Good() + "auth optional .so\n"}}},
      {"ModuleOfADot", {{"svc", Good() + "auth optional .\n"}}},
      {"ModuleOfTwoDots", {{"svc", Good() + "auth optional ..\n"}}},
      {"ModuleIsAFolder", {{"svc", Good() + "auth optional pam/\n"}}},
      {"ModuleOfAQuestionMark", {{"svc", Good() + "auth optional ?.so\n"}}},
      {"MissingModule", {{"svc", "auth required pam_nowhere.so\n"}}},
      {"MissingModuleWithDash", {{"svc", "-auth required pam_nowhere.so\n" + Good()}}},
      {"MissingModuleIgnored", {{"svc", "auth [module_unknown=ignore] pam_nowhere.so\n" + Good()}}},
      {"TwoDashes", {{"svc", "--auth" + tail + "\n" + Good()}}},
      {"DashAlone", {{"svc", "- auth" + tail + "\n" + Good()}}},
      {"CommentBehindText", {{"svc", "auth" + tail + "a#b c\n" + Good()}}},
      {"CommentInBrackets", {{"svc", "auth" + tail + "[a#b] c\n" + Good()}}},
      {"CommentWithBackslash", {{"svc", "# a \\\n" + Good()}}},
      {"CommentBehindBackslash", {{"svc", "auth" + tail + "a \\ # b\n" + Good()}}},
      {"CommentBetweenContinuedLines", {{"svc", "auth" + tail + "a \\\n# c\n  b\n" + Good()}}},
      {"BlankBetweenContinuedLines", {{"svc", "auth" + tail + "a \\\n\n \n  b\n" + Good()}}},
      {"BackslashInsideAWord", {{"svc", "auth" + tail + "a\\\nb\\c\n" + Good()}}},
      {"TwoBackslashes", {{"svc", "auth" + tail + "a\\\\\nb\n" + Good()}}},
      {"BlanksBehindBackslash", {{"svc", "auth" + tail + "a \\ \t \nb\n" + Good()}}},
      {"FormFeedBehindBackslash", {{"svc", "auth" + tail + "a \\\f\nb\n" + Good()}}},
      {"BackslashLineAlone", {{"svc", "\\\n" + Good()}}},
      {"BackslashAtTheEnd", {{"svc", Good() + "auth" + tail + "a \\\n"}}},
      {"BackslashAtTheEndWithoutNewline", {{"svc", Good() + "auth" + tail + "a \\"}}},
      {"BackslashAloneAtTheEnd", {{"svc", Good() + "\\\n"}}},
      {"BackslashThenBlankEnd", {{"svc", Good() + "auth" + tail + "a \\\n\n# b\n"}}},
      {"NoNewlineAtTheEnd", {{"svc", Good() + "auth" + tail + "a"}}},
      {"CarriageReturns", {{"svc", "auth" + tail + "a\r\n" + "auth" + tail + "\\\r\n" + Good()}}},
      {"CarriageReturnBehindModule", {{"svc", "auth required " + MODULE + "\r\n" + Good()}}},
      {"NullByte", {{"svc", "auth" + tail + std::string("a\0b\n", 4) + Good()}}},
      {"NullByteFirst", {{"svc", std::string("\0auth required pam_nowhere.so\n", 30) + Good()}}},
      {"NullByteBehindBackslash", {{"svc", "auth" + tail + std::string("a \\\0b\n c\n", 9) + Good()}}},
      {"ByteOrderMark", {{"svc", "\xef\xbb\xbf" + Good()}}},
      {"LineOf1023Bytes",
       {{"svc", "auth" + tail + std::string(std::size_t{1022} - 5 + 1 - tail.size(), 'x') + "\n" + Good()}}},
      {"LongLine", {{"svc", "auth" + tail + std::string(5000, 'x') + "\n" + Good()}}},
      {"LongCommentWithPolicy", {{"svc", "#" + std::string(1022, 'x') + "account" + tail + "\n" + Good()}}},
      {"LongContinuedLine",
       {{"svc", "auth" + tail + Lines(std::string(80, 'x') + " \\\n", 20) + "end\n" + Good()}}},
      {"Include", {{"svc", "auth include part1\n"}, {"part1", Good() + "account" + tail + "\n"}}},
      {"IncludeOfNothing", {{"svc", "auth include []\n" + Good()}}},
      {"IncludeWithoutName", {{"svc", Good() + "auth include\n"}}},
      {"IncludeMissing", {{"svc", Good() + "auth include nowhere\n"}}},
      {"IncludeMissingBehindSufficient", {{"svc", "auth sufficient " + MODULE + "\nauth include nowhere\n"}}},
      {"IncludeByPath", {{"svc", "auth include /etc/pam.d/part1\n"}, {"part1", Good()}}},
      {"IncludeUpwards", {{"svc", "auth include ../pam.d/part1\n"}, {"part1", Good()}}},
      {"IncludeOtherCase", {{"svc", "auth include Part1\n" + Good()}, {"part1", Good()}}},
      {"IncludeOfBrokenFile", {{"svc", Good() + "auth include part1\n"}, {"part1", Good("p") + "auth \\"}}},
      {"IncludeItself", {{"svc", Good() + "auth include svc\n"}}},
      {"WholeInclude", {{"svc", "@include part1\n"}, {"part1", Good() + "account" + tail + "\n"}}},
      {"WholeIncludeUpperCase", {{"svc", "-@INCLUDE part1 more words\n"}, {"part1", Good()}}},
      {"WholeIncludeMissing", {{"svc", Good() + "@include nowhere\n"}}},
      {"WholeIncludeWithoutName", {{"svc", Good() + "@include\n"}}},
      {"WholeIncludeOfBrokenFile", {{"svc", Good() + "@include part1\n"}, {"part1", Good() + "auth \\"}}},
      {"WholeIncludeOfItself", {{"svc", Good() + "@include svc\n"}}},
      {"WholeIncludeInInclude",
       {{"svc", "auth include part1\n"},
        {"part1", "@include part2\n"},
        {"part2", Good() + "session" + tail}}},
      {"SubstackMissing", {{"svc", Good() + "auth substack nowhere\n"}}},
      {"SubstackEmpty", {{"svc", "auth substack part1\n" + Good()}, {"part1", "account" + tail + "\n"}}},
      {"SubstackOfItself", {{"svc", "auth substack svc\n" + Good()}}},
      {"SubstackInACircle", {{"svc", "auth substack part1\n" + Good()}, {"part1", "auth include svc\n"}}},
      {"Includes40Deep", Chain("auth include ", 40)},
      {"WholeIncludes40Deep", Chain("@include ", 40)},
      {"Substacks15Deep", Chain("auth substack ", 15)},
      {"Substacks16Deep", Chain("auth substack ", 16)},
      {"Incomplete", {{"svc", "auth required " + MODULE + " auth=31\n" + Good()}}},
      {"AllIgnored", {{"svc", "auth required " + MODULE + " auth=25\n"}}},
      {"OkOnAFailure", {{"svc", "auth [default=ok] " + MODULE + " auth=7\n" + Good()}}},
      {"DieInSubstack",
       {{"svc", "auth substack part1\n" + Good()},
        {"part1", "auth requisite " + MODULE + " auth=7\n" + Good("p")}}},
      {"DoneInSubstack",
       {{"svc", "auth substack part1\nauth required " + MODULE + " auth=7\n"},
        {"part1", "auth sufficient " + MODULE + "\n" + Good("p")}}},
      {"JumpOutOfSubstack",
       {{"svc", "auth substack part1\n" + Good()},
        {"part1", "auth [success=2] " + MODULE + "\n" + Good("p")}}},
      {"JumpOverSubstack",
       {{"svc", "auth [success=1] " + MODULE + "\nauth substack part1\n" + Good()},
        {"part1", "auth required " + MODULE + " auth=7\nauth required " + MODULE + " auth=7\n"}}},
      {"JumpOverInclude",
       {{"svc", "auth [success=1] " + MODULE + "\nauth include part1\n" + Good()},
        {"part1", "auth required " + MODULE + " auth=7\n" + Good("p")}}},
      {"ResetInSubstack",
       {{"svc", Good() + "auth substack part1\n"},
        {"part1", "auth required " + MODULE + " auth=7\nauth [default=reset] " + MODULE + "\n"}}},
  };
}

class OddPolicyTest : public ::testing::TestWithParam<OddPolicy> {};

TEST_P(OddPolicyTest, IsReadTheSame) {
  ExpectTheSame(GetParam().files, EVERY_OPERATION);
}

INSTANTIATE_TEST_SUITE_P(LibpamComparison, OddPolicyTest, ::testing::ValuesIn(OddPolicies()),
                         [](const ::testing::TestParamInfo<OddPolicy>& odd) { return odd.param.name; });

TEST(LibpamComparisonTest, ALineContinuedAtTheEndOfItsBufferHangsIt) {
  const std::string start = "auth required " + MODULE + " ";
  const PolicySet files = {
      {"svc", start + std::string(std::size_t{1022} - start.size(), 'x') + "\\\nb\n" + Good()}};
  ASSERT_EQ(Resolve(files).state, Policy::State::Fatal);
  EXPECT_TRUE(LibpamCrashesOrHangs(files));
}

}  // namespace

}  // namespace velmorctltest
