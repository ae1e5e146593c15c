#include "new_account.h"

namespace velmorctl {

namespace {

constexpr int furtherQuestions = 30;

bool AccountMayBeUnknown(const Answer<TrustState>& state) {
  return state.live &&
         (state.value == TRUST_STATE_ACCOUNT_UNUSABLE || state.value == TRUST_STATE_WRONG_PASSWORD);
}

}  // namespace

Answer<TrustState> AskAboutNewAccount(const std::function<Answer<TrustState>()>& ask,
                                      const std::function<void()>& pause) {
  Answer<TrustState> state = ask();
  for (int asked = 0; asked < furtherQuestions && AccountMayBeUnknown(state); ++asked) {
    pause();
    state = ask();
  }
  return state;
}

}  // namespace velmorctl
