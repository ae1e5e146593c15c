/// A computer account that was made a moment ago: the controller that is asked may not have heard of it yet.
#ifndef VELMORCTL_NEW_ACCOUNT_H
#define VELMORCTL_NEW_ACCOUNT_H

#include <functional>

#include "answer_watch.h"
#include "authentication/directory_records.h"

namespace velmorctl {

/// Asks for the state of the trust with `ask`, and asks again while the controller does not know the account
/// or has its old password, at most 30 times: `pause`, which lets about a second pass, is called before each.
/// Controllers of one site tell each other of an account within some 15 seconds. Returns the last answer.
/// What the two throw goes to the caller.
Answer<TrustState> AskAboutNewAccount(const std::function<Answer<TrustState>()>& ask,
                                      const std::function<void()>& pause);

}  // namespace velmorctl

#endif  // VELMORCTL_NEW_ACCOUNT_H
