// The length limit, the greeting, the ping and the request check of a server connection.
#include "ConnectionRules.h"

#include <algorithm>
#include <cstring>

#include "RequestHandler.h"

namespace ZinNet {

using Protocol::MessageType;
using Action = FrameOutcome::Action;

namespace {

FrameOutcome outcome(Action action, std::string why) {
  FrameOutcome out;
  out.action = action;
  out.why = std::move(why);
  return out;
}

// Answered without the target: a ping measures the way to the server and back.
FrameOutcome pong(const Frame& frame) {
  try {
    FrameReader(frame, "ping").end();
  } catch (const FrameError& e) {
    return outcome(Action::Refuse, e.what());
  }
  FrameOutcome out = outcome(Action::Reply, {});
  out.bytes = FrameWriter(MessageType::Pong).finish();
  return out;
}

}  // namespace

std::string ConnectionRules::lengthProblem(uint32_t length) const {
  if (length == 0) return "frame of length 0";
  const uint32_t limit =
      greeted() ? options_.maxFrameBytes : std::min(options_.maxFrameBytes, kMaxGreetingFrameBytes);
  if (length > limit) {
    return "frame of " + std::to_string(length) + " bytes exceeds the limit of " +
           std::to_string(limit) + " bytes" + (greeted() ? "" : " before the greeting is done");
  }
  return {};
}

FrameOutcome ConnectionRules::onFrame(const Frame& frame) {
  if (!greeted()) return onHello(frame);
  if (frame.type == MessageType::Hello) return outcome(Action::Refuse, "hello sent twice");
  if (frame.type == MessageType::TokenRequest) {
    return outcome(Action::Refuse, options_.token.empty() ? "this server asks for no token"
                                                          : "the token was already proven");
  }
  if (frame.type == MessageType::Ping && version_ >= 2) return pong(frame);
  if (!isRequest(frame.type, version_)) {
    return outcome(Action::Refuse,
                   "unknown request type " + typeText(static_cast<uint8_t>(frame.type)));
  }
  return outcome(Action::Request, {});
}

FrameOutcome ConnectionRules::onHello(const Frame& frame) {
  if (frame.type != MessageType::Hello) {
    return outcome(Action::Close, "expected a hello frame first, got " +
                                      typeText(static_cast<uint8_t>(frame.type)));
  }
  FrameReader in(frame, "hello");
  if (in.remaining() != 6 || std::memcmp(in.bytes(4), Protocol::kMagic, 4) != 0) {
    return outcome(Action::Close, "not a ZinNet hello");
  }
  const uint16_t version = in.u16();
  if (version < Protocol::kOldestVersion || version > Protocol::kVersion) {
    return outcome(Action::Close, "protocol version " + std::to_string(version) +
                                      " is not supported; this server speaks " +
                                      std::to_string(Protocol::kOldestVersion) + " and " +
                                      std::to_string(Protocol::kVersion));
  }
  version_ = version;
  FrameWriter welcome(MessageType::Welcome);
  welcome.bytes(Protocol::kMagic, 4).u16(version);
  welcome.u32(options_.maxFrameBytes).u32(options_.maxReadBytes);
  FrameOutcome out = outcome(Action::Reply, {});
  out.bytes = welcome.text(boundedText(options_.name)).finish();
  return out;
}

}  // namespace ZinNet
