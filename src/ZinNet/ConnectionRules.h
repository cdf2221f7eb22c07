// What a server connection does with each frame a client sends, apart from its socket: the length
// limit, the greeting and its version, the ping, and which frames are requests. ServerConnection
// reads the frames and acts on the outcome; the frame fuzzer drives the same rules with a byte
// stream and no socket.
#ifndef ZINNET_SRC_CONNECTIONRULES_H
#define ZINNET_SRC_CONNECTIONRULES_H

#include <cstdint>
#include <string>
#include <vector>

#include "Frame.h"
#include "ZinNet/Server.h"

namespace ZinNet {

/// What to do with one complete frame.
struct FrameOutcome {
  enum class Action {
    Request,  // carry it out (carryOut) and send its reply
    Reply,    // send `bytes` and read on
    Refuse,   // send a refusal saying `why` and read on
    Close     // send a closing frame saying `why`, then close
  };
  Action action = Action::Request;
  std::string why;
  std::vector<unsigned char> bytes;
};

/// The state of one connection's greeting and the checks every frame passes before it is read or
/// carried out. `options` must outlive it.
class ConnectionRules {
 public:
  explicit ConnectionRules(const ServerOptions& options) : options_(options) {}

  /// Empty when a frame of `length` bytes (from its prefix) may be read, else why the
  /// connection closes. Until the greeting is done only its small frames fit, so a stranger
  /// cannot make the server set aside a large frame buffer before it has greeted.
  std::string lengthProblem(uint32_t length) const;
  /// The outcome of a complete frame: a valid first hello greets the connection, a ping of
  /// version 2 is answered here without the target.
  FrameOutcome onFrame(const Frame& frame);
  bool greeted() const { return version_ != 0; }
  /// The version agreed in the greeting (0 before).
  uint16_t version() const { return version_; }

  /// The largest frame taken before the greeting is done (a hello is 7 bytes).
  static constexpr uint32_t kMaxGreetingFrameBytes = 64;

 private:
  FrameOutcome onHello(const Frame& frame);

  const ServerOptions& options_;
  uint16_t version_ = 0;
};

}  // namespace ZinNet

#endif
