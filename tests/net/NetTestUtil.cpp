// The test server and the raw client.
#include "NetTestUtil.h"

#include <poll.h>
#include <sys/socket.h>

#include <thread>

namespace ZinNetTest {

TestServer::TestServer(std::shared_ptr<ZinRT::Zin_Transport> transport,
                       ZinNet::ServerOptions options) {
  options.host = "127.0.0.1";
  options.port = 0;
  options.log = [log = log_](const std::string& line) {
    std::lock_guard<std::mutex> lock(log->mutex);
    log->lines.push_back(line);
  };
  server_ = std::make_unique<ZinNet::Server>(std::move(transport), std::move(options));
  server_->start();
}

bool TestServer::waitUntilNoConnections(std::chrono::milliseconds limit) {
  const auto end = std::chrono::steady_clock::now() + limit;
  while (server_->stats().connectionsOpen != 0) {
    if (std::chrono::steady_clock::now() > end) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  return true;
}

RawClient::RawClient(uint16_t port, uint16_t version) {
  socket_.connect({asio::ip::make_address("127.0.0.1"), port});
  if (version != 0) greet(version);
}

RawClient::RawClient(asio::ip::tcp::acceptor& acceptor) {
  acceptor.accept(socket_);
}

bool RawClient::readExactly(unsigned char* data, size_t size,
                            std::chrono::steady_clock::time_point end) {
  while (size > 0 && !ended_) {
    const auto left =
        std::chrono::ceil<std::chrono::milliseconds>(end - std::chrono::steady_clock::now());
    pollfd ready{socket_.native_handle(), POLLIN, 0};
    if (left.count() <= 0 || ::poll(&ready, 1, static_cast<int>(left.count())) <= 0) return false;
    const ssize_t n = ::recv(ready.fd, data, size, 0);
    if ((ended_ = n <= 0)) return false;
    data += n;
    size -= static_cast<size_t>(n);
  }
  return size == 0;
}

std::optional<RawFrame> RawClient::readFrame(std::chrono::milliseconds limit) {
  const auto end = std::chrono::steady_clock::now() + limit;
  unsigned char prefix[4];
  if (!readExactly(prefix, 4, end)) return std::nullopt;
  const uint32_t length = (uint32_t{prefix[0]} << 24) | (uint32_t{prefix[1]} << 16) |
                          (uint32_t{prefix[2]} << 8) | prefix[3];
  if (length == 0 || length > (64u << 20)) {
    ADD_FAILURE() << "server sent a frame length of " << length;
    return std::nullopt;
  }
  Bytes body(length);
  if (!readExactly(body.data(), length, end)) return std::nullopt;
  return RawFrame{body[0], Bytes(body.begin() + 1, body.end())};
}

RawFrame RawClient::exchange(const Bytes& request, std::chrono::milliseconds limit) {
  send(request);
  std::optional<RawFrame> reply = readFrame(limit);
  if (!reply) ADD_FAILURE() << "no reply";
  return reply.value_or(RawFrame{});
}

bool RawClient::closedWithin(std::chrono::milliseconds limit) {
  const auto end = std::chrono::steady_clock::now() + limit;
  for (unsigned char byte = 0; !ended_ && std::chrono::steady_clock::now() < end;) {
    readExactly(&byte, 1, end);
  }
  return ended_;
}

void RawClient::greet(uint16_t version) {
  const RawFrame welcome = exchange(hello(version));
  ASSERT_EQ(welcome.type, kWelcome);
  ASSERT_GE(welcome.body.size(), 6u);
  EXPECT_EQ((welcome.body[4] << 8) | welcome.body[5], version);
}

}  // namespace ZinNetTest
