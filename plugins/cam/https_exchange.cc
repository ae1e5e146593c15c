#include "https_exchange.h"

#include <openssl/err.h>
#include <sys/socket.h>

#include <algorithm>
#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <boost/asio/ssl/context.hpp>
#include <boost/asio/ssl/error.hpp>
#include <boost/asio/write.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/tcp_stream.hpp>
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/read.hpp>
#include <boost/beast/http/serializer.hpp>
#include <boost/beast/http/string_body.hpp>
#include <boost/beast/ssl/ssl_stream.hpp>
#include <boost/system/system_error.hpp>
#include <charconv>
#include <utility>

#include "failure.h"

namespace camproxy {

namespace {

namespace asio = boost::asio;
namespace beast = boost::beast;
namespace http = boost::beast::http;
using boost::system::error_code;
using tcp = asio::ip::tcp;

constexpr std::uint64_t LARGEST_BODY = 64 * 1024;
constexpr std::uint32_t LARGEST_HEADER = 16 * 1024;
constexpr unsigned int HTTP_1_1 = 11;

using Body = http::basic_string_body<char, std::char_traits<char>, WipingAllocator<char>>;
using Fields = http::basic_fields<WipingAllocator<char>>;
using Stream = beast::ssl_stream<beast::tcp_stream>;

/// `tlsStatus` is that of a fault of TLS itself, which means something else once the handshake is done.
std::uint32_t StatusOf(const error_code& error, std::uint32_t tlsStatus) {
  if (error == beast::error::timeout || error == asio::error::timed_out) return TIMED_OUT;
  if (error == asio::error::connection_refused) return CONNECTION_REFUSED;
  if (error == asio::error::host_unreachable || error == asio::error::network_unreachable ||
      error == asio::error::network_down) {
    return NO_ROUTE;
  }
  if (error == asio::error::no_memory) return OUT_OF_MEMORY;
  if (error == asio::error::connection_reset || error == asio::error::broken_pipe ||
      error == asio::error::eof || error == asio::ssl::error::stream_truncated ||
      error == http::error::end_of_stream || error == http::error::partial_message) {
    return CONNECTION_BROKEN;
  }
  if (error.category() == http::make_error_code(http::error::bad_version).category()) return INVALID_DATA;
  if (error.category() == asio::error::get_ssl_category()) {
    const bool lacksMemory =
        ERR_GET_REASON(static_cast<unsigned long>(error.value())) == ERR_R_MALLOC_FAILURE;
    return lacksMemory ? OUT_OF_MEMORY : tlsStatus;
  }
  return UNEXPECTED_NETWORK_ERROR;
}

void ThrowIfFailed(const char* step, const error_code& error, std::uint32_t tlsStatus = CONNECTION_BROKEN) {
  if (error) throw Failure(StatusOf(error, tlsStatus), std::string(step) + ": " + error.message());
}

asio::ssl::context MakeContext(CertificateCheck* check) {
  asio::ssl::context context(asio::ssl::context::tls_client);
  SSL_CTX* native = context.native_handle();
  SSL_CTX_set_min_proto_version(native, TLS1_2_VERSION);
  // OpenSSL would keep the last plaintext that came in, which may be a machine's password.
  SSL_CTX_set_options(native, SSL_OP_CLEANSE_PLAINTEXT | SSL_OP_NO_RENEGOTIATION | SSL_OP_NO_COMPRESSION);
  if (check != nullptr) {
    check->Install(native);
  } else {
    SSL_CTX_set_verify(native, SSL_VERIFY_NONE, nullptr);
  }
  return context;
}

/// A socket that programs started by this process do not inherit.
tcp::socket MakeSocket(asio::io_context& context) {
  const int descriptor = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (descriptor < 0) ThrowIfFailed("socket", error_code(errno, boost::system::system_category()));
  return {context, tcp::v4(), descriptor};
}

/// The whole request as the bytes to send, in one piece of memory that is wiped.
SecretString Serialise(const Target& target, const Request& request) {
  http::request<Body, Fields> message(request.body.empty() ? http::verb::get : http::verb::post, request.path,
                                      HTTP_1_1);
  message.set(http::field::host, target.address + ":" + std::to_string(target.port));
  message.set(http::field::accept, "application/json");
  message.set(http::field::connection, "close");
  if (!request.token.empty()) {
    const SecretString credentials = "Bearer " + request.token;
    message.set(http::field::authorization, beast::string_view(credentials.data(), credentials.size()));
  }
  if (!request.body.empty()) {
    message.set(http::field::content_type, "application/json");
    message.body() = request.body;
    message.prepare_payload();
  }
  http::request_serializer<Body, Fields> serializer(message);
  SecretString bytes;
  error_code error;
  while (!serializer.is_done() && !error) {
    serializer.next(error, [&](error_code&, const auto& buffers) {
      for (const asio::const_buffer buffer : beast::buffers_range_ref(buffers)) {
        bytes.append(static_cast<const char*>(buffer.data()), buffer.size());
      }
      serializer.consume(beast::buffer_bytes(buffers));
    });
  }
  ThrowIfFailed("request", error);
  return bytes;
}

std::optional<std::chrono::seconds> ParseSeconds(beast::string_view text) {
  std::uint32_t seconds = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), seconds);
  if (text.empty() || error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return std::chrono::seconds(seconds);
}

class Connection {
 public:
  Connection(const Target& target, CertificateCheck* check)
      : target_(target),
        check_(check),
        context_(1),
        tls_(MakeContext(check)),
        stream_(MakeSocket(context_), tls_) {}

