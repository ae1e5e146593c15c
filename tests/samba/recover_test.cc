// What the next run makes of an operation that was killed.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
extern "C" {
#include <tdb.h>
}

#include <cerrno>

#include "common/attempt_log.h"
#include "common/paths.h"
#include "common/smb_conf.h"
#include "common/state.h"
#include "expect_failure.h"
#include "helper/before_join.h"
#include "helper/journal.h"
#include "helper/operations.h"
#include "helper/undo.h"
#include "in_child.h"
#include "support/files.h"
#include "support/interpose.h"
#include "systemctl_script.h"

namespace sambaprovider {
namespace {

class RecoverTest : public testing::Test {
 protected:
  RecoverTest() {
    testsupport::MakeFolders("/var/lib/quenix/samba");
    testsupport::MakeFolders("/etc/samba");
    samba_ = std::make_unique<testsupport::SmallFileSystem>("/etc/samba", 65536);
    if (testsupport::Exists(paths::kKeytab)) testsupport::RemoveFile(paths::kKeytab);
    testsupport::WriteFile(paths::kSmbConf, "before");
    request_.fields = {{"operation", "join"}};
  }

  void SaveJoined() {
    State state;
    state.joined = true;
    state.dnsDomain = "corp.example";
    state.netbiosDomain = "CORP";
    state.hostName = "SANDBOX";
    state.smartCardEnabledServices = {"sshd"};
    SaveState(state);
  }

  void StoreMachinePassword() {
    testsupport::MakeFolders("/var/lib/samba/private");
    tdb_context* const database = tdb_open(paths::kSecrets, 0, TDB_DEFAULT, O_RDWR | O_CREAT, 0600);
    ASSERT_NE(database, nullptr);
    std::string key = "SECRETS/MACHINE_LAST_CHANGE_TIME/CORP";
    std::string time = "abcd";
    tdb_store(database, {reinterpret_cast<unsigned char*>(key.data()), key.size()},
              {reinterpret_cast<unsigned char*>(time.data()), time.size()}, TDB_REPLACE);
    tdb_close(database);
  }

  std::string RunRecover() { return Recover({log_, settings_, request_}); }

  std::unique_ptr<testsupport::SmallFileSystem> samba_;
  const AttemptLog log_{1, "join"};
  const Settings settings_;
  Request request_;
};

TEST_F(RecoverTest, WithoutAJournalNothingHappens) {
  EXPECT_EQ(RunRecover(), "nothing was interrupted");
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "before");
}

TEST_F(RecoverTest, AnInterruptedJoinIsTakenBack) {
  before_join::PutAside();
  SaveJournal({Journal::Operation::kJoin, "corp.example", "CORP", "SANDBOX", "dc1.corp.example"});
  // Killed between remembering what it writes to smb.conf and writing it.
  testsupport::WriteFile(paths::kWrittenSmbConf, "ours");
  testsupport::RemoveFile(paths::kSmbConf);
  testsupport::WriteFile(paths::kKeytab, "new");
  RunRecover();
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "before");
  EXPECT_FALSE(testsupport::Exists(paths::kKeytab));
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
  EXPECT_FALSE(testsupport::Exists(paths::kBeforeFolder));
}

// A join writes smb.conf twice. The parameter says how many files of the second time were replaced.
class KilledWritingTest : public RecoverTest, public testing::WithParamInterface<int> {
 protected:
  static void WriteUntilKilled(const std::string& text, int filesReplaced) {
    int left = filesReplaced;
    const testsupport::TakeOver kill(testsupport::calls::rename, [&left](const char* from, const char* to) {
      if (left-- > 0) return testsupport::calls::rename.Real(from, to);
      errno = EIO;
      return -1;
    });
    EXPECT_FAILURE(WriteSmbConf(text), 1359);
  }
};

TEST_P(KilledWritingTest, TheSmbConfFromBeforeTheJoinComesBack) {
  before_join::PutAside();
  SaveJournal({Journal::Operation::kJoin, "corp.example", "CORP", "SANDBOX", ""});
  WriteSmbConf("[global]\n");
  WriteUntilKilled("[global]\n  workgroup = CORP\n", GetParam());
  EXPECT_EQ(StatusInChild([this] { RunRecover(); }), 0U);
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "before");
  EXPECT_EQ(testsupport::NamesIn(paths::kStateFolder), (std::vector<std::string>{"attempts.log"}));
}

INSTANTIATE_TEST_SUITE_P(AfterEachFile, KilledWritingTest, testing::Values(0, 1, 2));

TEST_F(RecoverTest, AJoinThatIsTakenBackIsForgotten) {
  before_join::PutAside();
  const Journal journal{Journal::Operation::kJoin, "corp.example", "CORP", "SANDBOX", ""};
  SaveJournal(journal);
  // Saving the state can fail after the file has got its new content.
  SaveJoined();
  UndoJoin(log_, journal, nullptr);
  EXPECT_FALSE(LoadState().joined);
  EXPECT_EQ(LoadState().dnsDomain, "");
  EXPECT_EQ(LoadState().smartCardEnabledServices, std::vector<std::string>{"sshd"});
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
}

