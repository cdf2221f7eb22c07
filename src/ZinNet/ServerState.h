// What the connections of a server share: the served transport, its request mutex, the options,
// the log and the counters.
#ifndef ZINNET_SRC_SERVERSTATE_H
#define ZINNET_SRC_SERVERSTATE_H

#include <atomic>
#include <memory>
#include <mutex>
#include <string>

#include "Asio.h"
#include "RequestQueue.h"
#include "ZinNet/Server.h"

namespace ZinNet {

struct ServerState {
  ServerState(std::shared_ptr<ZinRT::Zin_Transport> t, ServerOptions o)
      : transport(std::move(t)), options(std::move(o)) {}

  void log(const std::string& line);
  ServerStats snapshot() const;

  std::shared_ptr<ZinRT::Zin_Transport> transport;
  const ServerOptions options;
  std::mutex requestMutex;  // held for each request carried out on the transport
  RequestQueue waiting;     // requests handed to the request thread, not yet begun
  // Requests handed to the request thread and not finished: while there are any, new requests
  // queue behind them instead of running on the I/O thread.
  std::atomic<uint32_t> handedOff{0};
  std::mutex logMutex;
  std::atomic<bool> stopping{false};
  std::atomic<uint64_t> connectionsAccepted{0};
  std::atomic<uint64_t> connectionsOpen{0};
  std::atomic<uint64_t> requestsServed{0};
  std::atomic<uint64_t> framesRefused{0};
};

}  // namespace ZinNet

#endif
