// The rules for making a computer account.
#ifndef CAMD_SERVICE_ACCOUNT_CREATION_H
#define CAMD_SERVICE_ACCOUNT_CREATION_H

#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>

#include "service/directory_client.h"
#include "service/ledger.h"
#include "service/task.h"
#include "service/token_store.h"

namespace camd {

// Safe for use by several threads.
class AccountCreation {
 public:
  // A checked request. While one exists, no other for the same name is accepted.
  struct Order {
    std::string hostName;
    std::string computer;
    std::string container;
    std::string tokenId;
    std::shared_ptr<void> reservation;
  };

  // All references must outlive this, and so must every order.
  AccountCreation(Ledger& ledger, TokenStore& tokens, DirectoryClient& directory)
      : ledger_(ledger), tokens_(tokens), directory_(directory) {}

  // Reads the request's body and looks at all that needs no directory. Fills `order`, or returns why the
  // request is refused. Throws DatabaseError.
  std::optional<WebAnswer> Check(Task& task, Order& order);

  // Has the directory make the account. The ledger knows of it before the directory is asked, and of its
  // outcome before this returns. Throws Failure and DatabaseError.
  WebAnswer Carry(const Task& task, Order&& handedOver);

  // Keeps orders for the name of this computer away as long as the result exists; null when there is one.
  // What else is done to an account is done under such a reservation.
  std::shared_ptr<void> Reserve(const std::string& computer);

 private:
  std::optional<WebAnswer> CheckToken(const Task& task, Order& order);
  WebAnswer CarryEntered(const Task& task, const Order& order, int64_t id);

  Ledger& ledger_;
  TokenStore& tokens_;
  DirectoryClient& directory_;
  std::mutex mutex_;
  std::set<std::string> reserved_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_ACCOUNT_CREATION_H
