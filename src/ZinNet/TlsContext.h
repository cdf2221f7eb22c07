// TLS settings of servers and clients: TLS 1.2 at least, and a client checks the server's
// certificate and host name.
#ifndef ZINNET_SRC_TLSCONTEXT_H
#define ZINNET_SRC_TLSCONTEXT_H

#include <memory>
#include <string>

#include "Asio.h"

namespace ZinNet {

/// A server context with the certificate chain and key of these PEM files. Throws
/// std::runtime_error naming the file that cannot be used.
std::unique_ptr<asio::ssl::context> serverTlsContext(const std::string& certFile,
                                                     const std::string& keyFile);

/// A client context that trusts the certificates of `caFile` (PEM), or the system's when it is
/// empty. Throws std::runtime_error when the file cannot be used.
std::unique_ptr<asio::ssl::context> clientTlsContext(const std::string& caFile);

/// Prepares `tls` to check that the server's certificate names `host`, and to name it in the
/// handshake when it is a host name.
void expectServerName(asio::ssl::stream<asio::ip::tcp::socket&>& tls, const std::string& host);

}  // namespace ZinNet

#endif
