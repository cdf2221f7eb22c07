// The server's log and counters.
#include "ServerState.h"

#include <iostream>

namespace ZinNet {

void ServerState::log(const std::string& line) {
  std::lock_guard<std::mutex> lock(logMutex);
  if (options.log) {
    try {
      options.log(line);
    } catch (...) {
      // A failing log sink must not take the server down.
    }
    return;
  }
  std::cerr << "ZinNet: " << line << std::endl;
}

ServerStats ServerState::snapshot() const {
  ServerStats stats;
  stats.connectionsAccepted = connectionsAccepted.load();
  stats.connectionsOpen = connectionsOpen.load();
  stats.requestsServed = requestsServed.load();
  stats.framesRefused = framesRefused.load();
  stats.tokensRefused = tokensRefused.load();
  return stats;
}

}  // namespace ZinNet
