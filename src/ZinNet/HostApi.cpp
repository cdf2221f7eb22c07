// ZinNet_openSession: a JTAG session on a target server, for C and C++ hosts.
#include <exception>
#include <memory>
#include <string>

#include "ZinNet/TcpTransport.h"
#include "ZinNet/ZinNet.h"
#include "ZinRT/ZinJtag.h"

namespace {

thread_local std::string lastError;

}  // namespace

uint32_t ZinNet_openSession(const char* host, uint16_t port, uint32_t timeoutMs) {
  ZinNet_SessionOptions options{};
  options.host = host;
  options.port = port;
  options.timeoutMs = timeoutMs;
  return ZinNet_openSessionWith(&options);
}

uint32_t ZinNet_openSessionWith(const ZinNet_SessionOptions* given) {
  lastError.clear();
  try {
    if (given == nullptr) throw std::invalid_argument("ZinNet_openSession: no options");
    const char* host = given->host;
    if (host == nullptr || *host == '\0')
      throw std::invalid_argument("ZinNet_openSession: no host");
    if (given->port == 0) throw std::invalid_argument("ZinNet_openSession: port 0");
    ZinNet::ClientOptions options;
    if (given->timeoutMs != 0) {
      options.connectTimeoutMs = given->timeoutMs;
      options.requestTimeoutMs = given->timeoutMs;
    }
    if (given->token != nullptr) options.token = given->token;
    options.tls = given->tls != 0;
    if (given->tlsCaFile != nullptr) options.tlsCaFile = given->tlsCaFile;
    auto transport = std::make_shared<ZinNet::TcpTransport>(host, given->port, options);
    transport->connect();
    return ZinJtag_openSession(transport);
  } catch (const std::exception& e) {
    lastError = e.what();
  } catch (...) {
    lastError = "ZinNet_openSession: unknown error";
  }
  return 0;
}

const char* ZinNet_lastError(void) {
  return lastError.c_str();
}