  void Connect() {
    const tcp::endpoint endpoint(asio::ip::make_address_v4(target_.address), target_.port);
    Lowest().expires_at(std::min(target_.connectDeadline, target_.deadline));
    ThrowIfFailed("connect", Await([&](auto done) { Lowest().async_connect(endpoint, std::move(done)); }));
    const error_code error =
        Await([&](auto done) { stream_.async_handshake(asio::ssl::stream_base::client, std::move(done)); });
    if (check_ != nullptr) check_->ThrowIfRefused();
    ThrowIfFailed("TLS handshake", error, NO_COMMON_TLS);
    if (check_ != nullptr) check_->ThrowUnlessAccepted();
  }

  void Send(const SecretString& bytes) {
    Lowest().expires_at(target_.deadline);
    ThrowIfFailed("send", Await([&](auto done) {
                    asio::async_write(stream_, asio::buffer(bytes.data(), bytes.size()), std::move(done));
                  }));
  }

  Answer Receive() {
    beast::basic_flat_buffer<WipingAllocator<char>> buffer;
    while (true) {
      http::response_parser<Body, WipingAllocator<char>> parser;
      parser.body_limit(LARGEST_BODY);
      parser.header_limit(LARGEST_HEADER);
      // The header by itself first: a parser that reads on passes over an announced length above the limit.
      ThrowIfFailed("receive", Await([&](auto done) {
                      http::async_read_header(stream_, buffer, parser, std::move(done));
                    }));
      ThrowIfFailed("receive",
                    Await([&](auto done) { http::async_read(stream_, buffer, parser, std::move(done)); }));
      auto message = parser.release();
      if (http::to_status_class(message.result()) == http::status_class::informational) continue;
      return {message.result_int(), ParseSeconds(message[http::field::retry_after]),
              std::move(message.body())};
    }
  }

 private:
  beast::tcp_stream& Lowest() { return stream_.next_layer(); }

  /// Starts an operation and runs it to its end, which its deadline bounds.
  template <class Start>
  error_code Await(Start start) {
    error_code result;
    start([&result](const error_code& error, auto&&...) { result = error; });
    context_.restart();
    context_.run();
    return result;
  }

  const Target& target_;
  CertificateCheck* check_;
  asio::io_context context_;
  asio::ssl::context tls_;
  Stream stream_;
};

}  // namespace

Answer Exchange(const Target& target, CertificateCheck* check, const Request& request) {
  try {
    Connection connection(target, check);
    connection.Connect();
    connection.Send(Serialise(target, request));
    return connection.Receive();
  } catch (const boost::system::system_error& error) {
    throw Failure(StatusOf(error.code(), NO_COMMON_TLS), error.what());
  }
}

}  // namespace camproxy
