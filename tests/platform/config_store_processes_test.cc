// The configuration store under crashes, several processes, missing rights and full disks.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstring>
#include <exception>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "orvconfigstore/config_store.h"
#include "support/files.h"
#include "support/machine.h"

namespace {

using OrvConfigStore::ConfigStore;
using OrvConfigStore::ConfigStoreException;
using OrvConfigStore::ConfigStoreObject;
using OrvConfigStore::ConfigStoreObjectId;

const std::string kFolder = "/var/lib/quenix";
const std::string kDatabase = kFolder + "/configstore.db";
const std::string kJournal = kDatabase + "-journal";
const std::string kPrefix = "The configuration store '" + kDatabase + "' cannot be used: ";

std::shared_ptr<ConfigStore> Store() {
  return ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace);
}

ConfigStoreObjectId Id(const std::string& key) {
  return ConfigStoreObjectId(key.c_str(), "test", "orv");
}

void Put(const std::string& key, const std::string& value) {
  const auto object = std::make_shared<ConfigStoreObject>(Id(key));
  object->SetValue("value", value);
  Store()->PutObject(object, 0);
}

std::string Get(const std::string& key) {
  const auto object = Store()->GetObject(Id(key));
  std::string value = "absent";
  if (object) object->GetValue("value", &value);
  return value;
}

template <typename Operation>
std::string FailureOf(const Operation& operation) {
  try {
    operation();
    return "no failure";
  } catch (const ConfigStoreException& exception) {
    return exception.what();
  }
}

/// Runs the function in a process of its own, which ends with what it returns.
pid_t StartProcess(const std::function<int()>& function) {
  const pid_t child = fork();
  if (child == 0) {
    int status = 99;
    try {
      status = function();
    } catch (const std::exception& exception) {
      static_cast<void>(!write(2, exception.what(), std::strlen(exception.what())));
    }
    _exit(status);
  }
  return child;
}

int EndOf(pid_t child) {
  int status = 0;
  EXPECT_EQ(waitpid(child, &status, 0), child);
  return status;
}

/// Writes records with rising numbers and reports each one that has been acknowledged, until it is killed.
int WriteUntilKilled(int report) {
  for (int number = 0;; ++number) {
    Put("record" + std::to_string(number), std::to_string(number));
    if (write(report, &number, sizeof number) != sizeof number) return 1;
  }
}

/// Kills a writer after `acknowledgements` records, wherever it is by then. Returns the last record that it
/// reported.
int KillWriterAfter(int acknowledgements) {
  int report[2];
  EXPECT_EQ(pipe(report), 0);
  const pid_t child = StartProcess([&report] { return WriteUntilKilled(report[1]); });
  close(report[1]);
  int last = -1;
  for (int number = 0; number < acknowledgements; ++number) {
    EXPECT_EQ(read(report[0], &last, sizeof last), static_cast<ssize_t>(sizeof last));
  }
  kill(child, SIGKILL);
  while (read(report[0], &last, sizeof last) == static_cast<ssize_t>(sizeof last)) {
  }
  close(report[0]);
  EXPECT_TRUE(WIFSIGNALED(EndOf(child)));
  return last;
}

TEST(ConfigStoreCrashTest, EveryAcknowledgedRecordSurvivesAKilledWriter) {
  for (int round = 1; round <= 12; ++round) {
    const int last = KillWriterAfter(3 * round);
    for (int number = 0; number <= last; ++number) {
      ASSERT_EQ(Get("record" + std::to_string(number)), std::to_string(number)) << "in round " << round;
    }
    ASSERT_EQ(FailureOf([] { Store()->Verify(); }), "no failure");
  }
}

/// Leaves the database as a crash in the middle of a transaction does: partly written, with its journal.
void CrashInTransaction() {
  const pid_t child = StartProcess([] {
    sqlite3* connection = nullptr;
    sqlite3_open(kDatabase.c_str(), &connection);
    // A cache of one page makes SQLite write pages to the file before the transaction ends.
    sqlite3_exec(connection,
                 "PRAGMA cache_size = 1; BEGIN IMMEDIATE;"
                 "UPDATE field SET value = zeroblob(200000);"
                 "DELETE FROM object;",
                 nullptr, nullptr, nullptr);
    raise(SIGKILL);
    return 0;
  });
  EXPECT_TRUE(WIFSIGNALED(EndOf(child)));
  ASSERT_TRUE(testsupport::Exists(kJournal));
}

