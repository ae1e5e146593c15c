// Fetching a TLS server's certificate.
#include <arpa/inet.h>
#include <openssl/err.h>
#include <openssl/ssl.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

#include <cerrno>

#include "certificate.h"
#include "failure.h"
#include "text.h"

namespace velmorctl {

namespace {

constexpr timeval answerTimeout{10, 0};

/// A server that hangs up must not end the command by a signal.
class IgnoredBrokenPipe {
 public:
  IgnoredBrokenPipe() : previous_(signal(SIGPIPE, SIG_IGN)) {}
  IgnoredBrokenPipe(const IgnoredBrokenPipe&) = delete;
  IgnoredBrokenPipe& operator=(const IgnoredBrokenPipe&) = delete;
  ~IgnoredBrokenPipe() { signal(SIGPIPE, previous_); }

 private:
  sighandler_t previous_;
};

class Socket {
 public:
  Socket() : descriptor_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {}
  Socket(const Socket&) = delete;
  Socket& operator=(const Socket&) = delete;
  ~Socket() {
    if (descriptor_ >= 0) {
      close(descriptor_);
    }
  }
  int Descriptor() const { return descriptor_; }

  /// False with errno set when there is no connection.
  bool Connect(const std::string& address, std::uint16_t port) const {
    sockaddr_in target{};
    target.sin_family = AF_INET;
    target.sin_port = htons(port);
    if (inet_pton(AF_INET, address.c_str(), &target.sin_addr) != 1) {
      errno = EINVAL;
      return false;
    }
    return descriptor_ >= 0 &&
           setsockopt(descriptor_, SOL_SOCKET, SO_SNDTIMEO, &answerTimeout, sizeof answerTimeout) == 0 &&
           setsockopt(descriptor_, SOL_SOCKET, SO_RCVTIMEO, &answerTimeout, sizeof answerTimeout) == 0 &&
           connect(descriptor_, reinterpret_cast<const sockaddr*>(&target), sizeof target) == 0;
  }

 private:
  int descriptor_;
};

/// Why there is no connection, or no handshake.
std::string Reason(int errorNumber) {
  const char* tls = ERR_reason_error_string(ERR_peek_last_error());
  if (errorNumber == EINPROGRESS || errorNumber == EAGAIN) {
    return "no answer within " + std::to_string(answerTimeout.tv_sec) + " seconds";
  }
  if (tls != nullptr) {
    return std::string("no TLS 1.2 or newer: ") + tls;
  }
  return errorNumber == 0 ? "the server hung up" : SystemErrorText(errorNumber);
}

[[noreturn]] void Fail(const std::string& address, std::uint16_t port, int errorNumber) {
  const std::string reason = Reason(errorNumber);
  ERR_clear_error();
  throw Failure(ExitCode::Proxy, "cannot fetch the certificate of " + address + ":" + std::to_string(port))
      .Detail("reason", reason)
      .Try("check the address, the service there, and the port in /etc/quenix/velmor/cam.conf");
}

}  // namespace

Certificate Certificate::OfServer(const std::string& address, std::uint16_t port) {
  const IgnoredBrokenPipe ignored;
  const Socket socket;
  ERR_clear_error();
  errno = 0;
  if (!socket.Connect(address, port)) {
    Fail(address, port, errno);
  }
  const std::unique_ptr<SSL_CTX, void (*)(SSL_CTX*)> context(SSL_CTX_new(TLS_client_method()), SSL_CTX_free);
  const std::unique_ptr<SSL, void (*)(SSL*)> tls(context ? SSL_new(context.get()) : nullptr, SSL_free);
  if (tls == nullptr || SSL_set_min_proto_version(tls.get(), TLS1_2_VERSION) != 1 ||
      SSL_set_fd(tls.get(), socket.Descriptor()) != 1) {
    throw std::bad_alloc();
  }
  errno = 0;
  if (SSL_connect(tls.get()) != 1) {
    Fail(address, port, errno);
  }
  X509* certificate = SSL_get1_peer_certificate(tls.get());
  if (certificate == nullptr) {
    Fail(address, port, 0);
  }
  return Certificate(certificate);
}

}  // namespace velmorctl
