// A stranger's bytes to the target server, as one connection reads them: cut into frames at each
// length prefix, greeted and checked by the connection's rules, and each request carried out on a
// simulated target (the demo design) with the server's default limits. The stream stops where
// the server would close the connection: a closing frame, a length beyond the limit, or a stream
// that ends inside a frame. Every reply must be a well-formed frame of a kind its request allows;
// a target failure must carry the target's own text. Anything else, a crash or a sanitizer
// report is a fault.
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "ConnectionRules.h"
#include "FuzzSession.h"
#include "RequestHandler.h"
#include "ZinSim/Target.h"

using namespace ZinNet;
using Protocol::MessageType;
using ZinFuzz::fail;

namespace {

using Bytes = std::vector<unsigned char>;

uint32_t u32At(const Bytes& body, size_t at) {
  return body.size() >= at + 4 ? decodeLength(body.data() + at) : 0;
}

// The reply type a carried-out request gets, and the body size that reply must have.
size_t expectedReply(const Frame& request, const Frame& reply, MessageType& type) {
  switch (request.type) {
    case MessageType::ReadStatus:
      type = MessageType::Status;
      return 20 + size_t{u32At(request.body, 12)};
    case MessageType::CommandSequence:
    case MessageType::SequenceAndFlush:
      type = MessageType::ReadData;
      return (size_t{u32At(request.body, 0)} + 7) / 8;
    case MessageType::Flush:
      type = MessageType::Flushed;
      return 0;
    default:
      type = MessageType::Cores;
      return 5 + 12 * size_t{u32At(reply.body, 1)};
  }
}

// The reply frame as the client would read it, checked against its own prefix.
Frame readReply(const Bytes& bytes) {
  if (bytes.size() < Protocol::kLengthBytes + 1 ||
      decodeLength(bytes.data()) != bytes.size() - Protocol::kLengthBytes) {
    fail("a reply frame of " + std::to_string(bytes.size()) + " bytes has a wrong length prefix");
  }
  return frameOf(Bytes(bytes.begin() + Protocol::kLengthBytes, bytes.end()));
}

void checkText(const Frame& reply) {
  if (reply.body.empty() || reply.body.size() > Protocol::kMaxErrorText) {
    fail("a text reply of " + std::to_string(reply.body.size()) + " bytes");
  }
}

void checkReply(const Frame& request, const Reply& outcome) {
  const Frame reply = readReply(outcome.bytes);
  if (reply.type == MessageType::Refused || reply.type == MessageType::TargetFailed) {
    checkText(reply);
    const bool refused = reply.type == MessageType::Refused;
    if (outcome.refused != refused || outcome.carriedOut == refused) fail("a refusal miscounted");
    // The simulated target words its own failures; any other text (an allocation failure, a
    // standard library error) escaped the request's checks.
    const std::string text(reply.body.begin(), reply.body.end());
    if (!refused && text.rfind("ZinSim: ", 0) != 0) fail("target failure: " + text);
    return;
  }
  MessageType type{};
  const size_t bodyBytes = expectedReply(request, reply, type);
  if (reply.type != type || reply.body.size() != bodyBytes || outcome.refused ||
      !outcome.carriedOut) {
    fail(typeText(static_cast<uint8_t>(request.type)) + " answered by " +
         typeText(static_cast<uint8_t>(reply.type)) + " of " + std::to_string(reply.body.size()) +
         " bytes");
  }
}

// What the connection answers by itself: a welcome of the version asked for, then pongs.
void checkAnswer(const Frame& reply, bool greeted, uint16_t version) {
  if (greeted ? reply.type != MessageType::Pong || !reply.body.empty()
              : reply.type != MessageType::Welcome || reply.body.size() < 14 ||
                    (reply.body[4] << 8 | reply.body[5]) != version) {
    fail("the connection answered with " + typeText(static_cast<uint8_t>(reply.type)));
  }
}

// One frame of the stream; false when the server would close the connection after it.
bool onFrame(ConnectionRules& rules, ZinSim::Target& target, const ServerOptions& options,
             Frame frame) {
  const bool greeted = rules.greeted();
  FrameOutcome outcome = rules.onFrame(frame);
  switch (outcome.action) {
    case FrameOutcome::Action::Request:
      checkReply(frame, carryOut(frame, target, options.maxReadBytes));
      return true;
    case FrameOutcome::Action::Reply:
      checkAnswer(readReply(outcome.bytes), greeted, rules.version());
      return true;
    case FrameOutcome::Action::Refuse:
      checkText(readReply(textFrame(MessageType::Refused, outcome.why)));
      return true;
    case FrameOutcome::Action::Close:
      checkText(readReply(textFrame(MessageType::Closing, outcome.why)));
      return false;
  }
  return false;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const ServerOptions options;
  static const ZinSim::TargetDescription demo = ZinSim::demoDescription();
  ZinSim::Target target(demo);  // each stream starts on a fresh target, so that findings replay
  ConnectionRules rules(options);
  size_t at = 0;
  while (size - at >= Protocol::kLengthBytes) {
    const uint32_t length = decodeLength(data + at);
    at += Protocol::kLengthBytes;
    if (!rules.lengthProblem(length).empty()) return 0;  // closing frame, connection closed
    if (length > size - at) return 0;                    // the stream ends inside the frame
    Frame frame = frameOf(Bytes(data + at, data + at + length));
    at += length;
    if (!onFrame(rules, target, options, std::move(frame))) return 0;
  }
  return 0;
}
