// The machine's password and the token: not in the log, not in memory.
#include <gtest/gtest.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <string>
#include <string_view>

#include "cam/plugin.h"
#include "cam/process_memory.h"
#include "cam/tls_server.h"
#include "support/log_recorder.h"

namespace camtest {
namespace {

/// Written backwards, so that only a secret itself is found when memory is searched for it. A piece of the
/// blob is longer than the 256 bytes that a copy leaves in vector registers, which a lazily bound call saves
/// on the stack.
constexpr std::string_view REVERSED_BLOB_PIECE =
    "drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7"
    "drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7"
    "drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7drowssaPenihcaM7";
constexpr std::string_view REVERSED_TOKEN = "noitaerCenOroFnekoTterceS9";

std::string Forwards(std::string_view reversed) {
  return {reversed.rbegin(), reversed.rend()};
}

std::string Blob() {
  std::string blob;
  for (int piece = 0; piece < 5; ++piece) blob += Forwards(REVERSED_BLOB_PIECE);
  return blob;
}

/// The service in a process of its own, so that its copies of the secrets are not in this one's memory.
class ServerProcess {
 public:
  /// `answer` gives the answer to the requests, in that process.
  template <class AnswerFunction>
  explicit ServerProcess(AnswerFunction answer) {
    int ready[2];
    EXPECT_EQ(pipe(ready), 0);
    process_ = fork();
    if (process_ == 0) {
      prctl(PR_SET_PDEATHSIG, SIGKILL);
      TlsServer server(Identity(), Answering(answer()));
      WriteSettings(server.Port(), "token = \"" + Forwards(REVERSED_TOKEN) + "\"\n");
      EXPECT_EQ(write(ready[1], "", 1), 1);
      while (true) pause();
    }
    char byte = 0;
    EXPECT_EQ(read(ready[0], &byte, 1), 1);
    close(ready[0]);
    close(ready[1]);
  }
  ServerProcess(const ServerProcess&) = delete;
  ServerProcess& operator=(const ServerProcess&) = delete;
  ~ServerProcess() { kill(process_, SIGKILL); }

 private:
  pid_t process_;
};

std::string AccountWithBlob() {
  return HttpAnswer("201 Created", R"({"accountName": "HOST2$", "joinBlob": ")" + Blob() + "\"}");
}

TEST(CamSecretsTest, BlobAndTokenAreGoneFromMemoryOnceTheBlobIsReleased) {
  const ServerProcess server(AccountWithBlob);
  const Plugin plugin;
  char* name = nullptr;
  char* blob = nullptr;
  ASSERT_EQ(plugin.Operations().createMachineAccount("127.0.0.1", "host2", nullptr, 0, "", &name, &blob), 0U);
  EXPECT_TRUE(MemoryHoldsReverseOf(REVERSED_BLOB_PIECE)) << "the search finds nothing";
  plugin.Operations().releaseString(blob);
  plugin.Operations().releaseString(name);
  EXPECT_FALSE(MemoryHoldsReverseOf(REVERSED_BLOB_PIECE));
  EXPECT_FALSE(MemoryHoldsReverseOf(REVERSED_TOKEN));
}

TEST(CamSecretsTest, BlobOfAnAnswerThatCannotBeUsedIsGoneFromMemory) {
  const ServerProcess server(
      [] { return HttpAnswer("201 Created", R"({"joinBlob": ")" + Blob() + R"(", "accountName": 7})"); });
  EXPECT_EQ(Plugin().Create("host2").status, 13U);
  EXPECT_FALSE(MemoryHoldsReverseOf(REVERSED_BLOB_PIECE));
}

TEST(CamSecretsTest, BlobInAnAnswerThatIsNotJsonIsGoneFromMemory) {
  const ServerProcess server([] { return HttpAnswer("201 Created", "{\"joinBlob\": \"" + Blob()); });
  EXPECT_EQ(Plugin().Create("host2").status, 13U);
  EXPECT_FALSE(MemoryHoldsReverseOf(REVERSED_BLOB_PIECE));
}

TEST(CamSecretsTest, BlobThatComesInChunksIsGoneFromMemory) {
  const ServerProcess server([] {
    const std::string body = R"({"accountName": "HOST2$", "joinBlob": ")" + Blob() + "\"}";
    std::string answer = "HTTP/1.1 201 Created\r\nTransfer-Encoding: chunked\r\n\r\n";
    for (std::size_t start = 0; start < body.size(); start += 0x64) {
      const std::string chunk = body.substr(start, 0x64);
      char size[16];
      std::snprintf(size, sizeof size, "%zx\r\n", chunk.size());
      answer += size + chunk + "\r\n";
    }
    return answer + "0\r\n\r\n";
  });
  const Plugin plugin;
  char* name = nullptr;
  char* blob = nullptr;
  ASSERT_EQ(plugin.Operations().createMachineAccount("127.0.0.1", "host2", nullptr, 0, "", &name, &blob), 0U);
  plugin.Operations().releaseString(blob);
  plugin.Operations().releaseString(name);
  EXPECT_FALSE(MemoryHoldsReverseOf(REVERSED_BLOB_PIECE));
}

TEST(CamSecretsTest, NeitherIsLogged) {
  const ServerProcess server([] {
    return HttpAnswer("403 Forbidden", R"({"status": 5, "text": "no", "joinBlob": ")" + Blob() + "\"}");
  });
  EXPECT_EQ(Plugin().Create("host2").status, 5U);
  for (const auto& line : testsupport::RecordedLog()) {
    EXPECT_EQ(line.text.find("MachinePassword"), std::string::npos);
    EXPECT_EQ(line.text.find(Forwards(REVERSED_TOKEN)), std::string::npos);
  }
}

}  // namespace
}  // namespace camtest
