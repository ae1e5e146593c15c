/// A TLS server on the loopback interface that does what a test tells it.
#ifndef TESTS_CAM_TLS_SERVER_H
#define TESTS_CAM_TLS_SERVER_H

#include <openssl/ssl.h>

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "cam/certificate.h"

namespace camtest {

/// The server's end of a connection whose handshake is done. Closed when the conversation returns.
class Connection {
 public:
  Connection(SSL* tls, int descriptor) : tls_(tls), descriptor_(descriptor) {}

  /// Reads one HTTP request to its end; what has come by then when the client hangs up.
  std::string ReadRequest();
  /// One read of up to `size` bytes; empty when the client has hung up.
  std::string ReadSome(std::size_t size);
  /// False when the client has hung up.
  bool Send(const std::string& bytes);
  /// Waits until the client hangs up.
  void AwaitEnd();
  /// The server shows its later clients no certificate, as far as they agree.
  void HideCertificate();
  int Descriptor() const { return descriptor_; }

 private:
  SSL* tls_;
  int descriptor_;
};

using Conversation = std::function<void(Connection&)>;

/// Serves each connection on a thread of its own; ends all of them with the scope.
class TlsServer {
 public:
  /// On a free port, unless one is given.
  TlsServer(const Identity& identity, Conversation conversation, int highestVersion = TLS1_3_VERSION,
            std::uint16_t port = 0);
  TlsServer(const TlsServer&) = delete;
  TlsServer& operator=(const TlsServer&) = delete;
  ~TlsServer();

  std::uint16_t Port() const { return port_; }

  /// Waits until that many TCP connections have ended on this side; returns what those clients sent inside
  /// TLS, without those that sent nothing.
  std::vector<std::string> RequestsOf(std::size_t connections);

  /// TCP connections that have ended on this side so far.
  std::size_t Connections();

 private:
  void AcceptAll();
  void Serve(int descriptor);

  Conversation conversation_;
  std::unique_ptr<SSL_CTX, void (*)(SSL_CTX*)> context_;
  std::uint16_t port_;
  int listener_;
  std::mutex mutex_;
  std::condition_variable ended_;
  std::size_t connections_ = 0;
  std::vector<std::string> requests_;
  std::vector<int> open_;
  std::vector<std::thread> workers_;
  std::thread acceptor_;
};

/// A listening socket that nobody accepts on, on `*port` or, when that is 0, on a free one, which is stored
/// there.
int ListenOnly(std::uint16_t* port, int backlog);

/// A whole HTTP answer with a JSON body.
std::string HttpAnswer(const std::string& statusLine, const std::string& body,
                       const std::string& fields = "");

/// Conversations that answer one request.
Conversation Answering(const std::string& answer);

inline const std::string DOMAIN_BODY =
    R"({"netbiosDomainName": "CORP", "dnsDomainName": "corp.example", "domainSid": "S-1-5-21-1-2-3"})";
inline const std::string ACCOUNT_BODY = R"({"accountName": "HOST2$", "joinBlob": "QmxvYg=="})";

}  // namespace camtest

#endif  // TESTS_CAM_TLS_SERVER_H
