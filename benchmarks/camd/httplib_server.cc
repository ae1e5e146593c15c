// The same question as velmor-camd answers from its memory, answered with cpp-httplib, which gives every
// connection a thread of a pool.
//
// usage: httplib_server PORT CERTIFICATE KEY THREADS
#include <httplib.h>

#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

constexpr int readSeconds = 10;
constexpr std::size_t manyRequests = 1000000;
constexpr const char* domain =
    R"({"netbiosDomainName":"CORP","dnsDomainName":"corp.example","domainSid":"S-1-5-21-1-2-3"})";

}  // namespace

int main(int count, char** arguments) {
  if (count != 5) {
    std::fprintf(stderr, "usage: httplib_server PORT CERTIFICATE KEY THREADS\n");
    return 2;
  }
  const std::size_t threads = std::strtoul(arguments[4], nullptr, 10);
  httplib::SSLServer server(arguments[2], arguments[3]);
  server.new_task_queue = [threads] { return new httplib::ThreadPool(threads); };
  server.set_keep_alive_max_count(manyRequests);
  server.set_read_timeout(readSeconds);
  server.set_tcp_nodelay(true);
  server.Get("/v1/domain", [](const httplib::Request&, httplib::Response& response) {
    response.set_content(domain, "application/json");
  });
  return server.listen("127.0.0.1", std::atoi(arguments[1])) ? EXIT_SUCCESS : EXIT_FAILURE;
}
