// The dashboard's web server: the embedded page, the JSON API, the event stream of reads, and
// the checks every request passes first (host, origin, content type, size).
#ifndef ZINMOX_DASHBOARD_SERVER_H
#define ZINMOX_DASHBOARD_SERVER_H

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <thread>

#include "HostLink.h"
#include "ReadHub.h"

namespace httplib {
class Server;
}

namespace zinmox::dashboard {

/// Seconds a connection may stay silent before it is closed, and worker threads beside those
/// that event streams hold.
inline constexpr int kIdleSeconds = 5;
inline constexpr size_t kRequestWorkers = 8;

class Server {
 public:
  /// Serves `host` on `listenHost`:`port` (port 0: a free one). Nothing runs until start().
  Server(HostLink& host, std::string listenHost, uint16_t port);
  ~Server();
  Server(const Server&) = delete;
  Server& operator=(const Server&) = delete;

  /// Binds, starts the reader and serves from a thread of its own. Throws std::runtime_error
  /// when the address cannot be bound.
  void start();
  /// Ends the event streams, the reader and the server.
  void stop();

  uint16_t port() const { return port_; }
  /// "127.0.0.1:8080".
  std::string address() const;
  ReadHub& hub() { return hub_; }

 private:
  void addRoutes();
  void addEvents();
  bool allowedHost(const std::string& hostHeader) const;

  HostLink& host_;
  ReadHub hub_;
  std::string listenHost_;
  uint16_t port_;
  std::unique_ptr<httplib::Server> http_;
  std::thread thread_;
  std::atomic<size_t> liveViews_{0};
};

}  // namespace zinmox::dashboard

#endif
