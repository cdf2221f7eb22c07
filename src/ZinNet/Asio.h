// The one place the networking library is included (standalone, header-only).
#ifndef ZINNET_SRC_ASIO_H
#define ZINNET_SRC_ASIO_H

#ifndef ASIO_STANDALONE
#define ASIO_STANDALONE
#endif
#include <asio.hpp>

#endif
