// Fetching a TLS server's certificate.
#include <arpa/inet.h>
#include <openssl/err.h>
#include <openssl/ssl.h>
#include <poll.h>
#include <signal.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>

#include "certificate.h"
#include "failure.h"
#include "text.h"

namespace velmorctl {

namespace {

using Clock = std::chrono::steady_clock;

/// For the connection and the handshake together, however slowly the server goes on.
constexpr std::chrono::seconds answerTimeout{10};

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

/// A socket that waits for its server until a moment, and no longer.
class Socket {
 public:
  Socket() : descriptor_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)) {}
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
    if (descriptor_ < 0) {
      return false;
    }
    if (connect(descriptor_, reinterpret_cast<const sockaddr*>(&target), sizeof target) == 0) {
      return true;
    }
    return errno == EINPROGRESS && Await(POLLOUT) && TakeError() == 0;
  }

  /// Makes the handshake. False with errno, or OpenSSL's own queue of errors, saying why not.
  bool Handshake(SSL& tls) const {
    while (true) {
      ERR_clear_error();
      errno = 0;
      const int result = SSL_connect(&tls);
      if (result == 1) {
        return true;
      }
      const int wanted = SSL_get_error(&tls, result);
      if (wanted != SSL_ERROR_WANT_READ && wanted != SSL_ERROR_WANT_WRITE) {
        return false;
      }
      if (!Await(wanted == SSL_ERROR_WANT_READ ? POLLIN : POLLOUT)) {
        return false;
      }
    }
  }

 private:
  /// False with errno set when the event does not come in time.
  bool Await(short event) const {
    pollfd entry{descriptor_, event, 0};
    while (true) {
      const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline_ - Clock::now());
      const int ready = left.count() <= 0 ? 0 : poll(&entry, 1, static_cast<int>(left.count()));
      if (ready > 0) {
        return true;
      }
      if (ready == 0) {
        errno = ETIMEDOUT;
        return false;
      }
      if (errno != EINTR) {
        return false;
      }
    }
  }

  /// What became of a connection; also in errno.
  int TakeError() const {
    int error = 0;
    socklen_t size = sizeof error;
    if (getsockopt(descriptor_, SOL_SOCKET, SO_ERROR, &error, &size) == 0) {
      errno = error;
    }
    return errno;
  }

  int descriptor_;
  Clock::time_point deadline_ = Clock::now() + answerTimeout;
};

/// Why there is no connection, or no handshake.
std::string Reason(int errorNumber) {
  const char* tls = ERR_reason_error_string(ERR_peek_last_error());
  if (errorNumber == ETIMEDOUT) {
    return "no answer within " + std::to_string(answerTimeout.count()) + " seconds";
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
  if (!socket.Handshake(*tls)) {
    Fail(address, port, errno);
  }
  X509* certificate = SSL_get1_peer_certificate(tls.get());
  if (certificate == nullptr) {
    Fail(address, port, 0);
  }
  return Certificate(certificate);
}

}  // namespace velmorctl
