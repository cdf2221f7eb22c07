// A remote bit-bang JTAG server on a loopback TCP port, one client at a time.
#ifndef ZINMOX_RTLSIM_BITBANGSERVER_H
#define ZINMOX_RTLSIM_BITBANGSERVER_H

#include <atomic>
#include <cstdint>
#include <string>

namespace ZinRtl {

/// What the server drives: the pins of a JTAG target.
class BitbangTarget {
 public:
  virtual ~BitbangTarget() = default;
  virtual void setPins(bool tck, bool tms, bool tdi) = 0;
  virtual bool tdo() const = 0;
  virtual void setResets(bool trst, bool srst) = 0;  // true = asserted
};

struct BitbangOptions {
  std::string host = "127.0.0.1";
  uint16_t port = 9824;          // 0 picks a free port
  int idleTimeoutSeconds = 600;  // a client that sends nothing this long is dropped (0: never)
  int sendTimeoutSeconds = 10;   // a client that takes no replies this long is dropped
};

/// Serves the remote bit-bang protocol: '0'-'7' set TCK (4), TMS (2) and TDI (1); 'R' answers
/// TDO as '0' or '1'; 'r'-'u' set the resets (TRST 2, SRST 1; 1 = asserted); 'B'/'b' switch the
/// blink LED (ignored); 'Q' ends the session and the server. Any other byte is ignored, so junk
/// cannot crash or wedge it. One client is served at a time; the next connection waits in the
/// listen queue until the current client leaves, quits or is dropped for idleness.
class BitbangServer {
 public:
  BitbangServer(BitbangTarget& target, BitbangOptions options);
  ~BitbangServer();
  BitbangServer(const BitbangServer&) = delete;
  BitbangServer& operator=(const BitbangServer&) = delete;

  /// The port actually listened on. Throws std::runtime_error when it cannot listen.
  uint16_t port() const { return port_; }

  /// Serves clients until `stop` becomes true (checked at least every 100 ms) or a client sends
  /// 'Q'. Returns true when a client asked to quit.
  bool run(const std::atomic<bool>& stop);

  uint64_t ignoredBytes() const { return ignored_; }

 private:
  // Returns true when the client sent 'Q'.
  bool serveClient(int fd, const std::atomic<bool>& stop);
  bool handle(const char* data, size_t size, std::string& replies);

  BitbangTarget& target_;
  BitbangOptions options_;
  int listenFd_ = -1;
  uint16_t port_ = 0;
  uint64_t ignored_ = 0;
};

}  // namespace ZinRtl

#endif
