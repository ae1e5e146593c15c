#include "service/unused_accounts.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <ctime>
#include <functional>

#include "support/files.h"

namespace camd {
namespace {

/// A service whose ledger has one old account, and whose directory cannot be asked, which the audit log
/// tells.
class UnusedAccountsTest : public ::testing::Test {
 protected:
  UnusedAccountsTest() {
    settings_.passwordFile = folder_.Path() + "absent";
    settings_.removeUnusedAfter = std::chrono::hours(1);
    audit_.Open(auditFile_);
    GiveOldAccount("HOST1", "S-1");
  }

  void GiveOldAccount(const std::string& computer, const std::string& sid) {
    const int64_t id =
        ledger_.Begin({computer, computer + ".corp.example", "", "10.0.0.1", ""}, old_, 0, 0).value();
    GivenAccount account;
    account.sid = sid;
    ledger_.Give(id, account, old_);
  }

  std::string Audited() {
    RemoveUnusedAccounts(settings_, ledger_, directory_, creation_, audit_, isEnding_);
    return testsupport::ReadFile(auditFile_);
  }

  std::function<bool()> isEnding_ = [] { return false; };
  const int64_t old_ = time(nullptr) - 7200;
  testsupport::ScratchFolder folder_;
  const std::string auditFile_ = folder_.Path() + "audit.log";
  DirectorySettings settings_;
  Ledger ledger_{folder_.Path() + "ledger.db"};
  TokenStore tokens_{folder_.Path() + "ledger.db"};
  DirectoryClient directory_;
  AccountCreation creation_{ledger_, tokens_, directory_};
  AuditLog audit_;
};

std::ptrdiff_t LinesOf(const std::string& text) {
  return std::count(text.begin(), text.end(), '\n');
}

TEST_F(UnusedAccountsTest, OldAccountIsLookedAt) {
  EXPECT_NE(Audited().find("HOST1"), std::string::npos);
}

TEST_F(UnusedAccountsTest, AccountWhoseNameIsJustAskedForIsLeftAlone) {
  const auto reservation = creation_.Reserve("HOST1");
  EXPECT_EQ(Audited(), "");
}

TEST_F(UnusedAccountsTest, ServiceThatIsEndingLooksAtNoAccount) {
  isEnding_ = [] { return true; };
  EXPECT_EQ(Audited(), "");
}

TEST_F(UnusedAccountsTest, EndInTheMiddleLeavesTheOtherAccountsForTheNextTime) {
  GiveOldAccount("HOST2", "S-2");
  isEnding_ = [this] { return !testsupport::ReadFile(auditFile_).empty(); };
  EXPECT_EQ(LinesOf(Audited()), 1);
  isEnding_ = [] { return false; };
  EXPECT_EQ(LinesOf(Audited()), 3);
}

TEST_F(UnusedAccountsTest, NameIsFreeAgainAfterwards) {
  Audited();
  EXPECT_TRUE(creation_.Reserve("HOST1"));
}

}  // namespace
}  // namespace camd
