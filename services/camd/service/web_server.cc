#include "service/web_server.h"

#include <arpa/inet.h>
#include <gnutls/gnutls.h>
#include <microhttpd.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstdarg>
#include <cstring>
#include <memory>
#include <string_view>

#include "common/status.h"

namespace camd {
namespace {

constexpr size_t kLongestBody = 8 * 1024;
// A client that goes on sending is cut off; up to here it gets an answer that says why.
constexpr size_t kLongestRefusedBody = 64 * 1024;
constexpr size_t kConnectionMemory = 16 * 1024;
constexpr size_t kThreadStack = 512 * 1024;
constexpr const char* kCiphers = "NORMAL:-VERS-ALL:+VERS-TLS1.3:+VERS-TLS1.2";
constexpr std::string_view kBearer = "Bearer ";

unsigned int ThreadCount() {
  return std::clamp(std::thread::hardware_concurrency(), 2U, 4U);
}

// An address to bind to, of either family.
struct SocketAddress {
  sockaddr_in6 v6 = {};
  sockaddr_in v4 = {};
  bool isV6 = false;

  SocketAddress(const std::string& text, uint16_t port) {
    v4.sin_family = AF_INET;
    v4.sin_port = htons(port);
    v6.sin6_family = AF_INET6;
    v6.sin6_port = htons(port);
    isV6 = inet_pton(AF_INET, text.c_str(), &v4.sin_addr) != 1;
    if (isV6) inet_pton(AF_INET6, text.c_str(), &v6.sin6_addr);
  }
  const void* Get() const { return isV6 ? static_cast<const void*>(&v6) : &v4; }
};

// The text behind "Authorization: Bearer"; empty when there is none.
Secret TokenOf(MHD_Connection* connection) {
  const char* header =
      MHD_lookup_connection_value(connection, MHD_HEADER_KIND, MHD_HTTP_HEADER_AUTHORIZATION);
  const std::string_view text = header == nullptr ? "" : header;
  return Secret(text.starts_with(kBearer) ? text.substr(kBearer.size()) : std::string_view());
}

int SocketOf(MHD_Connection* connection) {
  const auto* information = MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD);
  return information == nullptr ? -1 : information->connect_fd;
}

Address ClientOf(MHD_Connection* connection) {
  const auto* information = MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CLIENT_ADDRESS);
  return information == nullptr ? Address() : Address::Of(information->client_addr);
}

// What the Content-Length says; 0 when there is none, as with a body in chunks.
uint64_t AnnouncedLength(MHD_Connection* connection) {
  const char* header =
      MHD_lookup_connection_value(connection, MHD_HEADER_KIND, MHD_HTTP_HEADER_CONTENT_LENGTH);
  uint64_t length = 0;
  if (header != nullptr) std::from_chars(header, header + std::strlen(header), length);
  return length;
}

gnutls_datum_t DatumOf(const Secret& text) {
  // The library does not change what it is given to read.
  auto* bytes = reinterpret_cast<unsigned char*>(const_cast<char*>(text.Text()));
  return {bytes, static_cast<unsigned int>(text.Size())};
}

struct CredentialsRelease {
  void operator()(gnutls_certificate_credentials_t credentials) const {
    gnutls_certificate_free_credentials(credentials);
  }
};

void AddHeaders(MHD_Response* response, const WebAnswer& answer) {
  MHD_add_response_header(response, MHD_HTTP_HEADER_CONTENT_TYPE, "application/json");
  MHD_add_response_header(response, MHD_HTTP_HEADER_CACHE_CONTROL, "no-store");
  if (answer.httpStatus == 401) MHD_add_response_header(response, MHD_HTTP_HEADER_WWW_AUTHENTICATE, "Bearer");
  if (answer.retryAfterSeconds != 0) {
    const std::string seconds = std::to_string(answer.retryAfterSeconds);
    MHD_add_response_header(response, MHD_HTTP_HEADER_RETRY_AFTER, seconds.c_str());
  }
}

void WipeBody(void* body) {
  delete static_cast<Secret*>(body);
}

// The library sends the bytes from where they are, and has them wiped when it has done with them.
MHD_Response* ResponseOf(WebAnswer& answer) {
  auto* body = new Secret(std::move(answer.body));
  MHD_Response* response =
      MHD_create_response_from_buffer_with_free_callback_cls(body->Size(), body->Data(), WipeBody, body);
  if (response == nullptr) {
    WipeBody(body);
    return nullptr;
  }
  AddHeaders(response, answer);
  return response;
}

