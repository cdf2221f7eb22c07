// One connection to OpenOCD's Tcl server: a request is a script followed by the byte 0x1a, and
// the answer is the script's result followed by 0x1a. Connecting and every request have
// deadlines; any failure closes the connection, and the next request connects again.
#ifndef ZINHUB_TCLCONNECTION_H
#define ZINHUB_TCLCONNECTION_H

#include <cstddef>
#include <cstdint>
#include <string>

namespace ZinHub {

struct OpenOcdOptions {
  uint32_t connectTimeoutMs = 3000;   // resolving, connecting
  uint32_t requestTimeoutMs = 10000;  // sending one Tcl request and receiving its whole answer
};

class TclConnection {
 public:
  TclConnection(std::string host, uint16_t port, OpenOcdOptions options);
  ~TclConnection();
  TclConnection(const TclConnection&) = delete;
  TclConnection& operator=(const TclConnection&) = delete;

  /// Connects unless connected; a connection that OpenOCD closed while idle is replaced.
  /// Returns true when a new connection was made. Throws std::runtime_error naming the server.
  bool ensureConnected();
  void close();

  /// Sends `script` and returns its result (without the 0x1a). An answer longer than
  /// `maxAnswer` bytes fails the request. Throws std::runtime_error; the connection is closed.
  std::string request(const std::string& script, size_t maxAnswer);

  /// "OpenOCD at HOST:PORT"
  std::string where() const;

 private:
  [[noreturn]] void fail(const std::string& what);
  void connectNow();
  bool closedByPeer() const;

  std::string host_;
  uint16_t port_;
  OpenOcdOptions options_;
  int fd_ = -1;
};

}  // namespace ZinHub

#endif