TEST(ConfigStoreCrashTest, AnInterruptedTransactionIsUndoneByTheNextReader) {
  Put("one", "value");
  const std::string before = testsupport::ReadFile(kDatabase);
  CrashInTransaction();
  ASSERT_FALSE(testsupport::ReadFile(kDatabase) == before);
  EXPECT_EQ(Get("one"), "value");
  EXPECT_FALSE(testsupport::Exists(kJournal));
}

TEST(ConfigStoreCrashTest, AReaderThatCannotUndoATransactionSaysSo) {
  Put("one", "value");
  CrashInTransaction();
  ASSERT_EQ(chmod(kDatabase.c_str(), 0444), 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_EQ(FailureOf([] { Get("one"); }),
            kPrefix + "a change was cut short by a crash, and undoing it takes the right to write the file");
}

TEST(ConfigStoreProcessesTest, NoRecordOfSeveralWritersIsLost) {
  std::vector<pid_t> children;
  for (int writer = 0; writer < 6; ++writer) {
    children.push_back(StartProcess([writer] {
      for (int number = 0; number < 20; ++number) {
        Put("writer" + std::to_string(writer) + "." + std::to_string(number), std::to_string(number));
      }
      return 0;
    }));
  }
  for (const pid_t child : children) EXPECT_EQ(EndOf(child), 0);
  EXPECT_EQ(Store()->CountObjects(), 120U);
  Store()->Verify();
}

TEST(ConfigStoreProcessesTest, AReaderSeesAnObjectWhole) {
  const auto putBoth = [](int number) {
    const auto object = std::make_shared<ConfigStoreObject>(Id("pair"));
    object->SetValue("first", std::to_string(number));
    object->SetValue("second", std::to_string(number));
    Store()->PutObject(object, 0);
  };
  putBoth(0);
  const pid_t writer = StartProcess([&putBoth] {
    for (int number = 1; number <= 60; ++number) putBoth(number);
    return 0;
  });
  int status = 0;
  while (waitpid(writer, &status, WNOHANG) == 0) {
    const auto object = Store()->GetObject(Id("pair"));
    ASSERT_TRUE(object);
    ASSERT_EQ(object->GetValues().at("first"), object->GetValues().at("second"));
  }
  EXPECT_EQ(status, 0);
}

TEST(ConfigStoreProcessesTest, ThreadsMayShareOneStore) {
  const auto store = Store();
  std::vector<std::thread> threads;
  for (int thread = 0; thread < 4; ++thread) {
    threads.emplace_back([&store, thread] {
      for (int number = 0; number < 10; ++number) {
        const auto object =
            std::make_shared<ConfigStoreObject>(Id("thread" + std::to_string(thread * 100 + number)));
        store->PutObject(object, 0);
        EXPECT_TRUE(store->GetObject(object->GetId()));
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(store->CountObjects(), 40U);
}

TEST(ConfigStoreProcessesTest, AStoreOutlivesAFork) {
  const auto store = Store();
  Put("one", "value");
  EXPECT_TRUE(store->GetObject(Id("one")));
  EXPECT_EQ(EndOf(StartProcess([&store] { return store->GetObject(Id("one")) ? 0 : 1; })), 0);
  EXPECT_TRUE(store->GetObject(Id("one")));
}

/// Gives up every right of this process to write the store: as another user where there is one, and by the
/// permission bits in a user namespace that knows no other.
void BecomeUnprivileged() {
  if (setresgid(65534, 65534, 65534) == 0 && setresuid(65534, 65534, 65534) == 0) return;
  ASSERT_EQ(chmod(kDatabase.c_str(), 0444), 0);
  ASSERT_EQ(chmod(kFolder.c_str(), 0555), 0);
  static const testsupport::WithoutFilePowers powerless;
}

TEST(ConfigStoreRightsTest, AnUnprivilegedProcessReads) {
  Put("one", "value");
  EXPECT_EQ(
      EndOf(StartProcess([] {
        BecomeUnprivileged();
        return Get("one") == "value" && faccessat(AT_FDCWD, kDatabase.c_str(), W_OK, AT_EACCESS) != 0 ? 0 : 1;
      })),
      0);
}

TEST(ConfigStoreRightsTest, AnUnprivilegedProcessFindsAnEmptyStoreWhereNoneIs) {
  EXPECT_EQ(EndOf(StartProcess([] {
              if (setresuid(65534, 65534, 65534) != 0) chmod(kFolder.c_str(), 0555);
              return Get("one") == "absent" ? 0 : 1;
            })),
            0);
}

TEST(ConfigStoreRightsTest, AnUnprivilegedWriterIsToldThatTheFileCannotBeWritten) {
  Put("one", "value");
  EXPECT_EQ(EndOf(StartProcess([] {
              BecomeUnprivileged();
              return FailureOf([] { Put("one", "other"); }) ==
                             kPrefix + "it cannot be written: Permission denied"
                         ? 0
                         : 1;
            })),
            0);
  EXPECT_EQ(Get("one"), "value");
}

/// Makes the folder read-only for everybody while it exists.
class ReadOnlyMount {
 public:
  ReadOnlyMount() {
    EXPECT_EQ(mount(kFolder.c_str(), kFolder.c_str(), nullptr, MS_BIND, nullptr), 0);
    EXPECT_EQ(mount(nullptr, kFolder.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY | MS_NOSUID, nullptr),
              0);
  }
  ~ReadOnlyMount() { EXPECT_EQ(umount(kFolder.c_str()), 0); }
  ReadOnlyMount(const ReadOnlyMount&) = delete;
  ReadOnlyMount& operator=(const ReadOnlyMount&) = delete;
};

TEST(ConfigStoreRightsTest, AReadOnlyFileSystemIsReadAndNotWritten) {
  Put("one", "value");
  const ReadOnlyMount readOnly;
  EXPECT_EQ(Get("one"), "value");
  const std::string reason = kPrefix + "it cannot be written: Read-only file system";
  EXPECT_EQ(FailureOf([] { Put("one", "other"); }), reason);
  EXPECT_EQ(FailureOf([] { Store()->RemoveObject(Id("one")); }), reason);
}

TEST(ConfigStoreRightsTest, ADatabaseThatCannotBeCreatedIsReported) {
  const ReadOnlyMount readOnly;
  EXPECT_EQ(FailureOf([] { Put("one", "value"); }), kPrefix + "it cannot be created: Read-only file system");
}

TEST(ConfigStoreRightsTest, ADirectoryThatTakesNoJournalIsReported) {
  Put("one", "value");
  ASSERT_EQ(chmod(kFolder.c_str(), 0555), 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_EQ(FailureOf([] { Put("one", "other"); }),
            kPrefix + "it cannot be written: its directory takes no journal");
  EXPECT_EQ(Get("one"), "value");
}

TEST(ConfigStoreRightsTest, AnUnreadableDatabaseIsNoEmptyStore) {
  Put("one", "value");
  ASSERT_EQ(chmod(kDatabase.c_str(), 0), 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_EQ(FailureOf([] { Get("one"); }), kPrefix + "unable to open database file (Permission denied)");
}

TEST(ConfigStoreRightsTest, AnUnreadableDirectoryIsNoEmptyStore) {
  Put("one", "value");
  ASSERT_EQ(chmod(kFolder.c_str(), 0), 0);
  const testsupport::WithoutFilePowers powerless;
  EXPECT_EQ(FailureOf([] { Get("one"); }), kPrefix + "Permission denied");
}

TEST(ConfigStoreRightsTest, AMissingDirectoryIsMadeByTheFirstWriter) {
  ASSERT_EQ(mount("empty", "/var/lib", "tmpfs", 0, "mode=755"), 0);
  ASSERT_FALSE(testsupport::Exists(kFolder));
  umask(0077);
  Put("one", "value");
  EXPECT_EQ(Get("one"), "value");
  EXPECT_EQ(testsupport::ModeOf(kFolder), 0755U);
}

TEST(ConfigStoreRightsTest, AFullDiskLosesNothing) {
  const testsupport::SmallFileSystem small(kFolder, 256 * 1024);
  Put("one", "value");
  EXPECT_EQ(FailureOf([] { Put("one", std::string(1024 * 1024, 'x')); }).compare(0, kPrefix.size(), kPrefix),
            0);
  EXPECT_EQ(Get("one"), "value");
  Put("two", "value");
  EXPECT_EQ(Get("two"), "value");
}

TEST(ConfigStoreProcessesTest, AStoreThatStaysLockedIsReported) {
  Put("one", "value");
  sqlite3* connection = nullptr;
  ASSERT_EQ(sqlite3_open(kDatabase.c_str(), &connection), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(connection, "BEGIN EXCLUSIVE", nullptr, nullptr, nullptr), SQLITE_OK);
  EXPECT_EQ(EndOf(StartProcess([] {
              return FailureOf([] { Get("one"); }) == kPrefix + "another process has held it for ten seconds"
                         ? 0
                         : 1;
            })),
            0);
  sqlite3_close(connection);
}

}  // namespace