// What the library has to say is about clients that break off, which is no news; why it does not start is
// said by the caller.
__attribute__((format(printf, 2, 0))) void LogMessage(void* /*closure*/, const char* format,
                                                      va_list arguments) {
  vsyslog(LOG_DEBUG, format, arguments);
}

}  // namespace

void CheckPair(const Secret& certificate, const Secret& key) {
  gnutls_certificate_credentials_t credentials = nullptr;
  int error = gnutls_certificate_allocate_credentials(&credentials);
  const std::unique_ptr<std::remove_pointer_t<gnutls_certificate_credentials_t>, CredentialsRelease> owner(
      credentials);
  const gnutls_datum_t pem = DatumOf(certificate);
  const gnutls_datum_t keyPem = DatumOf(key);
  if (error == GNUTLS_E_SUCCESS) {
    error = gnutls_certificate_set_x509_key_mem(credentials, &pem, &keyPem, GNUTLS_X509_FMT_PEM);
  }
  if (error < 0) {
    throw WebServerError(std::string("the certificate and its key cannot be used: ") +
                         gnutls_strerror(error));
  }
}

// A request while the web server has it.
struct WebServer::Exchange {
  WebRequest request;
  Address client;
  std::string label;
  int socket = -1;
  bool handedOver = false;
  // Guarded by the server's lock.
  bool asleep = false;
  bool answered = false;
  WebAnswer answer;
};

struct WebServer::Callbacks {
  static MHD_Result Handle(void* server, MHD_Connection* connection, const char* path, const char* method,
                           const char* /*version*/, const char* data, size_t* size, void** state) {
    auto& self = *static_cast<WebServer*>(server);
    if (*state == nullptr) {
      auto* exchange = new Exchange;
      *state = exchange;
      exchange->client = ClientOf(connection);
      exchange->label = std::string(method) + " " + path;
      exchange->socket = SocketOf(connection);
      exchange->request.client = exchange->client;
      exchange->request.method = method;
      exchange->request.path = path;
      exchange->request.token = TokenOf(connection);
      return static_cast<MHD_Result>(self.Begin(connection, *exchange));
    }
    return static_cast<MHD_Result>(self.Receive(connection, *static_cast<Exchange*>(*state), data, size));
  }

  static void Complete(void* server, MHD_Connection* /*connection*/, void** state,
                       MHD_RequestTerminationCode code) {
    if (*state == nullptr) return;
    static_cast<WebServer*>(server)->End(static_cast<Exchange*>(*state),
                                         code == MHD_REQUEST_TERMINATED_COMPLETED_OK);
    *state = nullptr;
  }

  static void NotifyConnection(void* server, MHD_Connection* connection, void** /*state*/,
                               MHD_ConnectionNotificationCode code) {
    auto& watch = static_cast<WebServer*>(server)->watch_;
    if (code == MHD_CONNECTION_NOTIFY_STARTED) {
      watch.Start(SocketOf(connection));
    } else {
      watch.Forget(SocketOf(connection));
    }
  }
};

