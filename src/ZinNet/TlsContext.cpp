// TLS contexts over OpenSSL.
#include "TlsContext.h"

#include <openssl/ssl.h>

#include <stdexcept>

namespace ZinNet {

namespace {

std::unique_ptr<asio::ssl::context> baseContext(asio::ssl::context::method method) {
  auto context = std::make_unique<asio::ssl::context>(method);
  context->set_options(asio::ssl::context::default_workarounds | asio::ssl::context::no_sslv2 |
                       asio::ssl::context::no_sslv3 | asio::ssl::context::no_tlsv1 |
                       asio::ssl::context::no_tlsv1_1);
  return context;
}

[[noreturn]] void fail(const std::string& what, const std::string& file, std::error_code ec) {
  throw std::runtime_error("ZinNet: cannot use " + what + " " + file + ": " + ec.message());
}

}  // namespace

std::unique_ptr<asio::ssl::context> serverTlsContext(const std::string& certFile,
                                                     const std::string& keyFile) {
  auto context = baseContext(asio::ssl::context::tls_server);
  std::error_code ec;
  context->use_certificate_chain_file(certFile, ec);
  if (ec) fail("the TLS certificate file", certFile, ec);
  context->use_private_key_file(keyFile, asio::ssl::context::pem, ec);
  if (ec) fail("the TLS key file", keyFile, ec);
  if (SSL_CTX_check_private_key(context->native_handle()) != 1) {
    throw std::runtime_error("ZinNet: the TLS key file " + keyFile +
                             " does not hold the key of the certificate in " + certFile);
  }
  return context;
}

std::unique_ptr<asio::ssl::context> clientTlsContext(const std::string& caFile) {
  auto context = baseContext(asio::ssl::context::tls_client);
  std::error_code ec;
  if (caFile.empty()) {
    context->set_default_verify_paths(ec);
    if (ec) fail("the system's certificate authorities", "", ec);
  } else {
    context->load_verify_file(caFile, ec);
    if (ec) fail("the certificate authority file", caFile, ec);
  }
  context->set_verify_mode(asio::ssl::verify_peer);
  return context;
}

void expectServerName(asio::ssl::stream<asio::ip::tcp::socket&>& tls, const std::string& host) {
  tls.set_verify_callback(asio::ssl::host_name_verification(host));
  std::error_code ec;
  asio::ip::make_address(host, ec);
  // Server name indication carries host names only, never addresses.
  if (ec) SSL_set_tlsext_host_name(tls.native_handle(), host.c_str());
}

}  // namespace ZinNet
