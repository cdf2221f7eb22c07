// Connect, greet and exchange frames with deadlines: each asynchronous operation is run on the
// channel's own I/O context until it completes or its deadline passes.
#include "ClientChannel.h"

#include <cstring>

namespace ZinNet {

using asio::ip::tcp;
using Protocol::MessageType;

namespace {

// Replies larger than this are refused whatever the server says.
constexpr uint32_t kMaxReplyBytes = 64u << 20;

}  // namespace

/// Completion of one operation, shared with its handler so that a handler running after a
/// timeout touches nothing that is gone.
struct ClientChannel::OpState {
  bool done = false;
  std::error_code ec;
  size_t bytes = 0;
  tcp::resolver::results_type results;
};

ClientChannel::ClientChannel(Endpoint endpoint, ClientOptions options)
    : endpoint_(std::move(endpoint)), options_(options), resolver_(io_), socket_(io_) {}

ClientChannel::~ClientChannel() {
  std::error_code ec;
  resolver_.cancel();
  socket_.close(ec);
}

void ClientChannel::disconnect() {
  std::error_code ec;
  resolver_.cancel();
  socket_.shutdown(tcp::socket::shutdown_both, ec);
  socket_.close(ec);
  connected_ = false;
}

void ClientChannel::fail(const std::string& text) {
  disconnect();
  throw NetError(text);
}

void ClientChannel::await(const std::shared_ptr<OpState>& state, Clock::time_point deadline,
                          const std::string& what, uint32_t timeoutMs) {
  while (!state->done) {
    if (io_.stopped()) io_.restart();
    io_.run_one_until(deadline);
    if (!state->done && Clock::now() >= deadline) {
      fail("ZinNet: " + what + " took longer than " + std::to_string(timeoutMs) +
           " ms; the connection to " + endpoint_.text() + " was closed");
    }
  }
}

void ClientChannel::ensureConnected() {
  if (connected_ && closedByPeer()) disconnect();
  if (!connected_) connectNow();
}

bool ClientChannel::closedByPeer() {
  // An idle connection has nothing to read: anything else (end of stream, a reset, stray bytes)
  // means it cannot carry a request any more.
  std::error_code ec;
  socket_.non_blocking(true, ec);
  if (ec) return true;
  unsigned char byte = 0;
  socket_.read_some(asio::buffer(&byte, 1), ec);
  std::error_code ignored;
  socket_.non_blocking(false, ignored);
  return ec != asio::error::would_block && ec != asio::error::try_again;
}

void ClientChannel::connectNow() {
  const uint32_t ms = options_.connectTimeoutMs;
  const auto deadline = Clock::now() + std::chrono::milliseconds(ms);
  const std::string what = "connecting to " + endpoint_.text();
  auto resolved = std::make_shared<OpState>();
  resolver_.async_resolve(endpoint_.host, std::to_string(endpoint_.port),
                          [resolved](std::error_code ec, tcp::resolver::results_type results) {
                            resolved->done = true;
                            resolved->ec = ec;
                            resolved->results = std::move(results);
                          });
  await(resolved, deadline, what, ms);
  if (resolved->ec) {
    fail("ZinNet: cannot find the server host " + endpoint_.host + ": " + resolved->ec.message());
  }
  // Ask for the newest version; a server that only speaks the oldest refuses it with a closing
  // frame ("protocol version 2 is not supported; ..."), and is greeted again with the oldest.
  for (uint16_t version = Protocol::kVersion;; version = Protocol::kOldestVersion) {
    auto connected = std::make_shared<OpState>();
    asio::async_connect(socket_, resolved->results, [connected](std::error_code ec, tcp::endpoint) {
      connected->done = true;
      connected->ec = ec;
    });
    await(connected, deadline, what, ms);
    if (connected->ec) {
      fail("ZinNet: cannot connect to " + endpoint_.text() + ": " + connected->ec.message() +
           " (is `zinmox serve` running there?)");
    }
    std::error_code ec;
    socket_.set_option(tcp::no_delay(true), ec);
    if (greet(deadline, version)) break;
    disconnect();
  }
  connected_ = true;
}

bool ClientChannel::greet(Clock::time_point deadline, uint16_t version) {
  const uint32_t ms = options_.connectTimeoutMs;
  const std::string what = "greeting " + endpoint_.text();
  FrameWriter hello(MessageType::Hello);
  hello.bytes(Protocol::kMagic, 4).u16(version);
  writeAll(hello.finish(), deadline, what, ms);
  const Frame reply = readFrame(deadline, what, ms);
  if (reply.type == MessageType::Closing) {
    const std::string text(reply.body.begin(), reply.body.end());
    if (version != Protocol::kOldestVersion && text.rfind("protocol version ", 0) == 0) {
      return false;
    }
    fail("ZinNet: the server at " + endpoint_.text() + " refused the connection: " + text);
  }
  try {
    FrameReader in(reply, "welcome");
    if (reply.type != MessageType::Welcome || std::memcmp(in.bytes(4), Protocol::kMagic, 4)) {
      throw FrameError("no welcome");
    }
    const uint16_t answered = in.u16();
    if (answered != version) {
      fail("ZinNet: the server at " + endpoint_.text() + " speaks protocol version " +
           std::to_string(answered) + "; this client speaks " +
           std::to_string(Protocol::kOldestVersion) + " and " + std::to_string(Protocol::kVersion));
    }
    serverMaxFrame_ = in.u32();
    serverMaxRead_ = in.u32();
    serverName_ = in.rest();
    version_ = version;
  } catch (const FrameError&) {
    fail("ZinNet: " + endpoint_.text() + " is not a ZinNet target server");
  }
  return true;
}

void ClientChannel::writeAll(const std::vector<unsigned char>& bytes, Clock::time_point deadline,
                             const std::string& what, uint32_t timeoutMs) {
  auto state = std::make_shared<OpState>();
  asio::async_write(socket_, asio::buffer(bytes), [state](std::error_code ec, size_t n) {
    state->done = true;
    state->ec = ec;
    state->bytes = n;
  });
  await(state, deadline, what, timeoutMs);
  if (state->ec) {
    fail("ZinNet: connection to " + endpoint_.text() + " lost while " + what + ": " +
         state->ec.message());
  }
}

Frame ClientChannel::readFrame(Clock::time_point deadline, const std::string& what,
                               uint32_t timeoutMs) {
  auto buffer = std::make_shared<std::vector<unsigned char>>(Protocol::kLengthBytes);
  for (int part = 0; part < 2; ++part) {
    auto state = std::make_shared<OpState>();
    asio::async_read(socket_, asio::buffer(*buffer), [state, buffer](std::error_code ec, size_t n) {
      state->done = true;
      state->ec = ec;
      state->bytes = n;
    });
    await(state, deadline, what, timeoutMs);
    if (state->ec) {
      fail("ZinNet: connection to " + endpoint_.text() + " lost while " + what + " (" +
           state->ec.message() + ")");
    }
    if (part == 0) {
      const uint32_t length = decodeLength(buffer->data());
      if (length == 0 || length > kMaxReplyBytes) {
        fail("ZinNet: " + endpoint_.text() + " sent a frame of " + std::to_string(length) +
             " bytes");
      }
      buffer->assign(length, 0);
    }
  }
  Frame frame;
  frame.type = static_cast<MessageType>(buffer->front());
  frame.body.assign(buffer->begin() + 1, buffer->end());
  return frame;
}

Frame ClientChannel::exchange(const std::vector<unsigned char>& request, MessageType expected,
                              const char* what) {
  ensureConnected();
  const uint32_t ms = options_.requestTimeoutMs;
  const auto deadline = Clock::now() + std::chrono::milliseconds(ms);
  const std::string doing = std::string("waiting for the answer to ") + what;
  writeAll(request, deadline, std::string("sending ") + what, ms);
  Frame reply = readFrame(deadline, doing, ms);
  const std::string text(reply.body.begin(), reply.body.end());
  switch (reply.type) {
    case MessageType::TargetFailed:
      throw TargetError(text);
    case MessageType::Refused:
      throw NetError("ZinNet: the server at " + endpoint_.text() + " refused " + what + ": " +
                     text);
    case MessageType::Closing:
      fail("ZinNet: the server at " + endpoint_.text() + " closed the connection: " + text);
    default:
      break;
  }
  if (reply.type != expected) {
    fail("ZinNet: " + endpoint_.text() + " answered " + what + " with " +
         typeText(static_cast<uint8_t>(reply.type)));
  }
  return reply;
}

}  // namespace ZinNet
