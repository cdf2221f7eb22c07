// Reading and checking tokens.
#include "ZinNet/Token.h"

#include <cstdlib>
#include <fstream>
#include <stdexcept>

namespace ZinNet {

void checkToken(const std::string& token, const std::string& origin) {
  if (token.empty()) throw std::invalid_argument("ZinNet: " + origin + " holds no token");
  if (token.size() < kMinTokenBytes || token.size() > kMaxTokenBytes) {
    throw std::invalid_argument(
        "ZinNet: the token of " + origin + " has " + std::to_string(token.size()) +
        " bytes; a token has " + std::to_string(kMinTokenBytes) + " to " +
        std::to_string(kMaxTokenBytes) + " (make one with: openssl rand -hex 32)");
  }
}

std::string readTokenFile(const std::string& path) {
  const std::string origin = "the token file " + path;
  std::ifstream in(path, std::ios::binary);
  if (!in) throw std::invalid_argument("ZinNet: cannot read " + origin);
  // One byte more than the largest token and its line end tells an oversized file.
  std::string token(kMaxTokenBytes + 3, '\0');
  in.read(token.data(), static_cast<std::streamsize>(token.size()));
  if (in.bad()) throw std::invalid_argument("ZinNet: cannot read " + origin);
  token.resize(static_cast<size_t>(in.gcount()));
  if (!token.empty() && token.back() == '\n') token.pop_back();
  if (!token.empty() && token.back() == '\r') token.pop_back();
  checkToken(token, origin);
  return token;
}

std::string tokenFromEnvironment() {
  const char* value = std::getenv(kTokenVariable);
  if (value == nullptr) return "";
  const std::string token(value);
  checkToken(token, std::string("the variable ") + kTokenVariable);
  return token;
}

}  // namespace ZinNet
