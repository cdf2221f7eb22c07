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
  lastError.clear();
  try {
    if (host == nullptr || *host == '\0')
      throw std::invalid_argument("ZinNet_openSession: no host");
    if (port == 0) throw std::invalid_argument("ZinNet_openSession: port 0");
    ZinNet::ClientOptions options;
    if (timeoutMs != 0) {
      options.connectTimeoutMs = timeoutMs;
      options.requestTimeoutMs = timeoutMs;
    }
    auto transport = std::make_shared<ZinNet::TcpTransport>(host, port, options);
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
