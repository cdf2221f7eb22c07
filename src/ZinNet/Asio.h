// The one place the networking library is included (standalone, header-only), with its TLS layer.
#ifndef ZINNET_SRC_ASIO_H
#define ZINNET_SRC_ASIO_H

#ifndef ASIO_STANDALONE
#define ASIO_STANDALONE
#endif
#include <asio.hpp>
#include <asio/ssl.hpp>

#endif
