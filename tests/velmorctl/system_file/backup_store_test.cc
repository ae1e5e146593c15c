#include "system_file/backup_store.h"

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <regex>
#include <utility>

#include "failure_of.h"
#include "support/files.h"
#include "system_file/restore.h"

namespace velmorctltest {

namespace {

using testsupport::Exists;
using testsupport::ModeOf;
using testsupport::ReadFile;
using testsupport::WriteFile;
using velmorctl::Backup;
using velmorctl::BackupStore;
using velmorctl::ExitCode;
using velmorctl::Failure;
using velmorctl::RootFolder;

class BackupStoreTest : public ::testing::Test {
 protected:
  BackupStoreTest()
      : folder_(scratch_.Path()),
        root_(folder_),
        store_(root_, "nss"),
        kept_(folder_ + "var/lib/quenix/backups/") {
    WriteFile(folder_ + "file", "text\n");
    testsupport::SetMode(folder_ + "file", 0640);
  }

  std::string Write() const {
    return store_.Write("nss add x y", {velmorctl::ReadSystemFileIfThere(root_, "/file"),
                                        velmorctl::ReadSystemFileIfThere(root_, "/none")});
  }

  testsupport::ScratchFolder scratch_;
  std::string folder_;
  RootFolder root_;
  BackupStore store_;
  std::string kept_;
};

TEST_F(BackupStoreTest, ReadsWhatWasWritten) {
  const Backup backup = store_.Read(Write());
  EXPECT_EQ(backup.command, "nss add x y");
  ASSERT_EQ(backup.files.size(), 2U);
  EXPECT_EQ(backup.files[0].name, "/file");
  EXPECT_TRUE(backup.files[0].existed);
  EXPECT_EQ(backup.files[0].content, "text\n");
  EXPECT_EQ(backup.files[0].mode, 0640U);
  EXPECT_EQ(backup.files[1].name, "/none");
  EXPECT_FALSE(backup.files[1].existed);
}

TEST_F(BackupStoreTest, IsForItsOwnerOnly) {
  const std::string id = Write();
  EXPECT_EQ(ModeOf(folder_ + "var/lib/quenix"), 0755U);
  for (const std::string& path : {kept_, kept_ + "nss", kept_ + "nss/" + id}) {
    EXPECT_EQ(ModeOf(path), 0700U) << path;
  }
  for (const char* name : {"/0", "/manifest.json"}) {
    EXPECT_EQ(ModeOf(kept_ + "nss/" + id + name), 0600U) << name;
  }
}

TEST_F(BackupStoreTest, IsNamedByTheTime) {
  EXPECT_TRUE(std::regex_match(Write(), std::regex("20[0-9]{6}T[0-9]{6}Z")));
}

TEST_F(BackupStoreTest, GivesEachBackupAnIdOfItsOwn) {
  std::vector<std::string> written;
  for (int count = 0; count < 4; ++count) {
    written.insert(written.begin(), Write());
  }
  EXPECT_EQ(store_.Ids(), written);
}

TEST_F(BackupStoreTest, NumbersBackupsOnWhenTheClockWasSetBack) {
  testsupport::MakeFolders(kept_ + "nss/29991231T235959Z");
  EXPECT_EQ(Write(), "29991231T235959Z-0002");
  EXPECT_EQ(Write(), "29991231T235959Z-0003");
}

TEST_F(BackupStoreTest, KeepsTheKindsApart) {
  Write();
  EXPECT_TRUE(BackupStore(root_, "pam").Ids().empty());
}

TEST_F(BackupStoreTest, LeavesNoTraceOfABackupThatWasRemoved) {
  store_.Remove(Write());
  EXPECT_TRUE(testsupport::NamesIn(kept_ + "nss").empty());
}

TEST_F(BackupStoreTest, LeavesNoTraceOfABackupThatFails) {
  Write();
  const std::string before = testsupport::NamesIn(kept_ + "nss").front();
  velmorctl::Snapshot unnamed;
  unnamed.name = "\xff";  // No text for the list.
  EXPECT_ANY_THROW(store_.Write("", {unnamed}));
  EXPECT_EQ(testsupport::NamesIn(kept_ + "nss"), std::vector<std::string>{before});
}

TEST_F(BackupStoreTest, RefusesAFileWhoseNameTheListCannotHold) {
  velmorctl::Snapshot oddlyNamed;
  oddlyNamed.name = "/etc/\xff\n";
  const Failure failure = FailureOf([&] { store_.Write("nss add x y", {oddlyNamed}); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_EQ(DetailOf(failure, "file"), "/etc/\xff?");
  EXPECT_EQ(failure.Advice(), "rename it");
}

TEST_F(BackupStoreTest, IsWrittenForACommandThatTheListCannotHold) {
  EXPECT_EQ(store_.Read(store_.Write("nss add \xff y", {})).command, "nss add \xef\xbf\xbd y");
}

TEST_F(BackupStoreTest, NamesTheBackupsThatThereAre) {
  const std::string id = Write();
  const Failure failure = FailureOf([&] { store_.Read("20200101T000000Z"); });
  EXPECT_EQ(failure.Code(), ExitCode::Usage);
  EXPECT_EQ(failure.Advice(), "there are: " + id);
}

TEST_F(BackupStoreTest, TakesNoPathForAnId) {
  Write();
  EXPECT_EQ(FailureOf([&] { store_.Read("../nss"); }).Code(), ExitCode::Usage);
}

TEST_F(BackupStoreTest, RefusesBytesThatWereNotWritten) {
  const std::string id = Write();
  WriteFile(kept_ + "nss/" + id + "/0", "test\n");
  const Failure failure = FailureOf([&] { store_.Read(id); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_EQ(DetailOf(failure, "file"), kept_ + "nss/" + id + "/0");
}

TEST_F(BackupStoreTest, RefusesABackupWithoutOneOfItsFiles) {
  const std::string id = Write();
  testsupport::RemoveFile(kept_ + "nss/" + id + "/0");
  EXPECT_EQ(FailureOf([&] { store_.Read(id); }).Code(), ExitCode::Configuration);
}

struct Damage {
  const char* name;
  const char* pointer;
  nlohmann::json value;
};

class DamagedListTest : public BackupStoreTest, public ::testing::WithParamInterface<Damage> {};

TEST_P(DamagedListTest, IsRefused) {
  const std::string id = Write();
  const std::string list = kept_ + "nss/" + id + "/manifest.json";
  nlohmann::json document = nlohmann::json::parse(ReadFile(list));
  document[nlohmann::json::json_pointer(GetParam().pointer)] = GetParam().value;
  WriteFile(list, document.dump());
  const Failure failure = FailureOf([&] { store_.Read(id); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_EQ(DetailOf(failure, "file"), list);
}

INSTANTIATE_TEST_SUITE_P(Each, DamagedListTest,
                         ::testing::Values(Damage{"OfAnotherVersion", "/schema", "velmor.backup/2"},
                                           Damage{"WithoutFiles", "/files", "none"},
                                           Damage{"WithARelativeName", "/files/0/name", "file"},
                                           Damage{"WithACopyElsewhere", "/files/0/copy", "../../../../file"},
                                           Damage{"WithAModeThatIsNone", "/files/0/mode", "0640"}),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(BackupStoreTest, RefusesAListThatIsNoDocument) {
  const std::string id = Write();
  WriteFile(kept_ + "nss/" + id + "/manifest.json", "{");
  EXPECT_EQ(FailureOf([&] { store_.Read(id); }).Code(), ExitCode::Configuration);
}

class RestoreTest : public BackupStoreTest {
 protected:
  std::string Restore(const std::string& id = "") const {
    return velmorctl::PlanRestore(root_, "nss", id).Apply();
  }
};

TEST_F(RestoreTest, PutsContentBack) {
  Write();
  WriteFile(folder_ + "file", "changed\n");
  Restore();
  EXPECT_EQ(ReadFile(folder_ + "file"), "text\n");
}

TEST_F(RestoreTest, KeepsTheModeThatTheFileHasNow) {
  Write();
  WriteFile(folder_ + "file", "changed\n");
  testsupport::SetMode(folder_ + "file", 0600);
  Restore();
  EXPECT_EQ(ModeOf(folder_ + "file"), 0600U);
}

TEST_F(RestoreTest, MakesAMissingFileWithItsMode) {
  Write();
  testsupport::RemoveFile(folder_ + "file");
  Restore();
  EXPECT_EQ(ReadFile(folder_ + "file"), "text\n");
  EXPECT_EQ(ModeOf(folder_ + "file"), 0640U);
}

TEST_F(RestoreTest, RemovesAFileThatDidNotExist) {
  Write();
  WriteFile(folder_ + "none", "made by the change\n");
  Restore();
  EXPECT_FALSE(Exists(folder_ + "none"));
}

TEST_F(RestoreTest, TakesTheNewestBackup) {
  const std::string older = Write();
  WriteFile(folder_ + "file", "newer\n");
  Write();
  WriteFile(folder_ + "file", "changed\n");
  Restore();
  EXPECT_EQ(ReadFile(folder_ + "file"), "newer\n");
  Restore(older);
  EXPECT_EQ(ReadFile(folder_ + "file"), "text\n");
}

TEST_F(RestoreTest, ChangesNothingTheSecondTime) {
  Write();
  WriteFile(folder_ + "file", "changed\n");
  Restore();
  EXPECT_TRUE(velmorctl::PlanRestore(root_, "nss", "").ChangesNothing());
}

TEST_F(RestoreTest, NeedsAnIdWhenOnlyBackupsOfRestoresAreLeft) {
  const std::string first = Write();
  WriteFile(folder_ + "file", "changed\n");
  const std::string second = Restore();
  store_.Remove(first);
  const Failure failure = FailureOf([&] { Restore(); });
  EXPECT_EQ(failure.Code(), ExitCode::Configuration);
  EXPECT_EQ(failure.Advice(), "give the ID of one that a restore has left: " + second);
}

TEST_F(RestoreTest, CanBeUndone) {
  Write();
  WriteFile(folder_ + "file", "changed\n");
  Restore(Restore());
  EXPECT_EQ(ReadFile(folder_ + "file"), "changed\n");
}

TEST_F(RestoreTest, HasNothingToDoWhenTheFileIsAsItWas) {
  Write();
  EXPECT_TRUE(velmorctl::PlanRestore(root_, "nss", "").ChangesNothing());
}

TEST_F(RestoreTest, IsRefusedWithoutABackup) {
  EXPECT_EQ(FailureOf([&] { Restore(); }).Code(), ExitCode::Configuration);
}

TEST_F(RestoreTest, IsRefusedWhenTheBackupIsDamaged) {
  const std::string id = Write();
  WriteFile(kept_ + "nss/" + id + "/0", "damaged\n");
  WriteFile(folder_ + "file", "changed\n");
  EXPECT_EQ(FailureOf([&] { Restore(); }).Code(), ExitCode::Configuration);
  EXPECT_EQ(ReadFile(folder_ + "file"), "changed\n");
}

}  // namespace

}  // namespace velmorctltest
