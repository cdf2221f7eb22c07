// ZinOpenOcd_openSession: a JTAG session on a board behind OpenOCD, for C and C++ hosts.
#include <exception>
#include <memory>
#include <string>

#include "ZinHub/OpenOcdTarget.h"
#include "ZinOpenOcd/ZinOpenOcd.h"
#include "ZinRT/ZinJtag.h"

namespace {

thread_local std::string lastError;

}  // namespace

uint32_t ZinOpenOcd_openSession(const char* host, uint16_t port, const char* board,
                                uint32_t timeoutMs) {
  lastError.clear();
  try {
    if (host == nullptr || *host == '\0') {
      throw std::invalid_argument("ZinOpenOcd_openSession: no host");
    }
    if (port == 0) throw std::invalid_argument("ZinOpenOcd_openSession: port 0");
    ZinHub::OpenOcdTarget target;
    target.host = host;
    target.port = port;
    target.board = board == nullptr ? "" : board;
    target.timeoutMs = timeoutMs;
    return ZinJtag_openSession(ZinHub::openOpenOcd(target));
  } catch (const std::exception& e) {
    lastError = e.what();
  } catch (...) {
    lastError = "ZinOpenOcd_openSession: unknown error";
  }
  return 0;
}

const char* ZinOpenOcd_lastError(void) {
  return lastError.c_str();
}
