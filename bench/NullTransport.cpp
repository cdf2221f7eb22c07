// The transport that does nothing.
#include "NullTransport.h"

#include <algorithm>
#include <cstring>

namespace ZinBench {

namespace {
constexpr uint32_t kMoxCoreType = 9;
}  // namespace

NullTransport::NullTransport(const ZinTestKit::MoxStatus& status)
    : info_{0x1234, kMoxCoreType, status.majorVersion, status.minorVersion, 1},
      statusWord_(ZinTestKit::buildMoxStatusWord(status)) {}

void NullTransport::readStatus(const ZIN_CORE_REF&, ZIN_CORE_INFO& info, unsigned char* status,
                               uint32_t statusBytes, uint32_t) {
  info = info_;
  std::memcpy(status, statusWord_.data(), std::min<size_t>(statusBytes, statusWord_.size()));
}

void NullTransport::commandSequence(const std::string&, unsigned char*, uint32_t) {}

}  // namespace ZinBench
