#include "cam/tls_server.h"

#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace camtest {

namespace {

constexpr int BACKLOG = 64;
thread_local std::string* receivedBytes = nullptr;

[[noreturn]] void Fail(const char* what) {
  throw std::system_error(errno, std::generic_category(), what);
}

/// A client that hangs up must not end the test program through the server's own writes.
void BlockBrokenPipe() {
  sigset_t signals;
  sigemptyset(&signals);
  sigaddset(&signals, SIGPIPE);
  pthread_sigmask(SIG_BLOCK, &signals, nullptr);
}

std::size_t ExpectedLength(const std::string& request) {
  const auto end = request.find("\r\n\r\n");
  if (end == std::string::npos) return std::string::npos;
  const std::string name = "Content-Length: ";
  const auto field = request.find(name);
  const auto body = field == std::string::npos ? 0 : std::stoul(request.substr(field + name.size()));
  return end + 4 + body;
}

}  // namespace

std::string Connection::ReadSome(std::size_t size) {
  std::string bytes(size, '\0');
  const int count = SSL_read(tls_, bytes.data(), static_cast<int>(size));
  bytes.resize(count > 0 ? static_cast<std::size_t>(count) : 0);
  *receivedBytes += bytes;
  return bytes;
}

std::string Connection::ReadRequest() {
  std::string request;
  while (request.size() < ExpectedLength(request)) {
    const std::string bytes = ReadSome(4096);
    if (bytes.empty()) break;
    request += bytes;
  }
  return request;
}

bool Connection::Send(const std::string& bytes) {
  return SSL_write(tls_, bytes.data(), static_cast<int>(bytes.size())) > 0;
}

void Connection::AwaitEnd() {
  while (!ReadSome(4096).empty()) {
  }
}

void Connection::HideCertificate() {
  SSL_CTX_set_cipher_list(SSL_get_SSL_CTX(tls_), "aNULL:@SECLEVEL=0");
}

TlsServer::TlsServer(const Identity& identity, Conversation conversation, int highestVersion,
                     std::uint16_t port)
    : conversation_(std::move(conversation)),
      context_(SSL_CTX_new(TLS_server_method()), SSL_CTX_free),
      port_(port),
      listener_(ListenOnly(&port_, BACKLOG)) {
  SSL_CTX* context = context_.get();
  SSL_CTX_set_min_proto_version(context, TLS1_VERSION);
  SSL_CTX_set_max_proto_version(context, highestVersion);
  // Old versions of TLS need digests that OpenSSL otherwise refuses.
  if (highestVersion < TLS1_2_VERSION) SSL_CTX_set_cipher_list(context, "DEFAULT@SECLEVEL=0");
  if (SSL_CTX_use_certificate(context, identity.Certificate()) != 1 ||
      SSL_CTX_use_PrivateKey(context, identity.Key()) != 1) {
    throw std::runtime_error("the server's certificate");
  }
  acceptor_ = std::thread([this] { AcceptAll(); });
}

TlsServer::~TlsServer() {
  shutdown(listener_, SHUT_RDWR);
  acceptor_.join();
  close(listener_);
  {
    const std::lock_guard lock(mutex_);
    for (const int descriptor : open_) shutdown(descriptor, SHUT_RDWR);
  }
  for (auto& worker : workers_) worker.join();
}

std::size_t TlsServer::Connections() {
  const std::lock_guard lock(mutex_);
  return connections_;
}

std::vector<std::string> TlsServer::RequestsOf(std::size_t connections) {
  std::unique_lock lock(mutex_);
  ended_.wait(lock, [&] { return connections_ >= connections; });
  return requests_;
}

void TlsServer::AcceptAll() {
  while (true) {
    const int descriptor = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
    if (descriptor < 0) return;
    const std::lock_guard lock(mutex_);
    open_.push_back(descriptor);
    workers_.emplace_back([this, descriptor] { Serve(descriptor); });
  }
}

void TlsServer::Serve(int descriptor) {
  BlockBrokenPipe();
  std::string received;
  receivedBytes = &received;
  const std::unique_ptr<SSL, void (*)(SSL*)> tls(SSL_new(context_.get()), SSL_free);
  SSL_set_fd(tls.get(), descriptor);
  if (SSL_accept(tls.get()) == 1) {
    Connection connection(tls.get(), descriptor);
    conversation_(connection);
    SSL_shutdown(tls.get());
  } else {
    // What follows a failed handshake must be nothing.
    char byte = 0;
    if (recv(descriptor, &byte, 1, 0) > 0) received = "bytes behind the failed handshake";
  }
  const std::lock_guard lock(mutex_);
  ++connections_;
  if (!received.empty()) requests_.push_back(received);
  std::erase(open_, descriptor);
  close(descriptor);
  ended_.notify_all();
}

int ListenOnly(std::uint16_t* port, int backlog) {
  const int descriptor = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(*port);
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  socklen_t size = sizeof address;
  auto* generic = reinterpret_cast<sockaddr*>(&address);
  if (descriptor < 0 || bind(descriptor, generic, size) != 0 || listen(descriptor, backlog) != 0 ||
      getsockname(descriptor, generic, &size) != 0) {
    Fail("listen");
  }
  *port = ntohs(address.sin_port);
  return descriptor;
}

std::string HttpAnswer(const std::string& statusLine, const std::string& body, const std::string& fields) {
  return "HTTP/1.1 " + statusLine + "\r\nContent-Type: application/json\r\n" + fields +
         "Content-Length: " + std::to_string(body.size()) + "\r\nConnection: close\r\n\r\n" + body;
}

Conversation Answering(const std::string& answer) {
  return [answer](Connection& connection) {
    connection.ReadRequest();
    connection.Send(answer);
  };
}

}  // namespace camtest
