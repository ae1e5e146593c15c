#include "service/database.h"

#include <gtest/gtest.h>

#include "support/files.h"

namespace camd {
namespace {

TEST(DatabaseTest, MissingFolderIsNamed) {
  try {
    const Database database("/nowhere/ledger.db");
    ADD_FAILURE() << "it was opened";
  } catch (const DatabaseError& error) {
    EXPECT_NE(std::string(error.what()).find("/nowhere/ledger.db"), std::string::npos);
  }
}

TEST(DatabaseTest, DamagedFileIsRefused) {
  const testsupport::ScratchFolder folder;
  const std::string path = folder.Path() + "ledger.db";
  testsupport::WriteFile(path, std::string(4096, 'x'));
  EXPECT_THROW(Database(path).Execute("CREATE TABLE t (a)"), DatabaseError);
}

TEST(DatabaseTest, TransactionThatIsNotCommittedIsUndone) {
  const testsupport::ScratchFolder folder;
  Database database(folder.Path() + "ledger.db");
  database.Execute("CREATE TABLE t (a)");
  {
    const Transaction transaction(database);
    database.Execute("INSERT INTO t VALUES (1)");
  }
  Statement count(database, "SELECT count(*) FROM t");
  ASSERT_TRUE(count.Next());
  EXPECT_EQ(count.Number(0), 0);
}

TEST(DatabaseTest, TextIsKeptByteForByte) {
  const testsupport::ScratchFolder folder;
  Database database(folder.Path() + "ledger.db");
  database.Execute("CREATE TABLE t (a)");
  const std::string text = "'; DROP TABLE t; --";
  Statement(database, "INSERT INTO t VALUES (?)").Bind(text).Run();
  Statement rows(database, "SELECT a FROM t");
  ASSERT_TRUE(rows.Next());
  EXPECT_EQ(rows.Text(0), text);
}

}  // namespace
}  // namespace camd
