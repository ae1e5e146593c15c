// What the library's own model of policy files says of a change.
#include "pam_edit/model_agreement.h"

#include <gtest/gtest.h>

#include <ostream>

namespace velmorctl::pam {

namespace {

const OwnModules OWN = {"pam_x.so"};

const std::string PLAIN = "auth required pam_unix.so nullok\naccount required pam_unix.so\n";
const std::string WITH_MODULE =
    "auth [success=1 default=ignore] pam_localuser.so\nauth [success=1 default=ignore] pam_x.so a b\n"
    "auth required pam_unix.so nullok\nauth required pam_permit.so\naccount required pam_x.so\n"
    "account required pam_unix.so\n";

/// Asked of a change in both directions.
bool Agrees(const std::string& without, const std::string& with) {
  const bool added = ModelSeesOwnAdded(without, with, OWN);
  EXPECT_EQ(ModelSeesOwnRemoved(with, without, OWN), added);
  return added;
}

TEST(ModelAgreementTest, OwnEntriesAreWhatWasAskedFor) {
  EXPECT_TRUE(Agrees(PLAIN, WITH_MODULE));
}

TEST(ModelAgreementTest, NothingIsNoChange) {
  EXPECT_TRUE(Agrees(PLAIN, PLAIN));
}

TEST(ModelAgreementTest, TheDirectionCounts) {
  EXPECT_FALSE(ModelSeesOwnAdded(WITH_MODULE, PLAIN, OWN));
  EXPECT_FALSE(ModelSeesOwnRemoved(PLAIN, WITH_MODULE, OWN));
}

TEST(ModelAgreementTest, LayoutAndLengthsOfJumpsMayDiffer) {
  EXPECT_TRUE(Agrees("# first\nauth [success=1 default=ignore] pam_unix.so\naccount required pam_unix.so\n",
                     "account  required\tpam_unix.so\nauth [success=2 default=ignore] pam_unix.so\n"));
}

TEST(ModelAgreementTest, AFileThatTheModelCannotReadIsNotJudged) {
  EXPECT_TRUE(ModelSeesOwnAdded("@include common-auth\n", "auth required pam_other.so\n", OWN));
  EXPECT_TRUE(ModelSeesOwnRemoved("-session optional pam_systemd.so\n", "auth required pam_other.so\n", OWN));
}

TEST(ModelAgreementTest, AFileThatTheModelCouldReadMustStayReadable) {
  EXPECT_FALSE(ModelSeesOwnAdded(PLAIN, PLAIN + "@include common-auth\n", OWN));
  EXPECT_FALSE(ModelSeesOwnRemoved(WITH_MODULE, PLAIN + "auth requird pam_x.so\n", OWN));
}

struct OtherChange {
  std::string name;
  std::string with;
};

void PrintTo(const OtherChange& change, std::ostream* stream) {
  *stream << change.name;
}

class ModelDisagreementTest : public ::testing::TestWithParam<OtherChange> {};

TEST_P(ModelDisagreementTest, IsSeen) {
  EXPECT_FALSE(Agrees(PLAIN, GetParam().with));
}

INSTANTIATE_TEST_SUITE_P(
    Each, ModelDisagreementTest,
    ::testing::Values(
        OtherChange{"AnotherModule", PLAIN + "auth required pam_other.so\n"},
        OtherChange{"ALostEntry", "auth required pam_unix.so nullok\n"},
        OtherChange{"AnotherControl", "auth optional pam_unix.so nullok\naccount required pam_unix.so\n"},
        OtherChange{"AnotherParameter", "auth required pam_unix.so\naccount required pam_unix.so\n"},
        OtherChange{"AnotherFacility", "auth required pam_unix.so nullok\nsession required pam_unix.so\n"},
        OtherChange{"APermitThatDecides", PLAIN + "auth sufficient pam_permit.so\n"},
        OtherChange{"ALocalUserLineThatDecides", PLAIN + "auth sufficient pam_localuser.so\n"}),
    [](const auto& parameter) { return parameter.param.name; });

}  // namespace

}  // namespace velmorctl::pam
