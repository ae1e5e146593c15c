// The HTTPS server.
#ifndef CAMD_SERVICE_WEB_SERVER_H
#define CAMD_SERVICE_WEB_SERVER_H

#include <condition_variable>
#include <mutex>
#include <stdexcept>

#include "common/secret.h"
#include "service/configuration.h"
#include "service/connection_watch.h"
#include "service/request_handler.h"

struct MHD_Connection;
struct MHD_Daemon;

namespace camd {

// A server that cannot be started, or a certificate that none can use; the text says why.
class WebServerError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// Throws WebServerError unless `certificate` and `key` are PEM and belong together.
void CheckPair(const Secret& certificate, const Secret& key);

// Serves HTTP/1.1 over TLS 1.2 or newer on threads of its own, none of which waits for a client or for the
// directory.
class WebServer {
 public:
  // Listens from now on. `certificate` and `key` are PEM. The handler must outlive the server. Throws
  // WebServerError.
  WebServer(const ServerSettings& settings, const Secret& certificate, const Secret& key,
            RequestHandler& handler);
  WebServer(const WebServer&) = delete;
  WebServer& operator=(const WebServer&) = delete;
  ~WebServer();

  // Accepts no further connection, waits until every whole request has its answer, and ends. The handler must
  // have been told to refuse further requests. Blocks as long as the requests under way take.
  void Stop();

 private:
  struct Exchange;
  struct Callbacks;

  int Begin(MHD_Connection* connection, Exchange& exchange);
  int Receive(MHD_Connection* connection, Exchange& exchange, const char* data, size_t* size);
  int HandOver(MHD_Connection* connection, Exchange& exchange);
  void Complete(MHD_Connection* connection, Exchange& exchange, WebAnswer answer);
  int Send(MHD_Connection* connection, Exchange& exchange);
  void End(Exchange* exchange, bool delivered);

  RequestHandler& handler_;
  ConnectionWatch watch_;
  MHD_Daemon* daemon_ = nullptr;
  std::mutex mutex_;
  std::condition_variable changed_;
  size_t underWay_ = 0;
};

}  // namespace camd

#endif  // CAMD_SERVICE_WEB_SERVER_H