TEST_F(RecoverTest, ANewAccountIsRemovedAtTheControllerWhereItWasMade) {
  const std::string notes = "/run/request";
  testsupport::MakeFolders(testsupport::PLUGIN_FOLDER);
  testsupport::WriteFile(paths::kPrecheck, "#!/bin/sh\nread line; echo \"$line\" > " + notes +
                                               "; echo '{\"status\":0,\"text\":\"removed\"}'\n");
  testsupport::SetMode(paths::kPrecheck, 0755);
  const velmor::Secret password("Passw0rd");
  const UndoAccount account{"alice", password};
  before_join::PutAside();
  UndoJoin(log_, {Journal::Operation::kJoin, "corp.example", "CORP", "SANDBOX", "dc3.corp.example"},
           &account);
  EXPECT_NE(testsupport::ReadFile(notes).find("\"controllers\":[\"dc3.corp.example\""), std::string::npos);
}

TEST_F(RecoverTest, AJoinThatHadRememberedItsDomainIsKept) {
  before_join::PutAside();
  SaveJournal({Journal::Operation::kJoin, "corp.example", "CORP", "SANDBOX", "dc1.corp.example"});
  SaveJoined();
  RunRecover();
  EXPECT_TRUE(LoadState().joined);
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
  EXPECT_TRUE(testsupport::Exists(paths::kBeforeFolder));
}

TEST_F(RecoverTest, ALeaveWhoseSecretsAreGoneIsFinished) {
  before_join::PutAside();
  testsupport::WriteFile(paths::kWrittenSmbConf, "ours");
  testsupport::WriteFile(paths::kSmbConf, "ours");
  SaveJoined();
  SaveJournal({Journal::Operation::kLeave, "corp.example", "CORP", "SANDBOX", ""});
  RunRecover();
  EXPECT_FALSE(LoadState().joined);
  EXPECT_EQ(LoadState().dnsDomain, "");
  EXPECT_EQ(LoadState().smartCardEnabledServices, std::vector<std::string>{"sshd"});
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "before");
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
}

TEST_F(RecoverTest, ALeaveThatHadRemovedNothingYetIsForgotten) {
  before_join::PutAside();
  testsupport::WriteFile(paths::kWrittenSmbConf, "ours");
  testsupport::WriteFile(paths::kSmbConf, "ours");
  SaveJoined();
  StoreMachinePassword();
  SaveJournal({Journal::Operation::kLeave, "corp.example", "CORP", "SANDBOX", ""});
  RunRecover();
  EXPECT_TRUE(LoadState().joined);
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "ours");
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
}

TEST_F(RecoverTest, AChangeOfControllersOnAnUnjoinedHostIsOver) {
  SaveJournal({Journal::Operation::kPrefer, "", "", "", ""});
  RunRecover();
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
}

TEST_F(RecoverTest, AChangeOfControllersSparesAnAdministratorsSmbConf) {
  SaveJoined();
  WriteSmbConf("ours");
  testsupport::WriteFile(paths::kSmbConf, "theirs");
  SaveJournal({Journal::Operation::kPrefer, "corp.example", "CORP", "SANDBOX", ""});
  ReplaceSystemctl("[ $2 != start ]");
  RunRecover();
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "theirs");
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
}

TEST_F(RecoverTest, AChangeOfControllersThatWinbinddDoesNotFollowIsOver) {
  SaveJoined();
  WriteSmbConf("ours");
  SaveJournal({Journal::Operation::kPrefer, "corp.example", "CORP", "SANDBOX", ""});
  ReplaceSystemctl("[ $2 != start ]");
  RunRecover();
  EXPECT_NE(testsupport::ReadFile(paths::kSmbConf), "ours");
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
}

TEST_F(RecoverTest, AJournalThatIsNotUnderstoodIsNone) {
  testsupport::WriteFile(paths::kJournal, "{");
  EXPECT_EQ(RunRecover(), "nothing was interrupted");
}

TEST_F(RecoverTest, TheJournalComesBackAsItWasSaved) {
  SaveJournal({Journal::Operation::kLeave, "corp.example", "CORP", "SANDBOX", "dc1.corp.example"});
  const auto journal = LoadJournal();
  ASSERT_TRUE(journal.has_value());
  EXPECT_EQ(journal->operation, Journal::Operation::kLeave);
  EXPECT_EQ(journal->dnsDomain, "corp.example");
  EXPECT_EQ(journal->netbiosDomain, "CORP");
  EXPECT_EQ(journal->computer, "SANDBOX");
  EXPECT_EQ(journal->accountMadeAt, "dc1.corp.example");
}

}  // namespace
}  // namespace sambaprovider
