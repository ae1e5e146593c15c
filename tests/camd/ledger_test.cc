#include "service/ledger.h"

#include <gtest/gtest.h>

#include "support/files.h"

namespace camd {
namespace {

constexpr int64_t kNow = 1'800'000'000;

AccountRequest RequestFor(const std::string& computer, const std::string& client = "10.0.0.1") {
  return {computer, computer + ".corp.example", "", client, ""};
}

GivenAccount AccountWith(const std::string& sid) {
  GivenAccount account;
  account.accountName = "HOST1$";
  account.sid = sid;
  account.passwordSet = 7;
  return account;
}

class LedgerTest : public ::testing::Test {
 protected:
  int64_t Give(const std::string& computer, const std::string& sid, int64_t requested) {
    const int64_t id = ledger_.Begin(RequestFor(computer), requested, 0, 0).value();
    ledger_.Give(id, AccountWith(sid), requested);
    return id;
  }

  testsupport::ScratchFolder folder_;
  Ledger ledger_{folder_.Path() + "ledger.db"};
};

TEST_F(LedgerTest, AccountIsFoundByItsName) {
  Give("HOST1", "S-1", kNow);
  ASSERT_TRUE(ledger_.FindLatest("HOST1"));
  EXPECT_EQ(ledger_.FindLatest("HOST1")->account.passwordSet, 7);
  EXPECT_FALSE(ledger_.FindLatest("HOST2"));
}

TEST_F(LedgerTest, RequestThatFailedIsNotFound) {
  const int64_t id = ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0).value();
  ledger_.Fail(id, 5, kNow);
  EXPECT_FALSE(ledger_.FindLatest("HOST1"));
}

TEST_F(LedgerTest, RequestUnderWayIsNotFound) {
  ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0);
  EXPECT_FALSE(ledger_.FindLatest("HOST1"));
}

TEST_F(LedgerTest, RequestWithUnknownOutcomeIsFoundWithoutARecord) {
  const int64_t id = ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0).value();
  ledger_.Interrupt(id, kNow);
  ASSERT_TRUE(ledger_.FindLatest("HOST1"));
  EXPECT_EQ(ledger_.FindLatest("HOST1")->account.sid, "");
  EXPECT_EQ(ledger_.FindLatest("HOST1")->account.createdAfter, kNow);
}

TEST_F(LedgerTest, RequestWithUnknownOutcomeDoesNotCountBesideAnAccountThatWasGivenOut) {
  ledger_.Interrupt(ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0).value(), kNow);
  const int64_t given = Give("HOST1", "S-1", kNow + 10);
  ledger_.Interrupt(ledger_.Begin(RequestFor("HOST1"), kNow + 20, 0, 0).value(), kNow);
  const auto entries = ledger_.FindOlderThan(kNow + 100);
  ASSERT_EQ(entries.size(), 1U);
  EXPECT_EQ(entries[0].id, given);
  EXPECT_EQ(ledger_.FindLatest("HOST1")->id, given);
}

TEST_F(LedgerTest, RequestWithUnknownOutcomeDoesNotCountBesideAnAccountInUse) {
  ledger_.Interrupt(ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0).value(), kNow);
  ledger_.MarkKept(Give("HOST1", "S-1", kNow + 10), kNow);
  EXPECT_TRUE(ledger_.FindOlderThan(kNow + 100).empty());
  EXPECT_FALSE(ledger_.FindLatest("HOST1"));
}

TEST_F(LedgerTest, RequestWithUnknownOutcomeCountsAgainWhenTheAccountWasRemoved) {
  const int64_t interrupted = ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0).value();
  ledger_.Interrupt(interrupted, kNow);
  ledger_.MarkRemoved(Give("HOST1", "S-1", kNow + 10), kNow);
  ASSERT_EQ(ledger_.FindOlderThan(kNow + 100).size(), 1U);
  EXPECT_EQ(ledger_.FindLatest("HOST1")->id, interrupted);
}

TEST_F(LedgerTest, AccountOfARequestWithUnknownOutcomeIsAsOldAsThatRequest) {
  ledger_.Interrupt(ledger_.Begin(RequestFor("HOST1"), kNow, 0, 0).value(), kNow);
  Give("HOST1", "S-1", kNow + 1000);
  EXPECT_EQ(ledger_.FindLatest("HOST1")->account.createdAfter, kNow);
}

TEST_F(LedgerTest, AccountTakenOverIsAsOldAsItsFirstRequest) {
  Give("HOST1", "S-1", kNow);
  Give("HOST1", "S-1", kNow + 50);
  EXPECT_EQ(ledger_.FindLatest("HOST1")->account.createdAfter, kNow);
}

TEST_F(LedgerTest, OnlyTheLastEntryOfAnAccountIsLookedAt) {
  Give("HOST1", "S-1", kNow);
  const int64_t last = Give("HOST1", "S-1", kNow + 50);
  const auto entries = ledger_.FindOlderThan(kNow + 100);
  ASSERT_EQ(entries.size(), 1U);
  EXPECT_EQ(entries[0].id, last);
}

TEST_F(LedgerTest, AccountOfThatAgeIsNotOlder) {
  Give("HOST1", "S-1", kNow);
  EXPECT_TRUE(ledger_.FindOlderThan(kNow).empty());
  EXPECT_EQ(ledger_.FindOlderThan(kNow + 1).size(), 1U);
}

TEST_F(LedgerTest, RemovedAndKeptAccountsAreNotLookedAtAgain) {
  ledger_.MarkRemoved(Give("HOST1", "S-1", kNow), kNow);
  ledger_.MarkKept(Give("HOST2", "S-2", kNow), kNow);
  EXPECT_TRUE(ledger_.FindOlderThan(kNow + 1).empty());
}

TEST_F(LedgerTest, QuotaCountsOneClientOnly) {
  EXPECT_TRUE(ledger_.Begin(RequestFor("HOST1"), kNow, kNow - 100, 1));
  EXPECT_FALSE(ledger_.Begin(RequestFor("HOST2"), kNow, kNow - 100, 1));
  EXPECT_TRUE(ledger_.Begin(RequestFor("HOST2", "10.0.0.2"), kNow, kNow - 100, 1));
}

}  // namespace
}  // namespace camd
