// How the plug-in drives the helper, with scripts in the helper's place.

#include <gtest/gtest.h>
#include <unistd.h>

#include <thread>

#include "loaded_plugin.h"
#include "support/files.h"

namespace {

using sambatest::InstallHelper;
using sambatest::LoadedPlugin;

const std::string RECORD = "/var/lib/quenix/samba/attempts.log";
const std::string NOTES = "/var/lib/quenix/notes";

class HelperClientTest : public testing::Test {
 protected:
  HelperClientTest() { testsupport::MakeFolders("/var/lib/quenix/samba"); }

  uint32_t Join() { return plugin_->joinDomain("corp.example", nullptr, &credentials_); }

  std::string Notes() { return testsupport::Exists(NOTES) ? testsupport::ReadFile(NOTES) : ""; }

  const LoadedPlugin plugin_;
  const Credentials credentials_ = {"alice", "Passw0rd"};
};

TEST_F(HelperClientTest, TheHelpersStatusIsTheResult) {
  InstallHelper("echo '{\"status\":1317,\"text\":\"x\"}'");
  EXPECT_EQ(Join(), 1317U);
}

TEST_F(HelperClientTest, SuccessIsZero) {
  InstallHelper("echo '{\"status\":0,\"text\":\"x\"}'");
  EXPECT_EQ(Join(), 0U);
}

TEST_F(HelperClientTest, TheRequestSaysWhatTheCallerAskedFor) {
  InstallHelper("read line; echo \"$line\" > " + NOTES + "; echo '{\"status\":0,\"text\":\"\"}'");
  EXPECT_EQ(plugin_->joinDomain("corp.example", "Servers/Hosts", &credentials_), 0U);
  EXPECT_NE(Notes().find("\"operation\":\"join\""), std::string::npos);
  EXPECT_NE(Notes().find("\"domain\":\"corp.example\""), std::string::npos);
  EXPECT_NE(Notes().find("\"organizationalUnit\":\"Servers/Hosts\""), std::string::npos);
  EXPECT_NE(Notes().find("\"user\":\"alice\""), std::string::npos);
  EXPECT_NE(Notes().find("\"process\":" + std::to_string(getpid())), std::string::npos);
}

TEST_F(HelperClientTest, ThePasswordIsNeitherAnArgumentNorInTheEnvironment) {
  InstallHelper("tr '\\0' '\\n' < /proc/$$/cmdline > " + NOTES + "; tr '\\0' '\\n' < /proc/$$/environ >> " +
                NOTES + "; read line; echo \"$line\" >> " + NOTES + "; echo '{\"status\":0,\"text\":\"\"}'");
  EXPECT_EQ(Join(), 0U);
  EXPECT_NE(Notes(), "");
  EXPECT_EQ(Notes().find("Passw0rd"), std::string::npos);
}

TEST_F(HelperClientTest, AHelperThatDiesIsReportedAndItsWorkPutRight) {
  InstallHelper(
      "read line; echo \"$line\" >> " + NOTES +
      "; case \"$line\" in *recover*) echo '{\"status\":0,\"text\":\"\"}';; *) kill -SEGV $$;; esac");
  EXPECT_EQ(Join(), 1067U);
  EXPECT_NE(Notes().find("\"operation\":\"recover\""), std::string::npos);
}

TEST_F(HelperClientTest, AHelperThatHangsIsEndedAndItsWorkPutRight) {
  testsupport::WriteFile("/etc/quenix/velmor/samba.conf", "operation-timeout = \"1\"\n");
  InstallHelper(
      "read line; echo \"$line\" >> " + NOTES +
      "; case \"$line\" in *recover*) echo '{\"status\":0,\"text\":\"\"}';; *) exec sleep 1000;; esac");
  EXPECT_EQ(Join(), 10060U);
  EXPECT_NE(Notes().find("\"operation\":\"recover\""), std::string::npos);
}

TEST_F(HelperClientTest, AMissingHelperIsAnInternalError) {
  EXPECT_EQ(Join(), 1359U);
}

TEST_F(HelperClientTest, WhatEndsACallBeforeTheHelperIsInTheRecord) {
  testsupport::WriteFile("/etc/quenix/velmor/samba.conf", "nonsense\n");
  EXPECT_EQ(Join(), 1064U);
  EXPECT_NE(testsupport::ReadFile(RECORD).find("\"step\":\"result\",\"event\":\"end\",\"status\":1064"),
            std::string::npos);
}

TEST_F(HelperClientTest, ASecondOperationAtTheSameTimeIsRefused) {
  // The first one waits until the second one has been refused.
  InstallHelper("touch " + NOTES + "; while [ ! -e /var/lib/quenix/go ]; do sleep 0.01; done\n" +
                "echo '{\"status\":0,\"text\":\"\"}'");
  uint32_t first = 1;
  std::thread joining([&] { first = Join(); });
  while (!testsupport::Exists(NOTES)) std::this_thread::yield();
  const uint32_t second = plugin_->partDomain(nullptr);
  testsupport::WriteFile("/var/lib/quenix/go", "");
  joining.join();
  EXPECT_EQ(second, 1061U);
  EXPECT_EQ(first, 0U);
}

TEST_F(HelperClientTest, ALeaveWithoutCredentialsNamesNoUser) {
  InstallHelper("read line; echo \"$line\" > " + NOTES + "; echo '{\"status\":0,\"text\":\"\"}'");
  EXPECT_EQ(plugin_->partDomain(nullptr), 0U);
  EXPECT_NE(Notes().find("\"operation\":\"leave\""), std::string::npos);
  EXPECT_EQ(Notes().find("\"user\""), std::string::npos);
}

TEST_F(HelperClientTest, AJoinWithAMachineAccountSendsTheBlobAsASecret) {
  InstallHelper("read line; echo \"$line\" > " + NOTES +
                "; [ \"$(head -c 4)\" = BLOB ] && echo '{\"status\":0,\"text\":\"\"}'");
  const ActiveDirectoryDomainInfo domain = {"", "CORP", "corp.example", "S-1-5-21-1-2-3"};
  const ActiveDirectoryMachineAccountInfo account = {"sandbox", "corp.example", "", "SANDBOX$", "BLOB"};
  EXPECT_EQ(plugin_->joinDomainWithMachineAccount(&domain, &account), 0U);
  EXPECT_EQ(Notes().find("BLOB"), std::string::npos);
  EXPECT_NE(Notes().find("\"accountName\":\"SANDBOX$\""), std::string::npos);
}

TEST_F(HelperClientTest, ANameThatIsNotUtf8IsRefused) {
  InstallHelper("echo '{\"status\":0,\"text\":\"\"}'");
  const Credentials broken = {"al\xffice", "Passw0rd"};
  EXPECT_EQ(plugin_->joinDomain("corp.example", nullptr, &broken), 87U);
}

TEST_F(HelperClientTest, PreferredControllersAreSentInTheirOrder) {
  InstallHelper("read line; echo \"$line\" > " + NOTES + "; echo '{\"status\":0,\"text\":\"\"}'");
  const char* const names[] = {"dc2", "dc1", nullptr};
  EXPECT_EQ(plugin_->setPreferredDomainControllers(names), 0U);
  EXPECT_NE(Notes().find("\"names\":[\"dc2\",\"dc1\"]"), std::string::npos);
}

}  // namespace
