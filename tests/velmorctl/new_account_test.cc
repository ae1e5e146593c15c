#include "new_account.h"

#include <gtest/gtest.h>

#include <vector>

namespace velmorctltest {

namespace {

using velmorctl::Answer;

/// Controllers that give these answers in turn, the last one for ever.
class NewAccountTest : public ::testing::Test {
 protected:
  Answer<TrustState> Ask(const std::vector<Answer<TrustState>>& answers) {
    return velmorctl::AskAboutNewAccount(
        [&] { return answers[std::min<std::size_t>(questions_++, answers.size() - 1)]; },
        [this] { ++pauses_; });
  }

  std::size_t questions_ = 0;
  int pauses_ = 0;
};

TEST_F(NewAccountTest, ThatIsKnownIsAskedAboutOnce) {
  EXPECT_EQ(Ask({{TRUST_STATE_HEALTHY, true}}).value, TRUST_STATE_HEALTHY);
  EXPECT_EQ(pauses_, 0);
}

TEST_F(NewAccountTest, IsAskedAboutUntilTheControllerKnowsIt) {
  EXPECT_EQ(Ask({{TRUST_STATE_ACCOUNT_UNUSABLE, true},
                 {TRUST_STATE_ACCOUNT_UNUSABLE, true},
                 {TRUST_STATE_HEALTHY, true}})
                .value,
            TRUST_STATE_HEALTHY);
  EXPECT_EQ(pauses_, 2);
}

TEST_F(NewAccountTest, IsAskedAboutUntilTheControllerKnowsItsPassword) {
  EXPECT_EQ(Ask({{TRUST_STATE_WRONG_PASSWORD, true}, {TRUST_STATE_HEALTHY, true}}).value,
            TRUST_STATE_HEALTHY);
  EXPECT_EQ(pauses_, 1);
}

TEST_F(NewAccountTest, ThatStaysUnknownIsGivenUp) {
  EXPECT_EQ(Ask({{TRUST_STATE_ACCOUNT_UNUSABLE, true}}).value, TRUST_STATE_ACCOUNT_UNUSABLE);
  EXPECT_EQ(pauses_, 30);
}

TEST_F(NewAccountTest, IsNotAskedAboutAgainWhenNoAnswerComesInTime) {
  EXPECT_FALSE(Ask({{TRUST_STATE_ACCOUNT_UNUSABLE, true}, {TRUST_STATE_ACCOUNT_UNUSABLE, false}}).live);
  EXPECT_EQ(pauses_, 1);
}

TEST_F(NewAccountTest, IsNotAskedAboutAgainWhenSomethingElseIsWrong) {
  EXPECT_EQ(Ask({{TRUST_STATE_SERVICE_DOWN, true}}).value, TRUST_STATE_SERVICE_DOWN);
  EXPECT_EQ(pauses_, 0);
}

}  // namespace

}  // namespace velmorctltest