WebServer::WebServer(const ServerSettings& settings, const Secret& certificate, const Secret& key,
                     RequestHandler& handler)
    : handler_(handler), watch_(settings.requestTimeout) {
  CheckPair(certificate, key);
  const SocketAddress address(settings.listenAddress, settings.port);
  const unsigned int flags = MHD_USE_EPOLL_INTERNAL_THREAD | MHD_USE_TLS | MHD_ALLOW_SUSPEND_RESUME |
                             MHD_USE_ITC | MHD_USE_ERROR_LOG | (address.isV6 ? MHD_USE_DUAL_STACK : 0);
  const unsigned int threads = ThreadCount();
  errno = 0;
  daemon_ = MHD_start_daemon(flags, settings.port, nullptr, nullptr, &Callbacks::Handle, this,  //
                             MHD_OPTION_EXTERNAL_LOGGER, &LogMessage, nullptr,                  //
                             MHD_OPTION_SOCK_ADDR, address.Get(),                               //
                             MHD_OPTION_HTTPS_MEM_CERT, certificate.Text(), MHD_OPTION_HTTPS_MEM_KEY,
                             key.Text(), MHD_OPTION_HTTPS_PRIORITIES, kCiphers,                     //
                             MHD_OPTION_THREAD_POOL_SIZE, threads,                                  //
                             MHD_OPTION_THREAD_STACK_SIZE, kThreadStack,                            //
                             MHD_OPTION_CONNECTION_LIMIT, std::max(settings.connections, threads),  //
                             MHD_OPTION_PER_IP_CONNECTION_LIMIT, settings.connectionsPerClient,     //
                             MHD_OPTION_CONNECTION_MEMORY_LIMIT, kConnectionMemory,                 //
                             MHD_OPTION_CONNECTION_TIMEOUT,
                             static_cast<unsigned int>(settings.requestTimeout.count()),        //
                             MHD_OPTION_NOTIFY_CONNECTION, &Callbacks::NotifyConnection, this,  //
                             MHD_OPTION_NOTIFY_COMPLETED, &Callbacks::Complete, this,           //
                             MHD_OPTION_END);
  if (daemon_ == nullptr) {
    throw WebServerError("cannot serve " + settings.listenAddress + " port " + std::to_string(settings.port) +
                         ": " + (errno != 0 ? ErrorText(errno) : "the web server does not start"));
  }
}

WebServer::~WebServer() {
  Stop();
}

void WebServer::Stop() {
  if (daemon_ == nullptr) return;
  const int listener = MHD_quiesce_daemon(daemon_);
  // It may be closed only when the server has ended, but who connects meanwhile must not wait for that.
  if (listener >= 0) shutdown(listener, SHUT_RDWR);
  {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [this] { return underWay_ == 0; });
  }
  MHD_stop_daemon(daemon_);
  daemon_ = nullptr;
  if (listener >= 0) close(listener);
}

// A body that says of itself that it is too long need not be received.
int WebServer::Begin(MHD_Connection* connection, Exchange& exchange) {
  if (AnnouncedLength(connection) <= kLongestBody) return MHD_YES;
  exchange.request.bodyTooLong = true;
  return HandOver(connection, exchange);
}

int WebServer::Receive(MHD_Connection* connection, Exchange& exchange, const char* data, size_t* size) {
  if (exchange.handedOver) return Send(connection, exchange);
  if (*size == 0) return HandOver(connection, exchange);
  std::string& body = exchange.request.body;
  if (body.size() + *size > kLongestRefusedBody) return MHD_NO;
  body.append(data, *size);
  exchange.request.bodyTooLong = body.size() > kLongestBody;
  *size = 0;
  return MHD_YES;
}

// A connection whose answer is not there at once sleeps until it is.
int WebServer::HandOver(MHD_Connection* connection, Exchange& exchange) {
  exchange.handedOver = true;
  watch_.Pause(exchange.socket);
  {
    const std::lock_guard lock(mutex_);
    ++underWay_;
  }
  handler_.Handle(std::move(exchange.request), [this, connection, &exchange](WebAnswer answer) {
    Complete(connection, exchange, std::move(answer));
  });
  {
    const std::lock_guard lock(mutex_);
    if (!exchange.answered) {
      exchange.asleep = true;
      MHD_suspend_connection(connection);
      return MHD_YES;
    }
  }
  return Send(connection, exchange);
}

// As soon as the lock is open, the exchange may end on another thread.
void WebServer::Complete(MHD_Connection* connection, Exchange& exchange, WebAnswer answer) {
  const std::lock_guard lock(mutex_);
  exchange.answer = std::move(answer);
  exchange.answered = true;
  watch_.Start(exchange.socket);
  if (exchange.asleep) MHD_resume_connection(connection);
}

int WebServer::Send(MHD_Connection* connection, Exchange& exchange) {
  MHD_Response* response = ResponseOf(exchange.answer);
  if (response == nullptr) return MHD_NO;
  const MHD_Result result = MHD_queue_response(connection, exchange.answer.httpStatus, response);
  MHD_destroy_response(response);
  return result;
}

void WebServer::End(Exchange* exchange, bool delivered) {
  const bool handedOver = exchange->handedOver;
  if (!delivered) handler_.NoteBrokenOff(exchange->client, exchange->label, handedOver);
  watch_.Start(exchange->socket);
  delete exchange;
  if (!handedOver) return;
  {
    const std::lock_guard lock(mutex_);
    --underWay_;
  }
  changed_.notify_all();
}

}  // namespace camd
