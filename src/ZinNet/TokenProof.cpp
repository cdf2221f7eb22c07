// HMAC-SHA256 and nonces from OpenSSL's libcrypto.
#include "TokenProof.h"

#include <openssl/crypto.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>
#include <openssl/rand.h>

#include <stdexcept>
#include <string_view>

namespace ZinNet {

namespace {

Mac hmac(const std::string& token, std::string_view label, const Nonce& first,
         const Nonce& second) {
  std::array<unsigned char, 11 + 2 * Protocol::kNonceBytes> message{};
  if (label.size() != 11) throw std::logic_error("ZinNet: a proof label has 11 bytes");
  std::copy(label.begin(), label.end(), message.begin());
  std::copy(first.begin(), first.end(), message.begin() + 11);
  std::copy(second.begin(), second.end(), message.begin() + 11 + first.size());
  Mac mac{};
  unsigned int length = 0;
  if (HMAC(EVP_sha256(), token.data(), static_cast<int>(token.size()), message.data(),
           message.size(), mac.data(), &length) == nullptr ||
      length != mac.size()) {
    throw std::runtime_error("ZinNet: HMAC-SHA256 failed");
  }
  return mac;
}

}  // namespace

Nonce freshNonce() {
  Nonce nonce{};
  if (RAND_bytes(nonce.data(), static_cast<int>(nonce.size())) != 1) {
    throw std::runtime_error("ZinNet: the random generator gave no nonce");
  }
  return nonce;
}

Mac serverMac(const std::string& token, const Nonce& client, const Nonce& server) {
  return hmac(token, "ZNET server", client, server);
}

Mac clientMac(const std::string& token, const Nonce& server, const Nonce& client) {
  return hmac(token, "ZNET client", server, client);
}

bool macMatches(const Mac& mac, const unsigned char* received, size_t size) {
  return size == mac.size() && CRYPTO_memcmp(mac.data(), received, mac.size()) == 0;
}

}  // namespace ZinNet
