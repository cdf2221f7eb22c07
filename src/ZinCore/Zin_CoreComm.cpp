// Status reads and command sequences, carried out through the session's transport.
#include "ZinRT/Zin_CoreComm.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>

#include "ZinRT/ZinJtag.h"

namespace ZinRT {

namespace {

uint32_t lineCount(const std::string& text) {
  if (text.empty()) return 0;
  return 1 + static_cast<uint32_t>(std::count(text.begin(), text.end(), '\n'));
}

// Clears the bits of `bytes` from bit `bitCount` on, so nothing beyond the asked bits is kept.
void clearBitsFrom(unsigned char* bytes, uint32_t size, uint32_t bitCount) {
  const uint32_t whole = bitCount / 8;
  if (whole >= size) return;
  bytes[whole] &= static_cast<unsigned char>((1u << (bitCount % 8)) - 1);
  std::memset(bytes + whole + 1, 0, size - whole - 1);
}

}  // namespace

void Zin_CoreComm::getCoreStatus(uint32_t handle, ZIN_CORE_REF ref, ZIN_CORE_INFO* info,
                                 Zin_ByteBuffer& status, uint32_t bitCount) {
  if (info == nullptr) throw std::invalid_argument("Zin_CoreComm::getCoreStatus: null info");
  *info = ZIN_CORE_INFO{};
  const uint32_t size = status.getSize();
  unsigned char* bytes = status.uPtr();
  std::memset(bytes, 0, size);
  const uint32_t bits = static_cast<uint32_t>(std::min<uint64_t>(bitCount, uint64_t{size} * 8));
  ZinJtag_session_withTransport(handle, [&](Zin_Transport& transport) {
    transport.readStatus(ref, *info, bytes, size, bits);
  });
  clearBitsFrom(bytes, size, bits);
}

void Zin_CoreComm::commandSequence(uint32_t handle, const std::string& text,
                                   unsigned char* readData, uint32_t readBitCount,
                                   ZIN_PROGRESS_CALLBACK progress) {
  if (readBitCount != 0 && readData == nullptr) {
    throw std::invalid_argument("Zin_CoreComm::commandSequence: null read buffer for " +
                                std::to_string(readBitCount) + " bits");
  }
  const uint32_t readBytes = readBitCount / 8 + (readBitCount % 8 != 0 ? 1 : 0);
  if (readBytes != 0) std::memset(readData, 0, readBytes);
  // The work captures one pointer, so that the std::function holds it without allocating.
  struct Transfer {
    const std::string& text;
    unsigned char* readData;
    uint32_t readBitCount;
  } transfer{text, readBitCount != 0 ? readData : nullptr, readBitCount};
  ZinJtag_session_withTransport(handle, [t = &transfer](Zin_Transport& transport) {
    transport.commandSequence(t->text, t->readData, t->readBitCount);
  });
  if (progress != nullptr) {
    const uint32_t lines = lineCount(text);
    progress(lines, lines, readBitCount, ZIN_PROGRESS_DONE);
  }
}

}  // namespace ZinRT

uint32_t ZinCore_getCoreStatus(uint32_t handle, ZIN_CORE_REF ref, ZIN_CORE_INFO* info,
                               unsigned char* status, uint32_t bitCount) {
  constexpr uint32_t kFailure = 0x80000000u;
  if (info == nullptr) return kFailure;
  *info = ZIN_CORE_INFO{};
  try {
    const uint32_t wanted = status != nullptr ? bitCount : 0;
    ZinRT::Zin_ByteBuffer buffer(wanted / 8 + (wanted % 8 != 0 ? 1 : 0), 0, 0);
    ZinRT::Zin_CoreComm::getCoreStatus(handle, ref, info, buffer, wanted);
    if (buffer.getSize() != 0) std::memcpy(status, buffer.uPtr(), buffer.getSize());
    return 0;
  } catch (...) {
    *info = ZIN_CORE_INFO{};
    return kFailure;
  }
}
