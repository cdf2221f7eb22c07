// A TCP connection that may carry TLS: frames are read and written the same way on either.
#ifndef ZINNET_SRC_NETSTREAM_H
#define ZINNET_SRC_NETSTREAM_H

#include <optional>
#include <utility>

#include "Asio.h"

namespace ZinNet {

/// Plain until startTls(); from then on every read and write goes through the TLS layer. An
/// asynchronous stream for asio::async_read and asio::async_write.
class NetStream {
 public:
  using executor_type = asio::any_io_executor;
  using Tls = asio::ssl::stream<asio::ip::tcp::socket&>;

  explicit NetStream(asio::ip::tcp::socket socket) : socket_(std::move(socket)) {}
  explicit NetStream(asio::io_context& io) : socket_(io) {}

  executor_type get_executor() { return socket_.get_executor(); }
  asio::ip::tcp::socket& socket() { return socket_; }
  bool secure() const { return tls_.has_value(); }
  /// Layers TLS over the connection (the handshake is the caller's).
  Tls& startTls(asio::ssl::context& context) { return tls_.emplace(socket_, context); }
  /// Back to a plain stream, for a new connection on the same socket object.
  void reset() { tls_.reset(); }

  template <typename Buffers, typename Handler>
  void async_read_some(const Buffers& buffers, Handler&& handler) {
    if (tls_) {
      tls_->async_read_some(buffers, std::forward<Handler>(handler));
    } else {
      socket_.async_read_some(buffers, std::forward<Handler>(handler));
    }
  }

  template <typename Buffers, typename Handler>
  void async_write_some(const Buffers& buffers, Handler&& handler) {
    if (tls_) {
      tls_->async_write_some(buffers, std::forward<Handler>(handler));
    } else {
      socket_.async_write_some(buffers, std::forward<Handler>(handler));
    }
  }

 private:
  asio::ip::tcp::socket socket_;  // declared first: the TLS layer refers to it
  std::optional<Tls> tls_;
};

}  // namespace ZinNet

#endif
